#include "AnvilFbxExporter.h"
#include "UpAxisText.h"
#include "fbx/FbxObject.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include <cmath>
#include <cstring>

namespace {
const char* const kSection = "FBXExporter";

struct VersionEntry {
  const char* m_pText;
  const char* m_pSdkString;
};
const VersionEntry kVersions[] = {{"2020", "FBX202000"}, {"2019", "FBX201900"},
                                  {"2018", "FBX201800"}, {"2016", "FBX201600"},
                                  {"2014", "FBX201400"}, {"2013", "FBX201300"}};
constexpr int kVersionCount = int(sizeof kVersions / sizeof kVersions[0]);

// Rates for timecode mode None by the integer part of the rate.
void noneModeRates(int i_r, double i_rate, std::vector<double>& o_rRates) {
  switch (i_r) {
  case 24:
    o_rRates = {24};
    return;
  case 25:
    o_rRates = {25};
    return;
  case 30:
    o_rRates = {30};
    return;
  case 48:
    o_rRates = {24, 48};
    return;
  case 50:
    o_rRates = {25, 50};
    return;
  case 60:
    o_rRates = {30, 60};
    return;
  case 72:
    o_rRates = {24, 72};
    return;
  case 96:
    o_rRates = {24, 48, 96};
    return;
  default:
    break;
  }
  if (i_rate > 96.0 && i_r % 24 == 0) {
    o_rRates.push_back(24);
    // 96 goes with 48: a rate of 240 lists 24, 48 and 96.
    if (i_r % 48 == 0) o_rRates.push_back(48);
    if (i_r % 48 == 0) o_rRates.push_back(96);
  }
  if (i_rate > 120.0 && i_r % 30 == 0) {
    o_rRates.push_back(30);
    if (i_r % 60 == 0) o_rRates.push_back(60);
    if (i_r % 120 == 0) o_rRates.push_back(120);
  }
  if (i_rate > 100.0 && i_r % 25 == 0) {
    o_rRates.push_back(25);
    if (i_r % 50 == 0) o_rRates.push_back(50);
    if (i_r % 100 == 0) o_rRates.push_back(100);
  }
}
} // namespace

AnvilFbxExporter* AnvilFbxExporter::createInstance() {
  return new AnvilFbxExporter();
}

AnvilFbxExporter::AnvilFbxExporter()
    : FileExporter(false, "fbx", true), m_pManager(AnvilFbx::FbxManager::Create()) {}

AnvilFbxExporter::~AnvilFbxExporter() {
  m_pManager->Destroy();
}

bool AnvilFbxExporter::getOptions(void* o_pOptions) {
  std::memcpy(o_pOptions, &m_options, sizeof m_options);
  return true;
}

bool AnvilFbxExporter::setOptions(void* i_pOptions) {
  std::memcpy(&m_options, i_pOptions, sizeof m_options);
  return true;
}

bool AnvilFbxExporter::recognize(const HString& i_rFilename) {
  return extractExtension(i_rFilename) == "fbx";
}

std::vector<double> AnvilFbxExporter::getCompatibleFrameRates() {
  const HTimeManager* pTime = HTimeManager::getInstance();
  const double rate = pTime->getFrameRate();
  const int r = int(rate);
  std::vector<double> rates;
  switch (pTime->getTimecodeMode()) {
  case 0:
    rates = {30, 60, 120};
    break;
  case 1:
    rates = {30000.0 / 1001.0, 60000.0 / 1001.0};
    break;
  case 2:
    rates = {30000.0 / 1001.0};
    break;
  case 3:
    rates = {25, 50, 100};
    break;
  case 4:
    for (int film : {24, 48, 96, 120})
      if (r % film == 0) rates.push_back(film);
    break;
  case 5:
    rates = {24000.0 / 1001.0, 120000.0 / 1001.0};
    break;
  case 6:
    noneModeRates(r, rate, rates);
    break;
  default:
    break;
  }
  return rates;
}

uint64_t AnvilFbxExporter::getNumCompatibleFrameRates() {
  return getCompatibleFrameRates().size();
}

double AnvilFbxExporter::getCompatibleFrameRate(uint64_t i_index) {
  const std::vector<double> rates = getCompatibleFrameRates();
  return i_index < rates.size() ? rates[size_t(i_index)] : 0.0;
}

bool AnvilFbxExporter::setDesiredUpAxis(const HString& i_rAxis) {
  return SceneUpAxis::parse(i_rAxis, m_options.m_desiredUpAxis);
}

HString AnvilFbxExporter::getDesiredUpAxisAsString() const {
  return SceneUpAxis::text(m_options.m_desiredUpAxis);
}

