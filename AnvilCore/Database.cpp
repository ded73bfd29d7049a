#include "plugin/host/Database.h"
#include "SceneRotation.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Character.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/SubjectManager.h"
#include <cstdarg>
#include <cstdio>
#include <filesystem>
#include <unistd.h>

namespace {
Database s_database;

std::string vformat(const char* i_pFormat, va_list i_args) {
  va_list copy;
  va_copy(copy, i_args);
  const int size = std::vsnprintf(nullptr, 0, i_pFormat, copy);
  va_end(copy);
  if (size < 0) return i_pFormat;
  std::string text(static_cast<size_t>(size) + 1, '\0');
  std::vsnprintf(text.data(), text.size(), i_pFormat, i_args);
  text.resize(static_cast<size_t>(size));
  return text;
}

void defaultSink(HLogLevel i_level, const std::string& i_rText) {
  if (i_level == HLogLevel::EInfo) return;
  std::fprintf(stderr, "%s: %s\n", i_level == HLogLevel::EError ? "error" : "warning",
               i_rText.c_str());
}
} // namespace

Database* g_db = &s_database;

Database::Database()
    : m_pRoot(std::make_unique<Module>("Scene")),
      m_pExporterMgr(std::make_unique<FileExporterMgr>()),
      m_pTimeManager(std::make_unique<HTimeManager>()),
      m_pSubjectManager(std::make_unique<SubjectManager>()),
      m_pCalibrationMgr(std::make_unique<CalibrationMgr>()), m_logSink(defaultSink) {}

Database::~Database() {
  clearClips();
}

FileExporterMgr* Database::getFileExporterMgr() {
  return m_pExporterMgr.get();
}
HTimeManager* Database::getTimeManager() {
  return m_pTimeManager.get();
}
SubjectManager* Database::getSubjectManager() {
  return m_pSubjectManager.get();
}
CalibrationMgr* Database::getCalibrationMgr() {
  return m_pCalibrationMgr.get();
}

HString Database::getScratchPath() const {
  std::error_code ec;
  std::filesystem::path dir = std::filesystem::temp_directory_path(ec);
  if (ec) dir = "/tmp";
  dir /= "anvil-scratch-" + std::to_string(::getpid());
  std::filesystem::create_directories(dir, ec);
  return HString(dir.string());
}

void Database::rotateScene(double i_degrees, int i_axis) {
  if (i_axis < 0 || i_axis > 2 || i_degrees == 0.0) return;
  // Undoing the last rotation removes it, so the scene comes back exactly as it was.
  if (!m_rotations.empty() && m_rotations.back().axis == i_axis &&
      m_rotations.back().degrees == -i_degrees) {
    m_rotations.pop_back();
  } else {
    m_rotations.push_back({i_degrees, i_axis});
  }
  recomputeSceneMatrix();
}

void Database::recomputeSceneMatrix() {
  double m[9] = {1, 0, 0, 0, 1, 0, 0, 0, 1};
  for (const Rotation& r : m_rotations) {
    double a[9], product[9];
    AnvilCoreImpl::axisRotationMatrix(r.degrees, r.axis, a);
    for (int i = 0; i < 3; ++i)
      for (int j = 0; j < 3; ++j)
        product[i * 3 + j] = a[i * 3] * m[j] + a[i * 3 + 1] * m[3 + j] + a[i * 3 + 2] * m[6 + j];
    std::copy(product, product + 9, m);
  }
  std::copy(m, m + 9, m_sceneMatrix);
}

void Database::addToScene(Module* i_pModule, bool, const Character* i_pCharacter, bool, bool) {
  addChild(i_pCharacter ? const_cast<Character*>(i_pCharacter) : m_pRoot.get(), i_pModule);
}

void Database::addChild(Module* i_pParent, Module* i_pChild) {
  if (!i_pChild) return;
  (i_pParent ? i_pParent : m_pRoot.get())->addChild(i_pChild);
  invalidate();
}

void Database::removeFromScene(Module* i_pModule, bool, bool, bool) {
  if (!i_pModule || !i_pModule->getParent()) return;
  delete i_pModule->getParent()->detachChild(i_pModule);
  invalidate();
}

void Database::clearScene() {
  m_pRoot = std::make_unique<Module>("Scene");
  clearClips();
  m_rotations.clear();
  recomputeSceneMatrix();
  m_zUp = true;
  m_sceneName = HString();
  *m_pCalibrationMgr = CalibrationMgr();
  invalidate();
}

void Database::rebuildCache() const {
  if (m_cacheValid) return;
  m_modules.clear();
  m_nodes.clear();
  m_opticalCameras.clear();
  for (int i = 0; i < m_pRoot->getNumChildren(); ++i)
    m_pRoot->getChild(i)->collect(m_modules);
  for (Module* p : m_modules) {
    if (p->isKindOf(&Node::s_classNode)) m_nodes.push_back(static_cast<Node*>(p));
    if (p->isKindOf(&OpticalCamera::s_classOpticalCamera))
      m_opticalCameras.push_back(static_cast<OpticalCamera*>(p));
  }
  m_cacheValid = true;
}

const std::vector<Module*>& Database::getModules() const {
  rebuildCache();
  return m_modules;
}

int Database::getNumNodes() const {
  rebuildCache();
  return static_cast<int>(m_nodes.size());
}

Node* Database::getNode(int i_index) const {
  rebuildCache();
  return (i_index >= 0 && size_t(i_index) < m_nodes.size()) ? m_nodes[size_t(i_index)] : nullptr;
}

int Database::getNumOpticalCameras() const {
  rebuildCache();
  return static_cast<int>(m_opticalCameras.size());
}

OpticalCamera* Database::getOpticalCamera(int i_index) const {
  rebuildCache();
  return (i_index >= 0 && size_t(i_index) < m_opticalCameras.size())
             ? m_opticalCameras[size_t(i_index)]
             : nullptr;
}

TSimpleArray<Module*> Database::getModulesWithName(const HString& i_rName,
                                                   const HRuntimeClass* i_pClass) const {
  TSimpleArray<Module*> result;
  for (Module* p : getModules())
    if (p->getName() == i_rName && (!i_pClass || p->isKindOf(i_pClass))) result.add(p);
  return result;
}

void Database::log(HLogLevel i_level, const std::string& i_rText) {
  if (m_logSink) m_logSink(i_level, i_rText);
}

#define ANVIL_LOG_BODY(level)                                                                      \
  va_list args;                                                                                    \
  va_start(args, i_pFormat);                                                                       \
  const std::string text = vformat(i_pFormat, args);                                               \
  va_end(args);                                                                                    \
  log(level, text);

void Database::logInfo(const char* i_pFormat, ...) {
  ANVIL_LOG_BODY(HLogLevel::EInfo)
}
void Database::logWarning(const char* i_pFormat, ...) {
  ANVIL_LOG_BODY(HLogLevel::EWarning)
}
void Database::logError(const char* i_pFormat, ...) {
  ANVIL_LOG_BODY(HLogLevel::EError)
}
