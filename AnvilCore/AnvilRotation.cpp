#include "plugin/host/AnvilRotation.h"
#include <cmath>

namespace {
constexpr double kPi = 3.14159265358979323846;
constexpr double kDegToRad = kPi / 180.0;

// Axis sequence of each order, in the order the rotations are applied.
const int kAxes[6][3] = {{0, 1, 2}, {0, 2, 1}, {1, 0, 2}, {1, 2, 0}, {2, 0, 1}, {2, 1, 0}};

AnvilRotation axisRotation(int i_axis, double i_degrees) {
  Vec3 axis;
  axis[i_axis] = 1.0;
  return AnvilRotation(axis, i_degrees);
}
} // namespace

AnvilRotation::AnvilRotation(const Vec3& i_rAxis, double i_degrees) {
  const double length =
      std::sqrt(i_rAxis.x * i_rAxis.x + i_rAxis.y * i_rAxis.y + i_rAxis.z * i_rAxis.z);
  if (length == 0.0) return;
  const double half = 0.5 * i_degrees * kDegToRad;
  const double s = std::sin(half) / length;
  m_x = i_rAxis.x * s;
  m_y = i_rAxis.y * s;
  m_z = i_rAxis.z * s;
  m_w = std::cos(half);
}

AnvilRotation::AnvilRotation(double i_x, double i_y, double i_z, double i_w, bool i_normalise)
    : m_x(i_x), m_y(i_y), m_z(i_z), m_w(i_w) {
  if (!i_normalise) return;
  const double n = std::sqrt(m_x * m_x + m_y * m_y + m_z * m_z + m_w * m_w);
  if (n == 0.0) {
    makeIdentity();
    return;
  }
  m_x /= n;
  m_y /= n;
  m_z /= n;
  m_w /= n;
}

AnvilRotation AnvilRotation::inverse() const {
  return AnvilRotation(-m_x, -m_y, -m_z, m_w, false);
}

void AnvilRotation::getAsQuaternion(double& o_rX, double& o_rY, double& o_rZ, double& o_rW) const {
  o_rX = m_x;
  o_rY = m_y;
  o_rZ = m_z;
  o_rW = m_w;
}

void AnvilRotation::makeIdentity() {
  m_x = m_y = m_z = 0.0;
  m_w = 1.0;
}

AnvilRotation& AnvilRotation::operator*=(const AnvilRotation& b) {
  const AnvilRotation a = *this;
  m_w = a.m_w * b.m_w - a.m_x * b.m_x - a.m_y * b.m_y - a.m_z * b.m_z;
  m_x = a.m_w * b.m_x + a.m_x * b.m_w + a.m_y * b.m_z - a.m_z * b.m_y;
  m_y = a.m_w * b.m_y - a.m_x * b.m_z + a.m_y * b.m_w + a.m_z * b.m_x;
  m_z = a.m_w * b.m_z + a.m_x * b.m_y - a.m_y * b.m_x + a.m_z * b.m_w;
  return *this;
}

Vec3 AnvilRotation::rotate(const Vec3& v) const {
  // v' = v + 2w (q x v) + 2 q x (q x v)
  const double tx = 2.0 * (m_y * v.z - m_z * v.y);
  const double ty = 2.0 * (m_z * v.x - m_x * v.z);
  const double tz = 2.0 * (m_x * v.y - m_y * v.x);
  return Vec3(v.x + m_w * tx + (m_y * tz - m_z * ty), v.y + m_w * ty + (m_z * tx - m_x * tz),
              v.z + m_w * tz + (m_x * ty - m_y * tx));
}

void AnvilRotation::getMatrix(double m[9]) const {
  const double xx = m_x * m_x, yy = m_y * m_y, zz = m_z * m_z;
  const double xy = m_x * m_y, xz = m_x * m_z, yz = m_y * m_z;
  const double wx = m_w * m_x, wy = m_w * m_y, wz = m_w * m_z;
  m[0] = 1 - 2 * (yy + zz);
  m[1] = 2 * (xy - wz);
  m[2] = 2 * (xz + wy);
  m[3] = 2 * (xy + wz);
  m[4] = 1 - 2 * (xx + zz);
  m[5] = 2 * (yz - wx);
  m[6] = 2 * (xz - wy);
  m[7] = 2 * (yz + wx);
  m[8] = 1 - 2 * (xx + yy);
}

