#include "SceneRotation.h"
#include "plugin/host/Database.h"
#include <cmath>

namespace AnvilCoreImpl {

void applySceneRotation(Vec3& io_rPos) {
  if (!g_db || !g_db->isSceneRotated()) return;
  const double* m = g_db->getSceneRotation();
  const Vec3 p = io_rPos;
  io_rPos = Vec3(m[0] * p.x + m[1] * p.y + m[2] * p.z, m[3] * p.x + m[4] * p.y + m[5] * p.z,
                 m[6] * p.x + m[7] * p.y + m[8] * p.z);
}

void applySceneRotation(Vec3& io_rPos, AnvilRotation& io_rRot) {
  if (!g_db || !g_db->isSceneRotated()) return;
  applySceneRotation(io_rPos);
  AnvilRotation scene;
  scene.setMatrix(g_db->getSceneRotation());
  io_rRot = scene * io_rRot;
}

void axisRotationMatrix(double i_degrees, int i_axis, double o_m[9]) {
  double c, s;
  const double turns = i_degrees / 90.0;
  if (turns == std::floor(turns) && std::fabs(turns) < 1e15) {
    // Exact sine and cosine for quarter turns, so that axis swaps are exact.
    const long long q = ((static_cast<long long>(turns) % 4) + 4) % 4;
    const double cs[4] = {1.0, 0.0, -1.0, 0.0};
    const double sn[4] = {0.0, 1.0, 0.0, -1.0};
    c = cs[q];
    s = sn[q];
  } else {
    const double r = i_degrees * 3.14159265358979323846 / 180.0;
    c = std::cos(r);
    s = std::sin(r);
  }
  const int a = (i_axis + 1) % 3, b = (i_axis + 2) % 3;
  for (int i = 0; i < 9; ++i)
    o_m[i] = 0.0;
  o_m[i_axis * 3 + i_axis] = 1.0;
  o_m[a * 3 + a] = c;
  o_m[a * 3 + b] = -s;
  o_m[b * 3 + a] = s;
  o_m[b * 3 + b] = c;
}

} // namespace AnvilCoreImpl