bool AnvilFbxExporter::setNamespaceMode(const HString& i_rMode) {
  if (i_rMode == "none")
    m_options.m_namespaceMode = FbxExportOptions::ENamespaceNone;
  else if (i_rMode == "short")
    m_options.m_namespaceMode = FbxExportOptions::ENamespaceShort;
  else if (i_rMode == "full")
    m_options.m_namespaceMode = FbxExportOptions::ENamespaceFull;
  else if (i_rMode == "useName")
    m_options.m_namespaceMode = FbxExportOptions::ENamespaceUseName;
  else
    return false;
  return true;
}

HString AnvilFbxExporter::getNamespaceModeAsString() const {
  switch (m_options.m_namespaceMode) {
  case FbxExportOptions::ENamespaceFull:
    return "full";
  case FbxExportOptions::ENamespaceShort:
    return "short";
  case FbxExportOptions::ENamespaceNone:
    return "none";
  case FbxExportOptions::ENamespaceUseName:
    return "useName";
  }
  return HString();
}

void AnvilFbxExporter::setFBXVersion(const HString& i_rVersion) {
  for (int i = 0; i < kVersionCount; ++i)
    if (i_rVersion == kVersions[i].m_pText) {
      m_options.m_fbxVersion = EFBXVersion(i);
      return;
    }
  m_options.m_fbxVersion = FbxExportOptions::E2016;
}

HString AnvilFbxExporter::getFBXVersionAsString() const {
  const int v = int(m_options.m_fbxVersion);
  return v >= 0 && v < kVersionCount ? HString(kVersions[v].m_pText) : HString();
}

const char* AnvilFbxExporter::getFBXVersionString() const {
  const int v = int(m_options.m_fbxVersion);
  return v >= 0 && v < kVersionCount ? kVersions[v].m_pSdkString : kVersions[0].m_pSdkString;
}

void AnvilFbxExporter::loadUserSetup() {
  const HString& scope = HString::EMPTY_STRING;
  FbxExportOptions& o = m_options;
  auto flag = [&](const char* i_pKey, bool& io_rValue) {
    io_rValue = g_interface.getUserSetupInt(kSection, i_pKey, io_rValue ? 1 : 0, scope) != 0;
  };
  flag("CollapseSubjects", o.m_collapseSubjects);
  flag("ActiveClipOnly", o.m_exportActiveClipOnly);
  setDesiredUpAxis(g_interface.getUserSetupString(kSection, "DesiredUpAxis",
                                                  getDesiredUpAxisAsString().GetStr(), scope));
  flag("RotateToFacePositive", o.m_rotateToFacePositive);
  flag("ExportLabelingSetups", o.m_exportLabelingSetups);
  flag("UnrollAnimationCurves", o.m_unrollAnimationCurves);
  flag("ExportPlayRangeOnly", o.m_exportPlayRangeOnly);
  setNamespaceMode(g_interface.getUserSetupString(kSection, "NamespaceMode",
                                                  getNamespaceModeAsString().GetStr(), scope));
  flag("UnscaleRetargetingSubjects", o.m_unscaleRetargetingSubjects);
  const HString version = getFBXVersionAsString();
  if (!version.IsEmpty())
    setFBXVersion(g_interface.getUserSetupString(kSection, "Version", version.GetStr(), scope));
}

void AnvilFbxExporter::saveUserSetup() const {
  const HString& scope = HString::EMPTY_STRING;
  const FbxExportOptions& o = m_options;
  g_interface.setUserSetupInt(kSection, "CollapseSubjects", o.m_collapseSubjects, scope);
  g_interface.setUserSetupInt(kSection, "ActiveClipOnly", o.m_exportActiveClipOnly, scope);
  g_interface.setUserSetupString(kSection, "DesiredUpAxis", getDesiredUpAxisAsString(), scope);
  g_interface.setUserSetupInt(kSection, "RotateToFacePositive", o.m_rotateToFacePositive, scope);
  g_interface.setUserSetupInt(kSection, "ExportLabelingSetups", o.m_exportLabelingSetups, scope);
  g_interface.setUserSetupInt(kSection, "UnrollAnimationCurves", o.m_unrollAnimationCurves, scope);
  g_interface.setUserSetupInt(kSection, "ExportPlayRangeOnly", o.m_exportPlayRangeOnly, scope);
  g_interface.setUserSetupString(kSection, "NamespaceMode", getNamespaceModeAsString(), scope);
  g_interface.setUserSetupInt(kSection, "UnscaleRetargetingSubjects",
                              o.m_unscaleRetargetingSubjects, scope);
  g_interface.setUserSetupString(kSection, "Version", getFBXVersionAsString(), scope);
}

void AnvilFbxExporter::reset() {
  m_nodes.clear();
}
