// The "clips" section of a scene file: named spans of time with their start timecode.
#include "SceneJson.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/NLEClip.h"
#include <cstdio>
#include <set>

namespace AnvilCore {
namespace {

// "HH:MM:SS:FF" (";" accepted before the frames, as drop-frame timecode is often written) to
// the time of that label under the file's timecode mode.
HTime timecodeTime(const std::string& i_text, const std::string& i_path, int i_mode) {
  int h = 0, m = 0, s = 0, f = 0;
  char separator = 0, end = 0;
  if (std::sscanf(i_text.c_str(), "%d:%d:%d%c%d%c", &h, &m, &s, &separator, &f, &end) != 5 ||
      (separator != ':' && separator != ';'))
    json::fail(i_path, "expected a timecode \"HH:MM:SS:FF\"");
  HTimeManager clock;
  clock.setTimecodeMode(i_mode);
  if (!clock.isTimecodeSupported())
    json::fail(i_path, "the scene's timecode mode " + std::to_string(i_mode) + " has no timecode");
  const HTime t = clock.timecodeToTime(h, m, s, f);
  if (t < 0) json::fail(i_path, "\"" + i_text + "\" is not a timecode of this timecode mode");
  return t;
}

void readClips(const nlohmann::json& i_rValue, const std::string& i_path,
               SceneJsonContext& io_rContext) {
  using namespace json;
  array(i_rValue, i_path);
  std::set<std::string> names;
  for (const NLEClip* p = g_db->getHeadClip(); p; p = p->getNext())
    names.insert(p->getName().GetString());
  auto pClips = std::make_shared<std::vector<std::unique_ptr<NLEClip>>>();
  int active = -1;
  const int64_t tpf = io_rContext.ticksPerFrame;
  for (size_t i = 0; i < i_rValue.size(); ++i) {
    const std::string path = i_path + "/" + std::to_string(i);
    const nlohmann::json& clip = i_rValue[i];
    onlyKeys(clip, path, {"name", "range", "startOffset", "timecode", "active"});
    const std::string clipName = name(member(clip, path, "name"), path + "/name");
    if (!names.insert(clipName).second) fail(path + "/name", "a clip \"" + clipName + "\" exists");

    const nlohmann::json& range = array(member(clip, path, "range"), path + "/range");
    if (range.size() != 2) fail(path + "/range", "expected [first, last] frames");
    const int64_t first = integer(range[0], path + "/range/0");
    const int64_t last = integer(range[1], path + "/range/1");
    if (last < first) fail(path + "/range", "last frame comes before first frame");

    HTime offset = 0;
    const nlohmann::json* pOffset = optional(clip, "startOffset");
    const nlohmann::json* pTimecode = optional(clip, "timecode");
    if (pOffset && pTimecode) fail(path, "give \"startOffset\" or \"timecode\", not both");
    if (pOffset) offset = integer(*pOffset, path + "/startOffset") * tpf;
    if (pTimecode)
      offset = timecodeTime(string(*pTimecode, path + "/timecode"), path + "/timecode",
                            io_rContext.timecodeMode) -
               first * tpf;
    if (auto* p = optional(clip, "active"); p && boolean(*p, path + "/active")) {
      if (active >= 0) fail(path + "/active", "only one clip can be active");
      active = int(i);
    }
    pClips->push_back(
        std::make_unique<NLEClip>(HString(clipName), HTimeRange(first * tpf, last * tpf), offset));
  }
  io_rContext.commits.push_back([pClips, active] {
    for (size_t i = 0; i < pClips->size(); ++i) {
      NLEClip* pClip = (*pClips)[i].release();
      g_db->addClip(pClip);
      if (int(i) == active) g_db->setActiveClip(pClip, false, false, false);
    }
  });
}

} // namespace

ANVIL_REGISTER_SCENE_SECTION("clips", 70, readClips)

} // namespace AnvilCore
