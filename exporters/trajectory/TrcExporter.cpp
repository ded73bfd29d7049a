#include "TrcExporter.h"
#include "FixedDecimal.h"
#include "MarkerCursor.h"
#include "TextBlock.h"
#include "c3d/PrintableText.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include <charconv>
#include <cmath>
#include <cstring>
#include <string>
#include <vector>

namespace {
const char* const kSection = "TRCExporter";

// Characters of the frame number column ("%d" of an int).
constexpr size_t kFrameNumberChars = 12;

// Writes one "\t%f\t%f\t%f" triple, or the three tabs of a gap; returns the end. A node that
// is not a marker has a value at every time. A position with an infinite or NaN coordinate is
// written as a gap: such text ("inf", "nan") is no coordinate to other readers of the format.
char* appendPosition(char* o_p, TrajectoryExport::MarkerCursor& io_rCursor, HTime i_t) {
  io_rCursor.advanceTo(i_t);
  if (io_rCursor.isMarker() && !io_rCursor.hasKeyAt(i_t)) {
    std::memcpy(o_p, "\t\t\t", 3);
    return o_p + 3;
  }
  const Vec3 p = io_rCursor.position(i_t);
  if (!std::isfinite(p.x) || !std::isfinite(p.y) || !std::isfinite(p.z)) {
    std::memcpy(o_p, "\t\t\t", 3);
    return o_p + 3;
  }
  for (const double value : {p.x, p.y, p.z}) {
    *o_p++ = '\t';
    o_p = TrajectoryText::formatFixed<6>(o_p, value);
  }
  return o_p;
}
} // namespace

TrcExporter* TrcExporter::createInstance() {
  return new TrcExporter();
}

TrcExporter::TrcExporter() : FileExporter(false, "trc", false), m_markers(16), m_extraNodes(16) {}

bool TrcExporter::getOptions(void* o_pOptions) {
  std::memcpy(o_pOptions, &m_options, sizeof m_options);
  return true;
}

bool TrcExporter::setOptions(void* i_pOptions) {
  std::memcpy(&m_options, i_pOptions, sizeof m_options);
  return true;
}

bool TrcExporter::recognize(const HString& i_rFilename) {
  return extractExtension(i_rFilename) == "trc";
}

void TrcExporter::loadUserSetup() {
  const HString& scope = HString::EMPTY_STRING;
  // "WriteUnlabelled" defaults to the write-subjects flag, not to its own value.
  m_options.m_writeUnlabelled = g_interface.getUserSetupInt(kSection, "WriteUnlabelled",
                                                            m_options.m_writeSubjects, scope) != 0;
  m_options.m_writeSubjects = g_interface.getUserSetupInt(kSection, "ExportSubjectNames",
                                                          m_options.m_writeSubjects, scope) != 0;
  m_options.m_removeLeadingUnderscores =
      g_interface.getUserSetupInt(kSection, "RemoveLeadingUnderscores",
                                  m_options.m_removeLeadingUnderscores, scope) != 0;
  m_options.m_collapseSubjects =
      g_interface.getUserSetupInt(kSection, "CollapseSubjectNames", m_options.m_collapseSubjects,
                                  scope) != 0;
}

void TrcExporter::saveUserSetup() const {
  const HString& scope = HString::EMPTY_STRING;
  g_interface.setUserSetupInt(kSection, "WriteUnlabelled", m_options.m_writeUnlabelled, scope);
  g_interface.setUserSetupInt(kSection, "ExportSubjectNames", m_options.m_writeSubjects, scope);
  g_interface.setUserSetupInt(kSection, "RemoveLeadingUnderscores",
                              m_options.m_removeLeadingUnderscores, scope);
  g_interface.setUserSetupInt(kSection, "CollapseSubjectNames", m_options.m_collapseSubjects,
                              scope);
}

bool TrcExporter::editOptions(void*) {
  // This host has no options dialog; options change through trcExportOptions.
  return false;
}

void TrcExporter::reset() {
  m_markers.setCount(0);
  m_extraNodes.setCount(0);
}

