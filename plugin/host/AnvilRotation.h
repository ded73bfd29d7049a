#pragma once
#include "HostExport.h"
#include "Vec3.h"

/// The host's rotation, held as a unit quaternion (x, y, z, w).
///
/// Euler angles are in degrees. A rotation order names the axes in the order they are applied to
/// a vector, about fixed axes: `XYZ` rotates about X first, then Y, then Z (R = Rz * Ry * Rx).
class ANVIL_HOST_API AnvilRotation {
public:
  enum RotOrder { XYZ = 0, XZY, YXZ, YZX, ZXY, ZYX };

  AnvilRotation() = default;
  /// From an axis (need not be unit length) and an angle in degrees.
  AnvilRotation(const Vec3& i_rAxis, double i_degrees);
  /// From a quaternion; with `i_normalise` set the quaternion is scaled to unit length.
  AnvilRotation(double i_x, double i_y, double i_z, double i_w, bool i_normalise);

  AnvilRotation inverse() const;
  void getAsQuaternion(double& o_rX, double& o_rY, double& o_rZ, double& o_rW) const;
  void getAsEuler(RotOrder i_order, Vec3& o_rDegrees) const;
  void setAsEuler(RotOrder i_order, const Vec3& i_rDegrees);
  void makeIdentity();
  bool isIdentity() const { return m_x == 0.0 && m_y == 0.0 && m_z == 0.0 && m_w == 1.0; }

  /// this = this * other: `other` is applied to a vector first.
  AnvilRotation& operator*=(const AnvilRotation& i_rOther);
  friend AnvilRotation operator*(AnvilRotation a, const AnvilRotation& b) { return a *= b; }
  Vec3 rotate(const Vec3& i_rV) const;
  /// Row-major 3 by 3 matrix.
  void getMatrix(double o_m[9]) const;
  void setMatrix(const double i_m[9]);
  /// Spherical interpolation, shortest path; `t` in [0, 1].
  static AnvilRotation slerp(const AnvilRotation& a, const AnvilRotation& b, double t);

  bool operator==(const AnvilRotation& o) const {
    return m_x == o.m_x && m_y == o.m_y && m_z == o.m_z && m_w == o.m_w;
  }

private:
  double m_x = 0.0, m_y = 0.0, m_z = 0.0, m_w = 1.0;
};
