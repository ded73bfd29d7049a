// Scene-wide sections of the scene file: identity, time settings, orientation and subjects.
#include "SceneJson.h"
#include "SceneJsonNodes.h"
#include "SceneJsonSubjects.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include <cmath>

namespace AnvilCore {
namespace {

constexpr int kSceneFileVersion = 1;

void readFormat(const nlohmann::json& i_rValue, const std::string& i_path, SceneJsonContext&) {
  if (json::string(i_rValue, i_path) != "anvil-scene")
    json::fail(i_path, "expected \"anvil-scene\"");
}

void readVersion(const nlohmann::json& i_rValue, const std::string& i_path, SceneJsonContext&) {
  const int64_t version = json::integer(i_rValue, i_path);
  if (version < 1 || version > kSceneFileVersion)
    json::fail(i_path, "unsupported scene file version " + std::to_string(version) +
                           " (this build reads version " + std::to_string(kSceneFileVersion) + ")");
}

void readName(const nlohmann::json& i_rValue, const std::string& i_path,
              SceneJsonContext& io_rContext) {
  const std::string name = json::string(i_rValue, i_path);
  io_rContext.commits.push_back([name] { g_db->setSceneName(HString(name)); });
}

void readZUp(const nlohmann::json& i_rValue, const std::string& i_path,
             SceneJsonContext& io_rContext) {
  const bool zUp = json::boolean(i_rValue, i_path);
  io_rContext.commits.push_back([zUp] { g_db->setZUp(zUp); });
}

HTimeRange frameRange(const nlohmann::json& i_rValue, const std::string& i_path,
                      int64_t i_ticksPerFrame) {
  json::array(i_rValue, i_path);
  if (i_rValue.size() != 2) json::fail(i_path, "expected [first, last] frames");
  const int64_t first = json::integer(i_rValue[0], i_path + "/0");
  const int64_t last = json::integer(i_rValue[1], i_path + "/1");
  if (last < first) json::fail(i_path, "last frame comes before first frame");
  return HTimeRange(first * i_ticksPerFrame, last * i_ticksPerFrame);
}

void readTime(const nlohmann::json& i_rValue, const std::string& i_path,
              SceneJsonContext& io_rContext) {
  using namespace json;
  onlyKeys(i_rValue, i_path,
           {"frameRate", "animRange", "playRange", "timecodeMode", "currentFrame"});
  const double rate = number(member(i_rValue, i_path, "frameRate"), i_path + "/frameRate");
  if (rate <= 0.0 || rate > 100000.0)
    fail(i_path + "/frameRate", "frame rate must lie in (0, 100000]");
  io_rContext.frameRate = rate;
  io_rContext.ticksPerFrame = std::llround(double(kTicksPerSecond) / rate);
  const int64_t tpf = io_rContext.ticksPerFrame;
  std::optional<HTimeRange> anim, play;
  if (auto* p = optional(i_rValue, "animRange")) anim = frameRange(*p, i_path + "/animRange", tpf);
  if (auto* p = optional(i_rValue, "playRange")) play = frameRange(*p, i_path + "/playRange", tpf);
  int mode = 0;
  if (auto* p = optional(i_rValue, "timecodeMode"))
    mode = static_cast<int>(integer(*p, i_path + "/timecodeMode"));
  io_rContext.timecodeMode = mode;
  std::optional<int64_t> current;
  if (auto* p = optional(i_rValue, "currentFrame")) current = integer(*p, i_path + "/currentFrame");
  io_rContext.animRangeSet = anim.has_value();
  io_rContext.commits.push_back([=] {
    HTimeManager* pTime = g_db->getTimeManager();
    pTime->setFrameRate(rate);
    pTime->setTimecodeMode(mode);
    if (anim) pTime->setAnimRange(*anim);
    if (play || anim) pTime->setPlayRange(play ? *play : *anim);
    if (current) pTime->setCurrentTime(*current * tpf);
  });
}

void readSubjects(const nlohmann::json& i_rValue, const std::string& i_path,
                  SceneJsonContext& io_rContext) {
  using namespace json;
  array(i_rValue, i_path);
  for (size_t i = 0; i < i_rValue.size(); ++i) {
    const std::string path = i_path + "/" + std::to_string(i);
    const nlohmann::json& subject = i_rValue[i];
    onlyKeys(subject, path,
             {"name", "prop", "selected", "visible", "markers", "nodes", ANVIL_SCENE_TRANSFORM_KEYS,
              ANVIL_SCENE_SUBJECT_SETUP_KEYS});
    const std::string subjectName = name(member(subject, path, "name"), path + "/name");
    checkUniqueName(io_rContext.root.get(), subjectName, path + "/name");
    auto pCharacter = std::make_unique<Character>(HString(subjectName));
    if (auto* p = optional(subject, "prop")) pCharacter->setProp(boolean(*p, path + "/prop"));
    if (auto* p = optional(subject, "selected"))
      pCharacter->setSelected(boolean(*p, path + "/selected"));
    if (auto* p = optional(subject, "visible"))
      pCharacter->setVisible(boolean(*p, path + "/visible"));
    readTransform(subject, path, io_rContext, *pCharacter);
    readSubjectSetups(subject, path, io_rContext, *pCharacter);
    Character* pSubject = pCharacter.get();
    io_rContext.root->addChild(pCharacter.release());
    io_rContext.byName[subjectName] = pSubject;
    if (auto* pNodes = optional(subject, "nodes")) {
      array(*pNodes, path + "/nodes");
      for (size_t n = 0; n < pNodes->size(); ++n)
        readNode((*pNodes)[n], path + "/nodes/" + std::to_string(n), io_rContext, pSubject);
    }
    if (auto* pMarkers = optional(subject, "markers")) {
      array(*pMarkers, path + "/markers");
      for (size_t m = 0; m < pMarkers->size(); ++m)
        readMarker((*pMarkers)[m], path + "/markers/" + std::to_string(m), io_rContext, pSubject);
    }
  }
}

} // namespace

ANVIL_REGISTER_SCENE_SECTION("format", -30, readFormat)
ANVIL_REGISTER_SCENE_SECTION("version", -20, readVersion)
ANVIL_REGISTER_SCENE_SECTION("name", -10, readName)
ANVIL_REGISTER_SCENE_SECTION("time", 0, readTime)
ANVIL_REGISTER_SCENE_SECTION("zUp", 5, readZUp)
ANVIL_REGISTER_SCENE_SECTION("subjects", 40, readSubjects)

} // namespace AnvilCore