HString TrcExporter::displayName(const Node* i_pMarker) const {
  const Character* pCharacter = i_pMarker->getCharacterParent();
  if (!m_options.m_writeSubjects || !pCharacter) return i_pMarker->getName();
  HString name;
  if (m_options.m_collapseSubjects) {
    name = pCharacter->getName() + "_" + i_pMarker->getName();
  } else {
    name = ModulePath(i_pMarker).getPartialPathString();
    name.Replace("\\", ":");
  }
  if (m_options.m_removeLeadingUnderscores && !name.IsEmpty() && name[0] == '_') name = name.Mid(1);
  return name;
}

bool TrcExporter::write() {
  for (Module* pModule : m_modules)
    if (pModule->isKindOf(&Marker::s_classMarker)) m_markers.add(static_cast<Node*>(pModule));
  writeHeader();
  writeFrames();
  return true;
}

void TrcExporter::writeHeader() {
  const int markers = m_markers.getCount();
  const int frames = m_timeRange.getNumFrames();
  const double rate = HTimeManager::getInstance()->getFrameRate();
  std::fprintf(m_pFile, "PathFileType\t4\t(X/Y/Z)\t%s\n", m_filePath.GetStr());
  std::fprintf(m_pFile, "DataRate\tCameraRate\tNumFrames\tNumMarkers\tUnits\tOrigDataRate\t"
                        "OrigDataStartFrame\tOrigNumFrames\n");
  std::fprintf(m_pFile, "%f\t", rate);
  std::fprintf(m_pFile, "%f\t", rate);
  std::fprintf(m_pFile, "%d\t", frames);
  std::fprintf(m_pFile, "%d\t", markers);
  std::fprintf(m_pFile, "mm\t");
  std::fprintf(m_pFile, "%f\t", rate);
  std::fprintf(m_pFile, "1\t");
  std::fprintf(m_pFile, "%d\n", frames);

  std::fprintf(m_pFile, "Frame#\tTime\t");
  for (const Node* pMarker : m_markers) {
    // A tab, line end or other control character, or bytes that are not UTF-8, would break the
    // header's columns or its text: they become '?', with a warning.
    const HString name = displayName(pMarker);
    bool changed = false;
    const std::string text = C3D::printableText(name.GetString(), &changed);
    if (changed)
      g_db->logWarning("TRC export: a marker name holds characters that cannot be printed; "
                       "written as \"%s\"",
                       text.c_str());
    std::fprintf(m_pFile, "%s\t\t\t", text.c_str());
  }
  std::fprintf(m_pFile, "\n");

  std::fprintf(m_pFile, "\t\t");
  for (int i = 0; i < markers; ++i)
    std::fprintf(m_pFile, "X%d\tY%d\tZ%d\t", i, i, i);
  std::fprintf(m_pFile, "\n");
}

void TrcExporter::writeFrames() {
  HTimeManager* pTime = HTimeManager::getInstance();
  const HTime t0 = m_timeRange.getStart();
  const HTime t1 = m_timeRange.getEnd();
  const int64_t ticksPerFrame = pTime->getTicksPerFrame();
  const int frames = t0 > t1 ? 0 : m_timeRange.getNumFrames();
  // The time column uses the rate the clock implies, not the nominal rate.
  const double rate = 135000000.0 / double(ticksPerFrame);
  const double step = 1.0 / rate;

  std::vector<TrajectoryExport::MarkerCursor> cursors;
  cursors.reserve(size_t(m_markers.getCount() + m_extraNodes.getCount()));
  for (const Node* pNode : m_markers)
    cursors.emplace_back(pNode);
  for (const Node* pNode : m_extraNodes)
    cursors.emplace_back(pNode);

  if (s_doProgress) g_theOperationStack.setTaskRange(0, frames / 10);
  TrajectoryExport::TextBlock block(
      m_pFile, kFrameNumberChars + TrajectoryText::kFixedMaxChars +
                   cursors.size() * 3 * (TrajectoryText::kFixedMaxChars + 1) + 2);
  for (int i = 0; i < frames; ++i) {
    const HTime t = t0 + i * ticksPerFrame;
    const int frame = pTime->getFrame(t);
    char* p = block.lineStart();
    p = std::to_chars(p, p + kFrameNumberChars, frame).ptr;
    *p++ = '\t';
    p = TrajectoryText::formatFixed<6>(p, frame * step);
    for (TrajectoryExport::MarkerCursor& cursor : cursors)
      p = appendPosition(p, cursor, t);
    *p++ = '\n';
    block.lineEnd(p);
    if (s_doProgress && i % 10 == 0) g_theOperationStack.stepTask();
  }
}
