#include "C3DExporter.h"
#include "c3d/C3DFormat.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include <algorithm>
#include <cmath>
#include <cstring>

namespace {
const char* const kSection = "C3DExporter";
// Close to 1/32767: the largest coordinate maps to the largest 16-bit integer.
constexpr float kIntegerScale = 3.051851e-05f;
} // namespace

C3DExporter* C3DExporter::createInstance() {
  return new C3DExporter();
}

C3DExporter::C3DExporter()
    : FileExporter(true, "c3d", false), m_audioSources(2), m_subjectNames(8), m_markers(16) {}

bool C3DExporter::getOptions(void* o_pOptions) {
  std::memcpy(o_pOptions, &m_options, sizeof m_options);
  return true;
}

bool C3DExporter::setOptions(void* i_pOptions) {
  std::memcpy(&m_options, i_pOptions, sizeof m_options);
  return true;
}

bool C3DExporter::recognize(const HString& i_rFilename) {
  return extractExtension(i_rFilename) == "c3d";
}

bool C3DExporter::setDesiredUpAxis(const HString& i_rAxis) {
  HString axis = i_rAxis;
  axis.MakeLower();
  if (axis == "scene")
    m_options.m_desiredUpAxis = C3dExportOptions::EUpAxisScene;
  else if (axis == "y")
    m_options.m_desiredUpAxis = C3dExportOptions::EUpAxisY;
  else if (axis == "z")
    m_options.m_desiredUpAxis = C3dExportOptions::EUpAxisZ;
  else
    return false;
  return true;
}

HString C3DExporter::getDesiredUpAxisAsString() const {
  switch (m_options.m_desiredUpAxis) {
  case C3dExportOptions::EUpAxisScene:
    return "Scene";
  case C3dExportOptions::EUpAxisY:
    return "Y";
  case C3dExportOptions::EUpAxisZ:
    return "Z";
  }
  return HString();
}

void C3DExporter::loadUserSetup() {
  const HString& scope = HString::EMPTY_STRING;
  C3dExportOptions& o = m_options;
  o.m_preserveGaps =
      g_interface.getUserSetupBool(kSection, "PreserveGaps", o.m_preserveGaps, scope);
  o.m_collapseToSubjects =
      g_interface.getUserSetupBool(kSection, "Collapse", o.m_collapseToSubjects, scope);
  o.m_realFormat = g_interface.getUserSetupBool(kSection, "RealFormat", o.m_realFormat, scope);
  o.m_writeTimeCode =
      g_interface.getUserSetupBool(kSection, "WriteTimeCode", o.m_writeTimeCode, scope);
  o.m_writeUnlabelled =
      g_interface.getUserSetupBool(kSection, "WriteUnlabelled", o.m_writeUnlabelled, scope);
  o.m_removeLeadingUnderscores = g_interface.getUserSetupBool(kSection, "RemoveLeadingUnderscores",
                                                              o.m_removeLeadingUnderscores, scope);
  o.m_filterMinKeys =
      g_interface.getUserSetupBool(kSection, "FilterMinKeys", o.m_filterMinKeys, scope);
  o.m_filterMaxKeys =
      g_interface.getUserSetupBool(kSection, "FilterMaxKeys", o.m_filterMaxKeys, scope);
  o.m_minKeys = g_interface.getUserSetupInt(kSection, "MinKeys", o.m_minKeys, scope);
  o.m_maxKeys = g_interface.getUserSetupInt(kSection, "MaxKeys", o.m_maxKeys, scope);
  o.m_overrideHeaderRate =
      g_interface.getUserSetupBool(kSection, "OverrideHeaderRate", o.m_overrideHeaderRate, scope);
  o.m_headerRate = g_interface.getUserSetupDouble(kSection, "HeaderRate", o.m_headerRate, scope);
  setDesiredUpAxis(g_interface.getUserSetupString(kSection, "DesiredUpAxis",
                                                  getDesiredUpAxisAsString().GetStr(), scope));
}

void C3DExporter::saveUserSetup() const {
  const HString& scope = HString::EMPTY_STRING;
  const C3dExportOptions& o = m_options;
  g_interface.setUserSetupBool(kSection, "PreserveGaps", o.m_preserveGaps, scope);
  g_interface.setUserSetupBool(kSection, "Collapse", o.m_collapseToSubjects, scope);
  g_interface.setUserSetupBool(kSection, "RealFormat", o.m_realFormat, scope);
  g_interface.setUserSetupBool(kSection, "WriteTimeCode", o.m_writeTimeCode, scope);
  g_interface.setUserSetupBool(kSection, "WriteUnlabelled", o.m_writeUnlabelled, scope);
  g_interface.setUserSetupBool(kSection, "RemoveLeadingUnderscores", o.m_removeLeadingUnderscores,
                               scope);
  g_interface.setUserSetupBool(kSection, "FilterMinKeys", o.m_filterMinKeys, scope);
  g_interface.setUserSetupBool(kSection, "FilterMaxKeys", o.m_filterMaxKeys, scope);
  g_interface.setUserSetupInt(kSection, "MinKeys", o.m_minKeys, scope);
  g_interface.setUserSetupInt(kSection, "MaxKeys", o.m_maxKeys, scope);
  g_interface.setUserSetupBool(kSection, "OverrideHeaderRate", o.m_overrideHeaderRate, scope);
  g_interface.setUserSetupDouble(kSection, "HeaderRate", o.m_headerRate, scope);
  g_interface.setUserSetupString(kSection, "DesiredUpAxis", getDesiredUpAxisAsString(), scope);
}

