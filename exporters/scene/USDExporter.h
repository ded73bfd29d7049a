#pragma once
#include "plugin/host/FileExporter.h"
#include <cstdint>
#include <memory>

namespace AnvilUsd {
class VStage;
}
class Character;

/// The options block of the USD exporter, copied whole by `getOptions` and `setOptions`.
struct UsdExportOptions {
  enum EUpAxis : int32_t { EUpAxisScene = 0, EUpAxisY = 1, EUpAxisZ = 2 };
  EUpAxis m_desiredUpAxis = EUpAxisScene;
  bool m_rotateToFacePositive = true;
  bool m_unscaleRetargetingSubjects = true;
};
static_assert(sizeof(UsdExportOptions) == 8);

/// Writes every subject of the scene as a skeleton with one animation child on a USD stage. It
/// asks the subject manager for the subjects and ignores the module list.
class USDExporter : public FileExporter {
public:
  using EUpAxis = UsdExportOptions::EUpAxis;

  static USDExporter* createInstance();
  void deleteThis() override { delete this; }
  ~USDExporter() override;

  bool getOptions(void* o_pOptions) override;
  bool setOptions(void* i_pOptions) override;
  int getDataType() override { return 13; }
  HString getDescription() override { return "Pixar USD"; }
  bool recognize(const HString& i_rFilename) override;
  bool hasEditableOptions() override { return true; }
  void loadUserSetup() override;
  void saveUserSetup() const override;
  void reset() override {}
  bool write() override;

  EUpAxis getDesiredUpAxis() const { return m_options.m_desiredUpAxis; }
  void setDesiredUpAxis(EUpAxis i_axis) { m_options.m_desiredUpAxis = i_axis; }
  /// "scene", "y" or "z" in any case; false for another text, which changes nothing.
  bool setDesiredUpAxis(const HString& i_rAxis);
  /// "Scene", "Y" or "Z"; empty for an unknown value.
  HString getDesiredUpAxisAsString() const;
  bool getRotateToFacePostive() const { return m_options.m_rotateToFacePositive; }
  void setRotateToFacePostive(bool i_value) { m_options.m_rotateToFacePositive = i_value; }
  bool getUnscaleRetargetingSubjects() const { return m_options.m_unscaleRetargetingSubjects; }
  void setUnscaleRetargetingSubjects(bool i_value) {
    m_options.m_unscaleRetargetingSubjects = i_value;
  }

private:
  USDExporter();
  bool writeStage(const HString& i_rPath);
  bool writeSubject(Character& i_rSubject, const std::string& i_rSkeletonPath);

  UsdExportOptions m_options;
  std::unique_ptr<AnvilUsd::VStage> m_pStage;
};
