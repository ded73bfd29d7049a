#include "usd/UsdSkel.h"

#include "usd/UsdNames.h"

#include <cstdio>
#include <unordered_map>

namespace AnvilUsd {

VSkeleton VSkeleton::Define(VStage& stage, const std::string& path) {
  VSkeleton skeleton;
  skeleton.m_pPrim = stage.DefinePrim(path, "Skeleton");
  return skeleton;
}

VSkelAnimation VSkelAnimation::Define(VStage& stage, const std::string& path) {
  VSkelAnimation animation;
  animation.m_pPrim = stage.DefinePrim(path, "SkelAnimation");
  return animation;
}

VSkelBindingAPI VSkelBindingAPI::Apply(VPrim& prim) {
  prim.ApplyApiSchema("SkelBindingAPI");
  VSkelBindingAPI binding;
  binding.m_pPrim = &prim;
  return binding;
}

namespace {
/// Whether a token is a path of prim names, absolute or relative.
bool IsPrimPath(const std::string& path) {
  if (path.empty() || path == "/") return false;
  std::size_t start = path[0] == '/' ? 1 : 0;
  while (start <= path.size()) {
    std::size_t end = path.find('/', start);
    if (end == std::string::npos) end = path.size();
    if (!IsValidIdentifier(std::string_view(path).substr(start, end - start))) return false;
    start = end + 1;
  }
  return true;
}
} // namespace

VSkelTopology::VSkelTopology(const std::vector<std::string>& paths) {
  std::unordered_map<std::string, int> index;
  for (std::size_t i = 0; i < paths.size(); ++i)
    index[paths[i]] = int(i); // the last of duplicates wins
  m_Parents.assign(paths.size(), -1);
  for (std::size_t i = 0; i < paths.size(); ++i) {
    if (!IsPrimPath(paths[i])) continue;
    std::string ancestor = paths[i];
    for (std::size_t slash; (slash = ancestor.rfind('/')) != std::string::npos && slash > 0;) {
      ancestor.resize(slash);
      if (auto it = index.find(ancestor); it != index.end()) {
        m_Parents[i] = it->second;
        break;
      }
    }
  }
}

bool VSkelTopology::Validate(std::string* o_pReason) const {
  for (std::size_t i = 0; i < m_Parents.size(); ++i) {
    const int parent = m_Parents[i];
    if (parent < 0) continue;
    char text[200];
    if (std::size_t(parent) == i) {
      std::snprintf(text, sizeof text, "Joint %zu has itself as its parent.", i);
    } else if (std::size_t(parent) > i) {
      std::snprintf(text, sizeof text,
                    "Joint %zu has mis-ordered parent %d. Joints are expected to be ordered with "
                    "parent joints always coming before children.",
                    i, parent);
    } else {
      continue;
    }
    if (o_pReason) *o_pReason = text;
    return false;
  }
  return true;
}

Matrix4d MakeTransform(const Vec3f& t, const Quatf& q, const Vec3h& s) {
  // The rotation matrix of a float quaternion: products of components in float, each entry
  // finished in double and stored as float.
  const float r = q.w, x = q.x, y = q.y, z = q.z;
  const float rows[3][3] = {{float(1.0 - 2.0 * (y * y + z * z)), float(2.0 * (x * y + z * r)),
                             float(2.0 * (z * x - y * r))},
                            {float(2.0 * (x * y - z * r)), float(1.0 - 2.0 * (z * z + x * x)),
                             float(2.0 * (y * z + x * r))},
                            {float(2.0 * (z * x + y * r)), float(2.0 * (y * z - x * r)),
                             float(1.0 - 2.0 * (y * y + x * x))}};
  Matrix4d m{};
  for (std::size_t row = 0; row < 3; ++row) {
    const float scale = HalfToFloat(s[row]);
    for (std::size_t column = 0; column < 3; ++column)
      m[row][column] = double(rows[row][column] * scale);
  }
  m[3] = {double(t[0]), double(t[1]), double(t[2]), 1.0};
  return m;
}

bool MakeTransforms(const Vec3fArray& translations, const QuatfArray& rotations,
                    const Vec3hArray& scales, Matrix4dArray& o_rTransforms) {
  if (translations.size() != rotations.size() || translations.size() != scales.size()) return false;
  o_rTransforms.resize(translations.size());
  for (std::size_t i = 0; i < translations.size(); ++i)
    o_rTransforms[i] = MakeTransform(translations[i], rotations[i], scales[i]);
  return true;
}

} // namespace AnvilUsd
