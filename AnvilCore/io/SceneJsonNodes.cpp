#include "SceneJsonNodes.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/Marker.h"

namespace AnvilCore {

namespace {
Vec3 vec3(const nlohmann::json& i_rValue, const std::string& i_path) {
  const std::vector<double> v = json::numbers(i_rValue, i_path, 3);
  return Vec3(v[0], v[1], v[2]);
}

AnvilRotation::RotOrder rotationOrder(const nlohmann::json& i_rValue, const std::string& i_path) {
  static const char* const kNames[] = {"XYZ", "XZY", "YXZ", "YZX", "ZXY", "ZYX"};
  const std::string text = json::string(i_rValue, i_path);
  for (int i = 0; i < 6; ++i)
    if (text == kNames[i]) return static_cast<AnvilRotation::RotOrder>(i);
  json::fail(i_path, "unknown rotation order \"" + text + "\" (XYZ, XZY, YXZ, YZX, ZXY or ZYX)");
}

AnvilRotation euler(const nlohmann::json& i_rValue, const std::string& i_path,
                    AnvilRotation::RotOrder i_order) {
  AnvilRotation r;
  r.setAsEuler(i_order, vec3(i_rValue, i_path));
  return r;
}

HTime frameTime(const SceneJsonContext& i_rContext, int64_t i_frame) {
  return i_frame * i_rContext.ticksPerFrame;
}
} // namespace

void checkUniqueName(const Module* i_pParent, const std::string& i_name,
                     const std::string& i_path) {
  for (int i = 0; i < i_pParent->getNumChildren(); ++i)
    if (i_pParent->getChild(i)->getName() == i_name.c_str())
      json::fail(i_path, "duplicate name \"" + i_name + "\"");
}

void readTransform(const nlohmann::json& i_rValue, const std::string& i_path,
                   SceneJsonContext& io_rContext, Node& io_rNode) {
  using namespace json;
  AnvilRotation::RotOrder order = AnvilRotation::XYZ;
  if (auto* p = optional(i_rValue, "rotationOrder"))
    order = rotationOrder(*p, i_path + "/rotationOrder");
  io_rNode.setRotationOrder(order);
  if (auto* p = optional(i_rValue, "preTranslation"))
    io_rNode.setPreTranslation(vec3(*p, i_path + "/preTranslation"));
  // Pre- and post-rotations are fixed-axis XYZ angles in degrees.
  if (auto* p = optional(i_rValue, "preRotation"))
    io_rNode.setPreRotation(euler(*p, i_path + "/preRotation", AnvilRotation::XYZ));
  if (auto* p = optional(i_rValue, "postRotation"))
    io_rNode.setPostRotation(euler(*p, i_path + "/postRotation", AnvilRotation::XYZ));
  Vec3 translation, scale(1, 1, 1);
  AnvilRotation rotation;
  if (auto* p = optional(i_rValue, "translation")) translation = vec3(*p, i_path + "/translation");
  if (auto* p = optional(i_rValue, "rotation")) rotation = euler(*p, i_path + "/rotation", order);
  if (auto* p = optional(i_rValue, "scale")) scale = vec3(*p, i_path + "/scale");
  io_rNode.setStaticTransform(translation, rotation, scale);

  const nlohmann::json* pAnimation = optional(i_rValue, "animation");
  if (!pAnimation) return;
  const std::string path = i_path + "/animation";
  onlyKeys(*pAnimation, path, {"firstFrame", "translation", "rotation", "scale"});
  int64_t first = 0;
  if (auto* p = optional(*pAnimation, "firstFrame")) first = integer(*p, path + "/firstFrame");
  auto keys = [&](const char* i_pKey, auto i_set) {
    const nlohmann::json* pKeys = optional(*pAnimation, i_pKey);
    if (!pKeys) return;
    const std::string keysPath = path + "/" + i_pKey;
    array(*pKeys, keysPath);
    for (size_t i = 0; i < pKeys->size(); ++i) {
      const std::string keyPath = keysPath + "/" + std::to_string(i);
      i_set(frameTime(io_rContext, first + int64_t(i)), (*pKeys)[i], keyPath);
    }
  };
  keys("translation", [&](HTime t, const nlohmann::json& v, const std::string& p) {
    io_rNode.m_positionTrack.setKey(t, vec3(v, p));
  });
  keys("rotation", [&](HTime t, const nlohmann::json& v, const std::string& p) {
    io_rNode.m_rotationTrack.setKey(t, euler(v, p, order));
  });
  keys("scale", [&](HTime t, const nlohmann::json& v, const std::string& p) {
    io_rNode.m_scaleTrack.setKey(t, vec3(v, p));
  });
}

Marker* readMarker(const nlohmann::json& i_rValue, const std::string& i_path,
                   SceneJsonContext& io_rContext, Module* i_pParent) {
  using namespace json;
  onlyKeys(i_rValue, i_path,
           {"name", "unlabeled", "selected", "visible", "firstFrame", "positions"});
  const std::string markerName = name(member(i_rValue, i_path, "name"), i_path + "/name");
  checkUniqueName(i_pParent, markerName, i_path + "/name");
  auto pMarker = std::make_unique<Marker>(HString(markerName));
  // A marker outside any subject is an unlabelled trajectory unless the file says otherwise.
  pMarker->setUnlabeled(!i_pParent->isKindOf(&Character::s_classCharacter));
  if (auto* p = optional(i_rValue, "unlabeled"))
    pMarker->setUnlabeled(boolean(*p, i_path + "/unlabeled"));
  if (auto* p = optional(i_rValue, "selected"))
    pMarker->setSelected(boolean(*p, i_path + "/selected"));
  if (auto* p = optional(i_rValue, "visible"))
    pMarker->setVisible(boolean(*p, i_path + "/visible"));
  int64_t first = 0;
  if (auto* p = optional(i_rValue, "firstFrame")) first = integer(*p, i_path + "/firstFrame");
  if (auto* pPositions = optional(i_rValue, "positions")) {
    const std::string path = i_path + "/positions";
    array(*pPositions, path);
    pMarker->m_track.reserve(pPositions->size());
    for (size_t i = 0; i < pPositions->size(); ++i) {
      const nlohmann::json& v = (*pPositions)[i];
      if (v.is_null()) continue; // a gap
      pMarker->m_track.setKey(frameTime(io_rContext, first + int64_t(i)),
                              vec3(v, path + "/" + std::to_string(i)));
    }
  }
  Marker* pResult = pMarker.get();
  i_pParent->addChild(pMarker.release());
  return pResult;
}

Node* readNode(const nlohmann::json& i_rValue, const std::string& i_path,
               SceneJsonContext& io_rContext, Module* i_pParent) {
  using namespace json;
  onlyKeys(i_rValue, i_path,
           {"name", "selected", "visible", "children", ANVIL_SCENE_TRANSFORM_KEYS});
  const std::string nodeName = name(member(i_rValue, i_path, "name"), i_path + "/name");
  checkUniqueName(i_pParent, nodeName, i_path + "/name");
  auto pNode = std::make_unique<Node>(HString(nodeName));
  if (auto* p = optional(i_rValue, "selected"))
    pNode->setSelected(boolean(*p, i_path + "/selected"));
  if (auto* p = optional(i_rValue, "visible")) pNode->setVisible(boolean(*p, i_path + "/visible"));
  readTransform(i_rValue, i_path, io_rContext, *pNode);
  Node* pResult = pNode.get();
  i_pParent->addChild(pNode.release());
  if (auto* pChildren = optional(i_rValue, "children")) {
    array(*pChildren, i_path + "/children");
    for (size_t i = 0; i < pChildren->size(); ++i)
      readNode((*pChildren)[i], i_path + "/children/" + std::to_string(i), io_rContext, pResult);
  }
  return pResult;
}

namespace {
void readMarkers(const nlohmann::json& i_rValue, const std::string& i_path,
                 SceneJsonContext& io_rContext) {
  json::array(i_rValue, i_path);
  for (size_t i = 0; i < i_rValue.size(); ++i)
    readMarker(i_rValue[i], i_path + "/" + std::to_string(i), io_rContext, io_rContext.root.get());
}

void readNodes(const nlohmann::json& i_rValue, const std::string& i_path,
               SceneJsonContext& io_rContext) {
  json::array(i_rValue, i_path);
  for (size_t i = 0; i < i_rValue.size(); ++i)
    readNode(i_rValue[i], i_path + "/" + std::to_string(i), io_rContext, io_rContext.root.get());
}
} // namespace

ANVIL_REGISTER_SCENE_SECTION("nodes", 20, readNodes)
ANVIL_REGISTER_SCENE_SECTION("markers", 30, readMarkers)

} // namespace AnvilCore
