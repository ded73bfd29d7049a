#pragma once
#include "fbx/FbxKeyStore.h"
#include "plugin/host/AnvilRotation.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/Vec3.h"
#include <cstdint>
#include <map>
#include <memory>
#include <set>
#include <vector>

namespace AnvilFbx {
class FbxAnimLayer;
class FbxManager;
class FbxNode;
class FbxScene;
} // namespace AnvilFbx
class Module;
class NLEClip;
class Node;

/// The FBX exporter's options, copied whole by `getOptions` and `setOptions`.
struct FbxExportOptions {
  enum EUpAxis : int32_t { EUpAxisScene = 0, EUpAxisY = 1, EUpAxisZ = 2 };
  enum ENamespaceMode : int32_t {
    ENamespaceFull = 0,
    ENamespaceShort = 1,
    ENamespaceNone = 2,
    ENamespaceUseName = 3
  };
  enum EFBXVersion : int32_t { E2020 = 0, E2019, E2018, E2016, E2014, E2013 };

  bool m_collapseSubjects = false;
  bool m_exportActiveClipOnly = true;
  EUpAxis m_desiredUpAxis = EUpAxisScene;
  bool m_rotateToFacePositive = true;
  bool m_exportLabelingSetups = false;
  bool m_unrollAnimationCurves = false;
  bool m_exportPlayRangeOnly = false;
  ENamespaceMode m_namespaceMode = ENamespaceShort;
  bool m_unscaleRetargetingSubjects = true;
  EFBXVersion m_fbxVersion = E2020;
};

/// Writes the scene (subjects, skeletons, markers, cameras, lights) with its animation as a
/// binary FBX file through the FBX layer, into the stream the host opened.
class AnvilFbxExporter : public FileExporter {
public:
  using EUpAxis = FbxExportOptions::EUpAxis;
  using ENamespaceMode = FbxExportOptions::ENamespaceMode;
  using EFBXVersion = FbxExportOptions::EFBXVersion;

  static AnvilFbxExporter* createInstance();
  void deleteThis() override { delete this; }
  ~AnvilFbxExporter() override;

  bool getOptions(void* o_pOptions) override;
  bool setOptions(void* i_pOptions) override;
  uint64_t getNumCompatibleFrameRates() override;
  double getCompatibleFrameRate(uint64_t i_index) override;
  /// The rates FBX can carry for the clock's timecode mode and rate.
  std::vector<double> getCompatibleFrameRates();
  int getDataType() override { return 13; }
  HString getDescription() override { return "FBX Motion"; }
  bool recognize(const HString& i_rFilename) override;
  bool hasEditableOptions() override { return true; }
  void loadUserSetup() override;
  void saveUserSetup() const override;
  /// Forgets the map of FBX nodes.
  void reset() override;
  bool write() override;

  bool getCollapseSubjects() const { return m_options.m_collapseSubjects; }
  void setCollapseSubjects(bool i_value) { m_options.m_collapseSubjects = i_value; }
  bool getExportActiveClipOnly() const { return m_options.m_exportActiveClipOnly; }
  void setExportActiveClipOnly(bool i_value) { m_options.m_exportActiveClipOnly = i_value; }
  EUpAxis getDesiredUpAxis() const { return m_options.m_desiredUpAxis; }
  void setDesiredUpAxis(EUpAxis i_axis) { m_options.m_desiredUpAxis = i_axis; }
  /// "scene", "y" or "z" after lower-casing; false for any other text.
  bool setDesiredUpAxis(const HString& i_rAxis);
  HString getDesiredUpAxisAsString() const;
  bool getRotateToFacePostive() const { return m_options.m_rotateToFacePositive; }
  void setRotateToFacePostive(bool i_value) { m_options.m_rotateToFacePositive = i_value; }
  bool getExportLabelingSetups() const { return m_options.m_exportLabelingSetups; }
  void setExportLabelingSetups(bool i_value) { m_options.m_exportLabelingSetups = i_value; }
  bool getUnrollAnimationCurves() const { return m_options.m_unrollAnimationCurves; }
  void setUnrollAnimationCurves(bool i_value) { m_options.m_unrollAnimationCurves = i_value; }
  bool getExportPlayRangeOnly() const { return m_options.m_exportPlayRangeOnly; }
  void setExportPlayRangeOnly(bool i_value) { m_options.m_exportPlayRangeOnly = i_value; }
  ENamespaceMode getNamespaceMode() const { return m_options.m_namespaceMode; }
  void setNamespaceMode(ENamespaceMode i_mode) { m_options.m_namespaceMode = i_mode; }
  /// "none", "short", "full" or "useName", exactly; false (field kept) for any other text.
  bool setNamespaceMode(const HString& i_rMode);
  HString getNamespaceModeAsString() const;
  bool getUnscaleRetargetingSubjects() const { return m_options.m_unscaleRetargetingSubjects; }
  void setUnscaleRetargetingSubjects(bool i_value) {
    m_options.m_unscaleRetargetingSubjects = i_value;
  }
  EFBXVersion getFBXVersion() const { return m_options.m_fbxVersion; }
  void setFBXVersion(EFBXVersion i_version) { m_options.m_fbxVersion = i_version; }
  /// "2020" ... "2013"; any other text selects 2016.
  void setFBXVersion(const HString& i_rVersion);
  /// The version's text; empty for a value outside the table.
  HString getFBXVersionAsString() const;
  /// The layer's version string ("FBX202000", ...); "FBX202000" for a value outside the table.
  const char* getFBXVersionString() const;

private:
  AnvilFbxExporter();

