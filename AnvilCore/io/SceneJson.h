#pragma once
#include "plugin/host/HTime.h"
#include <functional>
#include <map>
#include <memory>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <vector>

class Module;

namespace AnvilCore {

/// What a scene file builds before it touches the scene. Modules are made under `root` (a
/// detached module); `commit` actions run only once the whole file has been read, so a file
/// with an error leaves the scene as it was.
struct SceneJsonContext {
  std::unique_ptr<Module> root;
  std::vector<std::function<void()>> commits;
  /// Top-level modules by name, for sections that refer to subjects or nodes.
  std::map<std::string, Module*> byName;
  /// The rate frames are counted at: the file's "time" rate, else the scene's current one.
  double frameRate = 0.0;
  int64_t ticksPerFrame = 0;
  /// Whether the file gave an animation range; if not, it becomes the span of the keys read.
  bool animRangeSet = false;
  /// The timecode mode in force once the file is read: the "time" section's, else the scene's.
  int timecodeMode = 0;
  /// Folder of the scene file, against which relative paths in it are resolved.
  std::string directory;
};

/// Thrown by the helpers below; carries the JSON path ("/markers/3/positions/12") and a text.
struct SceneJsonError {
  std::string path;
  std::string message;
};

/// Reads one top-level section of a scene file.
using SceneSectionReader = std::function<void(
    const nlohmann::json& i_rValue, const std::string& i_path, SceneJsonContext& io_rContext)>;

/// Top-level sections by key. A new section is one function plus one
/// `ANVIL_REGISTER_SCENE_SECTION` line; `order` fixes reading order (lower first).
class SceneSectionRegistry {
public:
  static SceneSectionRegistry& instance();
  void add(const std::string& i_key, int i_order, SceneSectionReader i_reader);
  struct Entry {
    std::string key;
    int order;
    SceneSectionReader reader;
  };
  const std::vector<Entry>& entries() const { return m_entries; }

private:
  std::vector<Entry> m_entries;
};

struct SceneSectionRegistration {
  SceneSectionRegistration(const char* i_pKey, int i_order, SceneSectionReader i_reader) {
    SceneSectionRegistry::instance().add(i_pKey, i_order, std::move(i_reader));
  }
};

/// The span of every key under `i_rRoot`, or nothing when there are none.
std::optional<HTimeRange> keySpan(Module& i_rRoot);
/// Makes the animation and play ranges cover `i_rSpan` (only it, when the scene was empty).
/// Readers call this before adding their modules.
void extendAnimRange(const HTimeRange& i_rSpan);

/// Reads a scene file's text into the scene. `i_source` names the file in messages.
bool readSceneJson(const std::string& i_text, const std::string& i_source, std::string& o_rError);

namespace json {
/// Typed access that throws `SceneJsonError` naming the path.
const nlohmann::json& member(const nlohmann::json& i_rObject, const std::string& i_path,
                             const char* i_pKey);
const nlohmann::json* optional(const nlohmann::json& i_rObject, const char* i_pKey);
double number(const nlohmann::json& i_rValue, const std::string& i_path);
int64_t integer(const nlohmann::json& i_rValue, const std::string& i_path);
bool boolean(const nlohmann::json& i_rValue, const std::string& i_path);
std::string string(const nlohmann::json& i_rValue, const std::string& i_path);
/// A non-empty name.
std::string name(const nlohmann::json& i_rValue, const std::string& i_path);
/// An array of exactly N numbers.
std::vector<double> numbers(const nlohmann::json& i_rValue, const std::string& i_path, size_t i_n);
const nlohmann::json& array(const nlohmann::json& i_rValue, const std::string& i_path);
const nlohmann::json& object(const nlohmann::json& i_rValue, const std::string& i_path);
/// Fails on keys outside `i_allowed`, so typing mistakes do not pass silently.
void onlyKeys(const nlohmann::json& i_rObject, const std::string& i_path,
              std::initializer_list<const char*> i_allowed);
[[noreturn]] void fail(const std::string& i_path, const std::string& i_message);
} // namespace json

} // namespace AnvilCore

#define ANVIL_SCENE_CAT2(a, b) a##b
#define ANVIL_SCENE_CAT(a, b) ANVIL_SCENE_CAT2(a, b)
#define ANVIL_REGISTER_SCENE_SECTION(key, order, reader)                                           \
  static const ::AnvilCore::SceneSectionRegistration ANVIL_SCENE_CAT(s_section_, __LINE__)(        \
      key, order, reader);
