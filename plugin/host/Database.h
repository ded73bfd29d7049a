#pragma once
#include "HString.h"
#include "HTime.h"
#include "HostExport.h"
#include "TSimpleArray.h"
#include <functional>
#include <memory>
#include <string>
#include <vector>

class CalibrationMgr;
class Character;
class FileExporterMgr;
class HTimeManager;
class LabelingBone;
class LabelingCluster;
class LabelingConstraint;
class Module;
class NLEClip;
class Node;
class OpticalCamera;
class SubjectManager;
struct HRuntimeClass;

/// Severity of a message of the host's log.
enum class HLogLevel { EInfo, EWarning, EError };

/// The scene and the host's services. Reached through `g_db`.
class ANVIL_HOST_API Database {
public:
  Database();
  ~Database();
  Database(const Database&) = delete;
  Database& operator=(const Database&) = delete;

  FileExporterMgr* getFileExporterMgr();
  HTimeManager* getTimeManager();
  SubjectManager* getSubjectManager();
  CalibrationMgr* getCalibrationMgr();

  HString getSceneName() const { return m_sceneName; }
  void setSceneName(const HString& i_rName) { m_sceneName = i_rName; }
  /// A folder for temporary files of this process.
  HString getScratchPath() const;

  bool isZUp() const { return m_zUp; }
  void setZUp(bool i_zUp) { m_zUp = i_zUp; }
  /// Rotates the whole scene about the world origin by `i_degrees` about axis 0 (X), 1 (Y) or
  /// 2 (Z). The scene data are untouched: world queries apply the rotation. A rotation followed
  /// by its opposite restores the scene exactly, and quarter turns are exact.
  void rotateScene(double i_degrees, int i_axis);
  /// Row-major 3 by 3 matrix of the scene rotation now in force; identity when none.
  const double* getSceneRotation() const { return m_sceneMatrix; }
  bool isSceneRotated() const { return !m_rotations.empty(); }

  /// Adds a module to the scene under `i_pCharacter`, or at the top when it is null. The
  /// database takes ownership. The flags are the host's and ignored here.
  void addToScene(Module* i_pModule, bool i_select, const Character* i_pCharacter, bool i_notify,
                  bool i_undoable);
  /// Removes and destroys a module and its descendants.
  void removeFromScene(Module* i_pModule, bool i_notify, bool i_undoable, bool i_keepChildren);
  /// Host side: adds a module under any parent module of the scene.
  void addChild(Module* i_pParent, Module* i_pChild);
  /// Removes everything from the scene.
  void clearScene();
  /// The invisible root; its children are the top-level modules.
  Module* getRoot() const { return m_pRoot.get(); }

  /// The clip that playback and exports work on, or null.
  NLEClip* getActiveClip() const { return m_pActiveClip; }
  /// Makes a clip of the list active; null, or a clip not in the list, leaves none active. The
  /// flags are the host's and ignored here.
  void setActiveClip(const NLEClip* i_pClip, bool i_notify, bool i_undoable, bool i_update);
  /// First clip of the list (follow `NLEClip::getNext`), or null.
  NLEClip* getHeadClip() const { return m_pHeadClip; }
  /// Host side: appends a clip to the list; the database owns it.
  void addClip(NLEClip* i_pClip);
  /// Host side: destroys every clip.
  void clearClips();

  /// Every node of the scene, parents before children.
  int getNumNodes() const;
  Node* getNode(int i_index) const;
  /// Every optical camera of the scene, in scene order; null for an index out of range.
  int getNumOpticalCameras() const;
  OpticalCamera* getOpticalCamera(int i_index) const;
  /// Every labeling bone, constraint and cluster of the scene, in scene order; null for an index
  /// out of range.
  int getNumLabelingBones() const;
  LabelingBone* getLabelingBone(int i_index) const;
  int getNumLabelingConstraints() const;
  LabelingConstraint* getLabelingConstraint(int i_index) const;
  int getNumLabelingClusters() const;
  LabelingCluster* getLabelingCluster(int i_index) const;
  /// Every module of the scene, parents before children.
  const std::vector<Module*>& getModules() const;
  TSimpleArray<Module*> getModulesWithName(const HString& i_rName,
                                           const HRuntimeClass* i_pClass) const;

  void logInfo(const char* i_pFormat, ...) __attribute__((format(printf, 2, 3)));
  void logWarning(const char* i_pFormat, ...) __attribute__((format(printf, 2, 3)));
  void logError(const char* i_pFormat, ...) __attribute__((format(printf, 2, 3)));
  /// Host side: where log lines go (default: stderr, info lines only when verbose).
  using LogSink = std::function<void(HLogLevel, const std::string&)>;
  void setLogSink(LogSink i_sink) { m_logSink = std::move(i_sink); }
  void log(HLogLevel i_level, const std::string& i_rText);

private:
  void invalidate() { m_cacheValid = false; }
  void rebuildCache() const;
  void recomputeSceneMatrix();

  std::unique_ptr<Module> m_pRoot;
  std::unique_ptr<FileExporterMgr> m_pExporterMgr;
  std::unique_ptr<HTimeManager> m_pTimeManager;
  std::unique_ptr<SubjectManager> m_pSubjectManager;
  std::unique_ptr<CalibrationMgr> m_pCalibrationMgr;
  HString m_sceneName;
  bool m_zUp = true;
  struct Rotation {
    double degrees;
    int axis;
  };
  std::vector<Rotation> m_rotations;
  double m_sceneMatrix[9] = {1, 0, 0, 0, 1, 0, 0, 0, 1};
  LogSink m_logSink;
  NLEClip* m_pHeadClip = nullptr;
  NLEClip* m_pActiveClip = nullptr;
  mutable bool m_cacheValid = false;
  mutable std::vector<Module*> m_modules;
  mutable std::vector<Node*> m_nodes;
  mutable std::vector<OpticalCamera*> m_opticalCameras;
};

extern ANVIL_HOST_API Database* g_db;