void AnvilRotation::setMatrix(const double m[9]) {
  const double trace = m[0] + m[4] + m[8];
  if (trace > 0) {
    const double s = 0.5 / std::sqrt(trace + 1.0);
    m_w = 0.25 / s;
    m_x = (m[7] - m[5]) * s;
    m_y = (m[2] - m[6]) * s;
    m_z = (m[3] - m[1]) * s;
  } else if (m[0] > m[4] && m[0] > m[8]) {
    const double s = 2.0 * std::sqrt(1.0 + m[0] - m[4] - m[8]);
    m_w = (m[7] - m[5]) / s;
    m_x = 0.25 * s;
    m_y = (m[1] + m[3]) / s;
    m_z = (m[2] + m[6]) / s;
  } else if (m[4] > m[8]) {
    const double s = 2.0 * std::sqrt(1.0 + m[4] - m[0] - m[8]);
    m_w = (m[2] - m[6]) / s;
    m_x = (m[1] + m[3]) / s;
    m_y = 0.25 * s;
    m_z = (m[5] + m[7]) / s;
  } else {
    const double s = 2.0 * std::sqrt(1.0 + m[8] - m[0] - m[4]);
    m_w = (m[3] - m[1]) / s;
    m_x = (m[2] + m[6]) / s;
    m_y = (m[5] + m[7]) / s;
    m_z = 0.25 * s;
  }
}

void AnvilRotation::setAsEuler(RotOrder i_order, const Vec3& i_rDegrees) {
  const int* axes = kAxes[i_order];
  // Fixed-axis sequence: the first axis is applied first, so it stands rightmost.
  *this = axisRotation(axes[2], i_rDegrees[axes[2]]);
  *this *= axisRotation(axes[1], i_rDegrees[axes[1]]);
  *this *= axisRotation(axes[0], i_rDegrees[axes[0]]);
}

void AnvilRotation::getAsEuler(RotOrder i_order, Vec3& o_rDegrees) const {
  // R = R_k * R_j * R_i with (i, j, k) the order's axes. Read the angles off the matrix with the
  // general formula for a Tait-Bryan sequence; the parity tells the sign pattern.
  const int i = kAxes[i_order][0], j = kAxes[i_order][1], k = kAxes[i_order][2];
  const double sign = ((j - i + 3) % 3 == 1) ? 1.0 : -1.0;
  double m[9];
  getMatrix(m);
  auto M = [&](int r, int c) { return m[r * 3 + c]; };
  double sj = -sign * M(k, i);
  sj = sj > 1.0 ? 1.0 : (sj < -1.0 ? -1.0 : sj);
  const double aj = std::asin(sj);
  double ai, ak;
  if (std::fabs(sj) < 1.0 - 1e-12) {
    ai = std::atan2(sign * M(k, j), M(k, k));
    ak = std::atan2(sign * M(j, i), M(i, i));
  } else {
    // Gimbal lock: put the whole remaining rotation on the first axis.
    ak = 0.0;
    ai = std::atan2(-sign * M(j, k), M(j, j));
  }
  o_rDegrees[i] = ai / kDegToRad;
  o_rDegrees[j] = aj / kDegToRad;
  o_rDegrees[k] = ak / kDegToRad;
}

AnvilRotation AnvilRotation::slerp(const AnvilRotation& a, const AnvilRotation& b, double t) {
  double bx = b.m_x, by = b.m_y, bz = b.m_z, bw = b.m_w;
  double dot = a.m_x * bx + a.m_y * by + a.m_z * bz + a.m_w * bw;
  if (dot < 0.0) {
    bx = -bx;
    by = -by;
    bz = -bz;
    bw = -bw;
    dot = -dot;
  }
  double wa, wb;
  if (dot > 0.9995) {
    wa = 1.0 - t;
    wb = t;
  } else {
    const double theta = std::acos(dot);
    const double s = std::sin(theta);
    wa = std::sin((1.0 - t) * theta) / s;
    wb = std::sin(t * theta) / s;
  }
  return AnvilRotation(wa * a.m_x + wb * bx, wa * a.m_y + wb * by, wa * a.m_z + wb * bz,
                       wa * a.m_w + wb * bw, true);
}
