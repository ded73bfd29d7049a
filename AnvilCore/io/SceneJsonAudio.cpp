// The "audio" section of a scene file: audio sources from sound files or inline samples.
#include "SceneJson.h"
#include "SceneJsonNodes.h"
#include "plugin/host/AudioSource.h"
#include <filesystem>

namespace AnvilCore {
namespace {

std::vector<std::vector<int16_t>> readInlineChannels(const nlohmann::json& i_rValue,
                                                     const std::string& i_path) {
  using namespace json;
  array(i_rValue, i_path);
  if (i_rValue.empty()) fail(i_path, "expected at least one channel");
  std::vector<std::vector<int16_t>> channels;
  for (size_t c = 0; c < i_rValue.size(); ++c) {
    const std::string path = i_path + "/" + std::to_string(c);
    const nlohmann::json& samples = array(i_rValue[c], path);
    if (c > 0 && samples.size() != channels[0].size())
      fail(path,
           "expected " + std::to_string(channels[0].size()) + " samples, as in the first channel");
    std::vector<int16_t> channel;
    channel.reserve(samples.size());
    for (size_t i = 0; i < samples.size(); ++i) {
      const int64_t sample = integer(samples[i], path + "/" + std::to_string(i));
      if (sample < -32768 || sample > 32767)
        fail(path + "/" + std::to_string(i), "sample outside [-32768, 32767]");
      channel.push_back(int16_t(sample));
    }
    channels.push_back(std::move(channel));
  }
  return channels;
}

void readAudio(const nlohmann::json& i_rValue, const std::string& i_path,
               SceneJsonContext& io_rContext) {
  using namespace json;
  array(i_rValue, i_path);
  for (size_t i = 0; i < i_rValue.size(); ++i) {
    const std::string path = i_path + "/" + std::to_string(i);
    const nlohmann::json& source = i_rValue[i];
    onlyKeys(source, path, {"name", "file", "sampleRate", "channels", "startFrame", "selected"});
    const std::string sourceName = name(member(source, path, "name"), path + "/name");
    checkUniqueName(io_rContext.root.get(), sourceName, path + "/name");
    auto pSource = std::make_unique<AudioSource>(HString(sourceName));

    const nlohmann::json* pFile = optional(source, "file");
    const nlohmann::json* pChannels = optional(source, "channels");
    if (bool(pFile) == bool(pChannels)) fail(path, "expected one of \"file\" or \"channels\"");
    if (pFile) {
      if (optional(source, "sampleRate")) fail(path + "/sampleRate", "a file gives its own rate");
      std::filesystem::path file = string(*pFile, path + "/file");
      if (file.is_relative() && !io_rContext.directory.empty())
        file = std::filesystem::path(io_rContext.directory) / file;
      std::string error;
      if (!pSource->loadFile(file.string(), error)) fail(path + "/file", error);
    } else {
      const int64_t rate = integer(member(source, path, "sampleRate"), path + "/sampleRate");
      if (rate <= 0 || rate > 1000000) fail(path + "/sampleRate", "rate must lie in [1, 1000000]");
      pSource->setSamples(int(rate), readInlineChannels(*pChannels, path + "/channels"));
    }
    if (auto* p = optional(source, "startFrame"))
      pSource->setStartTime(integer(*p, path + "/startFrame") * io_rContext.ticksPerFrame);
    if (auto* p = optional(source, "selected"))
      pSource->setSelected(boolean(*p, path + "/selected"));
    io_rContext.byName[sourceName] = pSource.get();
    io_rContext.root->addChild(pSource.release());
  }
}

} // namespace

ANVIL_REGISTER_SCENE_SECTION("audio", 60, readAudio)

} // namespace AnvilCore