  // Scene road (AnvilFbxExporterScene.cpp).
  bool setUpScene();
  bool setTimeMode();
  void rotateHostScene(bool i_undo);
  AnvilFbx::FbxAnimLayer* createTake(const NLEClip* i_pClip);
  bool exportRoots(AnvilFbx::FbxAnimLayer* i_pLayer, const NLEClip* i_pClip, bool i_namespaced);
  bool save();

  // Node road (AnvilFbxExporterNodes.cpp).
  struct Pass {
    AnvilFbx::FbxAnimLayer* m_pLayer;
    const NLEClip* m_pClip;
  };
  bool exportNode(const Pass& i_rPass, Node* i_pNode, AnvilFbx::FbxNode* i_pParent,
                  HString& io_rNamespace);
  bool exportChildren(const Pass& i_rPass, Node* i_pNode, AnvilFbx::FbxNode* i_pParent,
                      HString& io_rNamespace);
  HString nodeName(const Node* i_pNode) const;
  void warnNameCollisions(const Node* i_pNode) const;
  AnvilFbx::FbxNode* createFbxNode(Node* i_pNode, const HString& i_rName);
  AnvilFbx::FbxNode* createActor(HString& io_rNamespace);
  void setUpNode(const Pass& i_rPass, AnvilFbx::FbxNode* i_pFbx, Node* i_pHost,
                 AnvilFbx::FbxNode* i_pParent);
  void writeCurves(const Pass& i_rPass, AnvilFbx::FbxNode* i_pFbx, Node* i_pHost);
  bool isHidden(const Module* i_pModule) const;
  bool keepKey(int64_t i_time) const;

  AnvilFbx::FbxManager* m_pManager = nullptr;
  AnvilFbx::FbxScene* m_pScene = nullptr;
  FbxExportOptions m_options;
  std::map<Node*, AnvilFbx::FbxNode*> m_nodes;

  // For one write: the host node behind each FBX node (null for actors and the root), the
  // modules hidden from the export, the sample step and the take's range.
  std::map<const AnvilFbx::FbxNode*, Node*> m_hostOf;
  std::set<const Module*> m_hidden;
  int64_t m_sampleStep = 1;
  int64_t m_rangeStart = 0, m_rangeEnd = 0;
  bool m_rangeOnly = false;
  int m_rootsExported = 0;
  // The kept keys of the last track written and their FBX times, for the take it was written
  // to: the next track with the same key times (every marker of a take, as a rule) shares them.
  struct KeyTimes {
    const AnvilFbx::FbxAnimLayer* m_pLayer = nullptr;
    std::vector<int64_t> m_hostTimes;
    std::vector<int> m_kept;
    std::shared_ptr<AnvilFbx::FbxKeyTimes> m_pFbxTimes;
  };
  KeyTimes m_lastKeyTimes;
};
