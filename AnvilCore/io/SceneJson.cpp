#include "SceneJson.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include <algorithm>
#include <cmath>
#include <filesystem>

namespace AnvilCore {

SceneSectionRegistry& SceneSectionRegistry::instance() {
  static SceneSectionRegistry s_registry;
  return s_registry;
}

void SceneSectionRegistry::add(const std::string& i_key, int i_order, SceneSectionReader i_reader) {
  Entry entry{i_key, i_order, std::move(i_reader)};
  auto it = std::upper_bound(m_entries.begin(), m_entries.end(), entry,
                             [](const Entry& a, const Entry& b) { return a.order < b.order; });
  m_entries.insert(it, std::move(entry));
}

namespace json {

void fail(const std::string& i_path, const std::string& i_message) {
  throw SceneJsonError{i_path.empty() ? "/" : i_path, i_message};
}

const nlohmann::json& object(const nlohmann::json& i_rValue, const std::string& i_path) {
  if (!i_rValue.is_object()) fail(i_path, "expected an object");
  return i_rValue;
}

const nlohmann::json& array(const nlohmann::json& i_rValue, const std::string& i_path) {
  if (!i_rValue.is_array()) fail(i_path, "expected an array");
  return i_rValue;
}

const nlohmann::json& member(const nlohmann::json& i_rObject, const std::string& i_path,
                             const char* i_pKey) {
  object(i_rObject, i_path);
  auto it = i_rObject.find(i_pKey);
  if (it == i_rObject.end()) fail(i_path, std::string("missing required key \"") + i_pKey + "\"");
  return *it;
}

const nlohmann::json* optional(const nlohmann::json& i_rObject, const char* i_pKey) {
  auto it = i_rObject.find(i_pKey);
  return (it == i_rObject.end() || it->is_null()) ? nullptr : &*it;
}

double number(const nlohmann::json& i_rValue, const std::string& i_path) {
  if (!i_rValue.is_number()) fail(i_path, "expected a number");
  const double value = i_rValue.get<double>();
  if (!std::isfinite(value)) fail(i_path, "expected a finite number");
  return value;
}

int64_t integer(const nlohmann::json& i_rValue, const std::string& i_path) {
  if (i_rValue.is_number_integer()) return i_rValue.get<int64_t>();
  if (i_rValue.is_number_float()) {
    const double value = i_rValue.get<double>();
    if (value == std::floor(value) && std::fabs(value) < 9e15) return static_cast<int64_t>(value);
  }
  fail(i_path, "expected an integer");
}

bool boolean(const nlohmann::json& i_rValue, const std::string& i_path) {
  if (!i_rValue.is_boolean()) fail(i_path, "expected true or false");
  return i_rValue.get<bool>();
}

std::string string(const nlohmann::json& i_rValue, const std::string& i_path) {
  if (!i_rValue.is_string()) fail(i_path, "expected a string");
  return i_rValue.get<std::string>();
}

std::string name(const nlohmann::json& i_rValue, const std::string& i_path) {
  std::string text = string(i_rValue, i_path);
  if (text.empty()) fail(i_path, "a name must not be empty");
  if (text.find('\\') != std::string::npos) fail(i_path, "a name must not contain '\\'");
  return text;
}

std::vector<double> numbers(const nlohmann::json& i_rValue, const std::string& i_path, size_t i_n) {
  array(i_rValue, i_path);
  if (i_rValue.size() != i_n)
    fail(i_path,
         "expected " + std::to_string(i_n) + " numbers, found " + std::to_string(i_rValue.size()));
  std::vector<double> values;
  for (size_t i = 0; i < i_n; ++i)
    values.push_back(number(i_rValue[i], i_path + "/" + std::to_string(i)));
  return values;
}

void onlyKeys(const nlohmann::json& i_rObject, const std::string& i_path,
              std::initializer_list<const char*> i_allowed) {
  object(i_rObject, i_path);
  for (auto it = i_rObject.begin(); it != i_rObject.end(); ++it) {
    const bool known = std::any_of(i_allowed.begin(), i_allowed.end(),
                                   [&](const char* k) { return it.key() == k; });
    if (!known) fail(i_path + "/" + it.key(), "unknown key \"" + it.key() + "\"");
  }
}

} // namespace json

std::optional<HTimeRange> keySpan(Module& i_rRoot) {
  std::vector<Module*> modules;
  i_rRoot.collect(modules);
  std::optional<HTimeRange> span;
  auto include = [&](const std::vector<HTime>& i_times) {
    if (i_times.empty()) return;
    const HTime first = i_times.front(), last = i_times.back();
    span = span ? HTimeRange(std::min(span->getStart(), first), std::max(span->getEnd(), last))
                : HTimeRange(first, last);
  };
  for (Module* p : modules) {
    if (!p->isKindOf(&Node::s_classNode)) continue;
    const Node* pNode = static_cast<const Node*>(p);
    include(pNode->m_positionTrack.times());
    include(pNode->m_rotationTrack.times());
    include(pNode->m_scaleTrack.times());
    if (p->isKindOf(&Marker::s_classMarker))
      include(static_cast<const Marker*>(p)->m_track.times());
  }
  return span;
}

void extendAnimRange(const HTimeRange& i_rSpan) {
  HTimeManager* pTime = g_db->getTimeManager();
  HTimeRange range = i_rSpan;
  // A scene that already holds data keeps its range and grows to cover the new keys.
  if (g_db->getNumNodes() > 0) {
    const HTimeRange& old = pTime->getAnimRange();
    range = HTimeRange(std::min(old.getStart(), range.getStart()),
                       std::max(old.getEnd(), range.getEnd()));
  }
  pTime->setAnimRange(range);
  pTime->setPlayRange(range);
}

bool readSceneJson(const std::string& i_text, const std::string& i_source, std::string& o_rError) {
  nlohmann::json document;
  try {
    document = nlohmann::json::parse(i_text);
  } catch (const nlohmann::json::parse_error& e) {
    // The parser's text carries the byte offset.
    o_rError = i_source + ": not valid JSON: " + e.what();
    return false;
  }
  SceneJsonContext context;
  context.root = std::make_unique<Module>("staging");
  context.frameRate = g_db->getTimeManager()->getFrameRate();
  context.ticksPerFrame = g_db->getTimeManager()->getTicksPerFrame();
  context.timecodeMode = g_db->getTimeManager()->getTimecodeMode();
  context.directory = std::filesystem::path(i_source).parent_path().string();
  try {
    json::object(document, "");
    const auto& entries = SceneSectionRegistry::instance().entries();
    for (auto it = document.begin(); it != document.end(); ++it) {
      const bool known = std::any_of(entries.begin(), entries.end(),
                                     [&](const auto& e) { return e.key == it.key(); });
      if (!known) json::fail("/" + it.key(), "unknown key \"" + it.key() + "\"");
    }
    for (const auto& entry : entries) {
      auto it = document.find(entry.key);
      if (it != document.end()) entry.reader(*it, "/" + entry.key, context);
    }
  } catch (const SceneJsonError& e) {
    o_rError = i_source + ": at " + e.path + ": " + e.message;
    return false;
  }
  // Scene-wide settings first (the rate decides the range below), then the modules.
  for (auto& commit : context.commits)
    commit();
  if (!context.animRangeSet)
    if (std::optional<HTimeRange> span = keySpan(*context.root)) extendAnimRange(*span);
  while (context.root->getNumChildren() > 0)
    g_db->addChild(g_db->getRoot(), context.root->detachChild(context.root->getChild(0)));
  return true;
}

} // namespace AnvilCore
