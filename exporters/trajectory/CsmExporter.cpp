#include "CsmExporter.h"
#include "FixedDecimal.h"
#include "MarkerCursor.h"
#include "TextBlock.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include "plugin/host/SubjectManager.h"
#include <algorithm>
#include <charconv>
#include <cstring>
#include <ctime>
#include <string>
#include <vector>

namespace {
const char* const kSection = "CSMExporter";

// "$Actor": the one subject, "None" or "MultipleSubjects", among the selected subjects when the
// export is of the selection only.
HString actorName() {
  const SubjectManager* pSubjects = g_db->getSubjectManager();
  const bool selected = g_db->getFileExporterMgr()->getExportSelectedOnly();
  const int count = selected ? pSubjects->getNumSelectedSubjects() : pSubjects->getNumSubjects();
  if (count == 0) return "None";
  if (count > 1) return "MultipleSubjects";
  const Character* pSubject =
      selected ? pSubjects->getSelectedSubject(0) : pSubjects->getSubject(0);
  return pSubject->getName();
}

// Blanks would split a name in the order section.
std::string orderName(const HString& i_rName) {
  std::string name = i_rName.GetString();
  for (char& c : name)
    if (c == ' ' || c == '\t' || c == '\n') c = '_';
  return name;
}
} // namespace

CsmExporter* CsmExporter::createInstance() {
  return new CsmExporter();
}

CsmExporter::CsmExporter() : FileExporter(false, "csm", false) {}

bool CsmExporter::getOptions(void* o_pOptions) {
  std::memcpy(o_pOptions, &m_options, sizeof m_options);
  return true;
}

bool CsmExporter::setOptions(void* i_pOptions) {
  std::memcpy(&m_options, i_pOptions, sizeof m_options);
  return true;
}

bool CsmExporter::recognize(const HString& i_rFilename) {
  return extractExtension(i_rFilename) == "csm";
}

HString CsmExporter::getDesiredUpAxisAsString() const {
  switch (m_options.m_desiredUpAxis) {
  case EUpAxisY:
    return "Y";
  case EUpAxisZ:
    return "Z";
  default:
    return HString();
  }
}

bool CsmExporter::setDesiredUpAxis(HString i_axis) {
  i_axis.MakeLower();
  if (i_axis == "y") {
    m_options.m_desiredUpAxis = EUpAxisY;
  } else if (i_axis == "z") {
    m_options.m_desiredUpAxis = EUpAxisZ;
  } else {
    return false;
  }
  return true;
}

void CsmExporter::loadUserSetup() {
  setDesiredUpAxis(g_interface.getUserSetupString(
      kSection, "DesiredUpAxis", getDesiredUpAxisAsString(), HString::EMPTY_STRING));
}

void CsmExporter::saveUserSetup() const {
  g_interface.setUserSetupString(kSection, "DesiredUpAxis", getDesiredUpAxisAsString(),
                                 HString::EMPTY_STRING);
}

HString CsmExporter::fileNameOf(const HString& i_rPath) {
  const std::string& path = i_rPath.GetString();
  for (size_t i = path.size(); i-- > 1;)
    if (path[i] == '\\') return HString(path.substr(i + 1));
  return i_rPath;
}

void CsmExporter::rotateForUpAxis(double i_sign) const {
  // Deliberately unlike the C3D exporter: "Z" (1) turns a Z-up scene by -90 degrees and "Y"
  // never turns it; the value 2 is never produced by the option.
  if (m_options.m_desiredUpAxis == 1 && g_db->isZUp()) g_db->rotateScene(-90.0 * i_sign, 0);
  if (m_options.m_desiredUpAxis == 2 && !g_db->isZUp()) g_db->rotateScene(90.0 * i_sign, 0);
}

bool CsmExporter::write() {
  if (s_doProgress) g_theOperationStack.setTaskRange(1, m_timeRange.getNumFrames() / 10);
  rotateForUpAxis(1.0);
  writeHeader();
  writeOrder();
  writePoints();
  rotateForUpAxis(-1.0);
  return true;
}

void CsmExporter::writeHeader() {
  const HTimeManager* pTime = HTimeManager::getInstance();
  const int64_t ticksPerFrame = pTime->getTicksPerFrame();
  const std::time_t now = std::time(nullptr);
  std::fprintf(m_pFile, "$Date %s\n", std::ctime(&now));
  std::fprintf(m_pFile, "$Time 12:00:00\n");
  std::fprintf(m_pFile, "$Filename %s\n", fileNameOf(m_filePath).GetStr());
  std::fprintf(m_pFile, "$Actor %s\n\n", actorName().GetStr());
  std::fprintf(m_pFile, "$Comments\n");
  std::fprintf(m_pFile, "Motion capture produced by Harrow\n\n");
  // Whatever range the host passed, a CSM file holds the play range.
  m_timeRange = pTime->getPlayRange();
  std::fprintf(m_pFile, "$FirstFrame %lld\n",
               static_cast<long long>(m_timeRange.getStart() / ticksPerFrame));
  std::fprintf(m_pFile, "$LastFrame %lld\n",
               static_cast<long long>(m_timeRange.getEnd() / ticksPerFrame));
  std::fprintf(m_pFile, "$Rate %f\n\n", pTime->getFrameRate());
}

bool CsmExporter::isWritten(const Module* i_pModule) const {
  return i_pModule->isKindOf(&Marker::s_classMarker) && isInModsList(i_pModule) &&
         i_pModule->getParent() != nullptr;
}

void CsmExporter::writeOrder() {
  std::fprintf(m_pFile, "$Order\n");
  for (const Module* pModule : m_modules)
    if (isWritten(pModule)) std::fprintf(m_pFile, "%s ", orderName(pModule->getName()).c_str());
  std::fprintf(m_pFile, "\n\n");
}

void CsmExporter::writePoints() {
  std::fprintf(m_pFile, "$Points\n");
  const int64_t ticksPerFrame = HTimeManager::getInstance()->getTicksPerFrame();
  const int frames = std::max(m_timeRange.getNumFrames(), 0);
  std::vector<const Node*> markers;
  for (const Module* pModule : m_modules)
    if (isWritten(pModule)) markers.push_back(static_cast<const Node*>(pModule));

  std::vector<TrajectoryExport::MarkerCursor> cursors(markers.begin(), markers.end());
  // Lines are formatted straight into one block, written in one call when it fills.
  constexpr size_t kFrameNumberChars = 24; // "%lld"
  TrajectoryExport::TextBlock block(
      m_pFile, kFrameNumberChars + cursors.size() * 3 * (TrajectoryText::kFixedMaxChars + 2) + 1);
  for (int i = 0; i < frames; ++i) {
    const HTime t = m_timeRange.getStart() + i * ticksPerFrame;
    char* p = block.lineStart();
    p = std::to_chars(p, p + kFrameNumberChars, static_cast<long long>(t / ticksPerFrame)).ptr;
    for (TrajectoryExport::MarkerCursor& cursor : cursors) {
      cursor.advanceTo(t);
      const Vec3 position = cursor.position(t);
      *p++ = ' ';
      for (const double value : {position.x, position.y, position.z}) {
        *p++ = ' ';
        p = TrajectoryText::formatFixed<3>(p, value);
      }
    }
    *p++ = '\n';
    block.lineEnd(p);
    if (s_doProgress && i % 10 == 0) g_theOperationStack.stepTask();
  }
}
