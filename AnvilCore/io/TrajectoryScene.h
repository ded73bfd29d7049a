#pragma once
#include "plugin/host/HTime.h"
#include "plugin/host/HTimeManager.h"
#include <memory>
#include <string>
#include <vector>

class Marker;
class Module;

namespace AnvilCore {

/// A label prefix that names a subject ("Bob:" or "Bob_" for subject "Bob").
struct SubjectPrefix {
  std::string prefix;
  std::string subject;
};

/// Subject and marker name of a trajectory label. A label that starts with one of `i_prefixes`
/// belongs to that prefix's subject (the longest prefix wins); otherwise a label with a ":"
/// belongs to the subject named by the part before the last ":". Other labels have no subject.
void splitTrajectoryLabel(const std::string& i_label, const std::vector<SubjectPrefix>& i_prefixes,
                          std::string& o_rSubject, std::string& o_rMarker);

/// Whether frames `i_firstFrame` to `i_lastFrame` at `i_rate` frames per second all have a time on
/// the host's clock (signed 64-bit ticks, with a wide margin).
bool framesFitClock(double i_rate, int64_t i_firstFrame, int64_t i_lastFrame);

/// A unit text read by its meaning.
struct UnitReading {
  double millimetres = 0.0; ///< millimetres per unit; 0 when the text names no known unit
  bool guessed = false;     ///< true when the text is a shortened name ("mete", "cent")
  const char* name = "";    ///< "millimetres", "centimetres", "metres" or "inches"
};

/// Reads a unit text in any case, with blanks and a trailing "." ignored: the symbols "mm",
/// "cm", "m", "in", the names millimetre, centimetre, metre (either spelling, singular or
/// plural), inch and inches; and, as a guess, any shortening of those names to two or more
/// letters ("mete", "millim", "cent", "inc"), each of which belongs to one unit only.
UnitReading readUnit(const std::string& i_text);

/// Multiplier from a unit text to millimetres, by `readUnit`; 0 when unknown.
double millimetresPer(const std::string& i_unit);

/// What the two trajectory readers share around their parsers: logging the parser's warnings,
/// and the multiplier to millimetres of the file's unit (a shortened unit name is read by its
/// meaning with a warning; an unknown or empty unit is logged and read as millimetres).
void logReaderWarnings(const std::string& i_path, const std::vector<std::string>& i_warnings);
double fileUnitsToMillimetres(const std::string& i_path, const std::string& i_unit);

/// Builds the markers of one trajectory file apart from the scene, then adds them in one step,
/// so that a file that fails half-way leaves the scene as it was. Markers of a subject go under
/// a `Character` of that name (an existing top-level one is reused at commit); a label that
/// starts with "*" is an unlabelled marker; a label given twice under one parent gets "_2",
/// "_3", ... appended.
class TrajectorySceneBuilder {
public:
  /// `i_frameRate` in frames per second, above 0.
  TrajectorySceneBuilder(double i_frameRate, const std::vector<std::string>& i_labels,
                         const std::vector<SubjectPrefix>& i_prefixes = {});
  ~TrajectorySceneBuilder();
  TrajectorySceneBuilder(const TrajectorySceneBuilder&) = delete;
  TrajectorySceneBuilder& operator=(const TrajectorySceneBuilder&) = delete;

  int getMarkerCount() const { return static_cast<int>(m_markers.size()); }
  /// Marker `i` of the labels' order; fill its `m_track` before `commit`.
  Marker& marker(int i) { return *m_markers[static_cast<size_t>(i)]; }
  /// Scene time of a frame number at the file's rate.
  HTime frameTime(int64_t i_frame) const { return m_clock.frameToTime(i_frame); }
  /// Keeps a module (an audio source) to add at the top of the scene on commit.
  void addTopLevel(Module* i_pModule);

  /// Moves everything into the scene, sets the clock to the file's rate and the animation and
  /// play ranges to frames [first, last] (one frame when last < first).
  void commit(int64_t i_firstFrame, int64_t i_lastFrame);
  /// The same with the animation and play ranges given as times.
  void commit(const HTimeRange& i_rRange);

private:
  HTimeManager m_clock;
  std::unique_ptr<Module> m_pStage; // detached parent of everything built
  std::vector<Marker*> m_markers;
};

} // namespace AnvilCore