void C3DExporter::reset() {
  m_subjectNames.removeAll();
  m_markers.removeAll();
  m_audioSources.removeAll();
}

void C3DExporter::convertFloatToDec(float i_value, char* o_pBytes) {
  C3D::ieeeToDec(i_value, reinterpret_cast<uint8_t*>(o_pBytes));
}

void C3DExporter::convertWordToDec(short i_value, char* o_pBytes) {
  convertUnsignedWordToDec(static_cast<unsigned short>(i_value), o_pBytes);
}

void C3DExporter::convertUnsignedWordToDec(unsigned short i_value, char* o_pBytes) {
  o_pBytes[0] = char(i_value & 0xFF);
  o_pBytes[1] = char(i_value >> 8);
}

void C3DExporter::rotateToDesiredAxis(bool i_wasZUp, bool i_undo) {
  const EUpAxis axis = m_options.m_desiredUpAxis;
  // Y up from a Z-up scene turns -90 degrees about X; Z up from a Y-up scene turns +90.
  double degrees = 0.0;
  if (axis == C3dExportOptions::EUpAxisY && i_wasZUp) degrees = -90.0;
  if (axis == C3dExportOptions::EUpAxisZ && !i_wasZUp) degrees = 90.0;
  if (degrees == 0.0) return;
  if (i_undo) degrees = -degrees;
  g_db->rotateScene(degrees, 0);
  g_db->setZUp(i_undo ? i_wasZUp : !i_wasZUp);
}

void C3DExporter::collectMarkers() {
  for (Module* pModule : m_modules) {
    if (!pModule->isKindOf(&Marker::s_classMarker)) continue;
    const Marker* pMarker = static_cast<const Marker*>(pModule);
    const int keys = pMarker->m_track.getNumKeys();
    if (m_options.m_filterMinKeys && keys < m_options.m_minKeys) continue;
    if (m_options.m_filterMaxKeys && keys > m_options.m_maxKeys) continue;
    m_markers.add(pMarker);
  }
}

int C3DExporter::wholeRatio(double i_numerator, float i_frameRate) {
  const float ratio = float(i_numerator) / i_frameRate;
  // A rate that is n times the frame rate up to the rounding of a float counts as n: analog
  // rates of files with a fractional frame rate (107.527 Hz) come back as such products.
  const float nearest = std::nearbyint(ratio);
  if (std::fabs(ratio - nearest) <= 1e-5f * std::max(1.0f, nearest)) return int(nearest);
  return int(ratio);
}

void C3DExporter::computeAnalogFigures() {
  m_analogRate = 0.0;
  m_analogChannels = 0;
  for (const AudioSource* pSource : m_audioSources) {
    if (pSource->getSampleRate() > m_analogRate) m_analogRate = pSource->getSampleRate();
    m_analogChannels += pSource->getNumChannels();
  }
  m_samplesPerFrame = wholeRatio(m_analogRate, m_frameRate);
}

void C3DExporter::computeScale() {
  if (m_options.m_realFormat) {
    m_scale = -1.0f;
    return;
  }
  double highest = 0.0, lowest = 0.0;
  for (const Marker* pMarker : m_markers) {
    const HPositionTrack& track = pMarker->m_track;
    for (int i = 0; i < track.getNumKeys(); ++i) {
      const Vec3 p = pMarker->getWSKeyPos(i);
      for (int axis = 0; axis < 3; ++axis) {
        if (p[axis] > highest) highest = p[axis];
        if (p[axis] < lowest) lowest = p[axis];
      }
    }
  }
  m_scale = float(std::max(std::fabs(highest), std::fabs(lowest))) * kIntegerScale;
  if (!(m_scale > 0.0f)) m_scale = 1.0f;
}

bool C3DExporter::write() {
  if (m_modules.isEmpty()) return false;
  if (!m_pFile) return false; // the host could not open the output
  HTimeManager* pTime = HTimeManager::getInstance();

  if (!m_options.m_overrideHeaderRate) {
    m_frameRate = float(pTime->getFrameRate());
  } else {
    const double rate = m_options.m_headerRate;
    if (!(rate > 0.0 && rate < 10000.0)) {
      g_db->logError("Invalid c3d header override rate: %f", rate);
      return false;
    }
    m_frameRate = float(rate);
  }

  for (Module* pModule : m_modules)
    if (pModule->isKindOf(&AudioSource::s_classAudioSource))
      m_audioSources.add(static_cast<AudioSource*>(pModule));

  const bool wasZUp = g_db->isZUp();
  rotateToDesiredAxis(wasZUp, false);
  collectMarkers();

  m_pointCount = m_markers.getCount();
  m_rangeStart = m_timeRange.getStart();
  const HTime length = m_timeRange.getEnd() > m_timeRange.getStart()
                           ? m_timeRange.getEnd() - m_timeRange.getStart()
                           : 0;
  m_firstFrame = pTime->getFrame(m_rangeStart);
  m_lastFrame = m_firstFrame + pTime->getFrame(length);
  if (m_firstFrame < 0) {
    // Reported after the rotation, which is then left in place.
    g_db->logError("C3D format does no allow for negative frame numbers");
    return false;
  }

  computeAnalogFigures();
  m_subjectNames.removeAll();
  computeScale();
  if (s_doProgress) g_theOperationStack.setTaskRange(1, m_timeRange.getNumFrames() / 10);

  writeParameterSection();
  writeHeader();
  writeFrames();

  rotateToDesiredAxis(wasZUp, true);
  return true;
}
