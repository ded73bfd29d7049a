#include "TrajectoryScene.h"
#include "exporters/trajectory/c3d/PrintableText.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/Marker.h"
#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <map>
#include <set>

namespace AnvilCore {

namespace {
std::string lower(std::string i_text) {
  for (char& c : i_text)
    if (c >= 'A' && c <= 'Z') c = char(c - 'A' + 'a');
  return i_text;
}

Character* topLevelCharacter(Module* i_pRoot, const HString& i_rName) {
  for (int i = 0; i < i_pRoot->getNumChildren(); ++i) {
    Module* pChild = i_pRoot->getChild(i);
    if (pChild->isKindOf(&Character::s_classCharacter) && pChild->getName() == i_rName)
      return static_cast<Character*>(pChild);
  }
  return nullptr;
}
} // namespace

void splitTrajectoryLabel(const std::string& i_label, const std::vector<SubjectPrefix>& i_prefixes,
                          std::string& o_rSubject, std::string& o_rMarker) {
  const SubjectPrefix* pBest = nullptr;
  for (const SubjectPrefix& prefix : i_prefixes)
    if (!prefix.prefix.empty() && !prefix.subject.empty() &&
        (!pBest || prefix.prefix.size() > pBest->prefix.size()) &&
        prefix.prefix.size() < i_label.size() &&
        i_label.compare(0, prefix.prefix.size(), prefix.prefix) == 0)
      pBest = &prefix;
  if (pBest) {
    o_rSubject = pBest->subject;
    o_rMarker = i_label.substr(pBest->prefix.size());
    return;
  }
  const size_t colon = i_label.rfind(':');
  if (colon == std::string::npos || colon == 0 || colon + 1 == i_label.size()) {
    o_rSubject.clear();
    o_rMarker = i_label;
    return;
  }
  o_rSubject = i_label.substr(0, colon);
  o_rMarker = i_label.substr(colon + 1);
}

bool framesFitClock(double i_rate, int64_t i_firstFrame, int64_t i_lastFrame) {
  if (!(i_rate > 0.0)) return false;
  const double ticksPerFrame = std::max(1.0, std::round(double(kTicksPerSecond) / i_rate));
  const double extent = double(std::max(std::llabs(i_firstFrame), std::llabs(i_lastFrame)) + 1);
  return extent * ticksPerFrame < 1e18;
}

UnitReading readUnit(const std::string& i_text) {
  struct Unit {
    double millimetres;
    const char* name;
    const char* symbol;
    std::vector<const char*> words;
  };
  static const Unit kUnits[] = {
      {1.0, "millimetres", "mm", {"millimetres", "millimeters"}},
      {10.0, "centimetres", "cm", {"centimetres", "centimeters"}},
      {1000.0, "metres", "m", {"metres", "meters"}},
      {25.4, "inches", "in", {"inches"}},
  };
  std::string text = lower(i_text);
  while (!text.empty() && (text.back() == ' ' || text.back() == '.'))
    text.pop_back();
  text.erase(0, std::min(text.size(), text.find_first_not_of(' ')));
  UnitReading reading;
  if (text.empty()) return reading;
  for (const Unit& unit : kUnits) {
    bool exact = text == unit.symbol;
    for (const char* pWord : unit.words) {
      const std::string word = pWord;
      // The word itself, or its singular ("metre", "inch").
      const std::string singular = word.substr(0, word.size() - (word == "inches" ? 2 : 1));
      exact = exact || text == word || text == singular;
    }
    if (exact) return {unit.millimetres, false, unit.name};
  }
  for (const Unit& unit : kUnits)
    for (const char* pWord : unit.words)
      if (text.size() >= 2 && std::string(pWord).compare(0, text.size(), text) == 0)
        return {unit.millimetres, true, unit.name};
  return reading;
}

double millimetresPer(const std::string& i_unit) {
  return readUnit(i_unit).millimetres;
}

void logReaderWarnings(const std::string& i_path, const std::vector<std::string>& i_warnings) {
  for (const std::string& warning : i_warnings)
    g_db->logWarning("%s: %s", i_path.c_str(), warning.c_str());
}

double fileUnitsToMillimetres(const std::string& i_path, const std::string& i_unit) {
  const std::string shown = C3D::printableText(i_unit);
  const UnitReading reading = readUnit(i_unit);
  if (reading.millimetres > 0.0) {
    if (reading.guessed)
      g_db->logWarning("%s: units \"%s\" taken as %s (a shortened name)", i_path.c_str(),
                       shown.c_str(), reading.name);
    return reading.millimetres;
  }
  g_db->logWarning("%s: unknown units \"%s\"; read as millimetres", i_path.c_str(), shown.c_str());
  return 1.0;
}

TrajectorySceneBuilder::TrajectorySceneBuilder(double i_frameRate,
                                               const std::vector<std::string>& i_labels,
                                               const std::vector<SubjectPrefix>& i_prefixes)
    : m_pStage(std::make_unique<Module>("stage")) {
  m_clock.setFrameRate(i_frameRate);
  std::map<std::string, Character*> subjects;
  std::map<Module*, std::set<std::string>> taken;
  m_markers.reserve(i_labels.size());
  for (const std::string& label : i_labels) {
    std::string subject, name;
    if (!label.empty() && label[0] == '*') {
      name = label; // an unlabelled trajectory keeps its "*" name at the top
    } else {
      splitTrajectoryLabel(label, i_prefixes, subject, name);
    }
    Module* pParent = m_pStage.get();
    if (!subject.empty()) {
      Character*& pCharacter = subjects[subject];
      if (!pCharacter) {
        pCharacter = new Character(HString(subject));
        m_pStage->addChild(pCharacter);
      }
      pParent = pCharacter;
    }
    std::set<std::string>& names = taken[pParent];
    std::string unique = name;
    for (int n = 2; !names.insert(unique).second; ++n)
      unique = name + "_" + std::to_string(n);
    Marker* pMarker = new Marker(HString(unique));
    pMarker->setUnlabeled(!label.empty() && label[0] == '*');
    pParent->addChild(pMarker);
    m_markers.push_back(pMarker);
  }
}

TrajectorySceneBuilder::~TrajectorySceneBuilder() = default;

void TrajectorySceneBuilder::addTopLevel(Module* i_pModule) {
  m_pStage->addChild(i_pModule);
}

void TrajectorySceneBuilder::commit(int64_t i_firstFrame, int64_t i_lastFrame) {
  commit(HTimeRange(frameTime(i_firstFrame),
                    frameTime(i_lastFrame < i_firstFrame ? i_firstFrame : i_lastFrame)));
}

void TrajectorySceneBuilder::commit(const HTimeRange& i_rRange) {
  Module* pRoot = g_db->getRoot();
  while (m_pStage->getNumChildren() > 0) {
    Module* pModule = m_pStage->detachChild(m_pStage->getChild(0));
    Character* pExisting = pModule->isKindOf(&Character::s_classCharacter)
                               ? topLevelCharacter(pRoot, pModule->getName())
                               : nullptr;
    if (!pExisting) {
      g_db->addToScene(pModule, false, nullptr, false, false);
      continue;
    }
    // The subject is in the scene already: its new markers join it.
    std::unique_ptr<Module> pNew(pModule);
    while (pNew->getNumChildren() > 0)
      g_db->addToScene(pNew->detachChild(pNew->getChild(0)), false, pExisting, false, false);
  }
  m_markers.clear();
  HTimeManager* pTime = g_db->getTimeManager();
  pTime->setFrameRate(m_clock.getFrameRate());
  pTime->setAnimRange(i_rRange);
  pTime->setPlayRange(i_rRange);
  pTime->setCurrentTime(i_rRange.getStart());
}

} // namespace AnvilCore
