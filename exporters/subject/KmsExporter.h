#pragma once
#include "SubjectFileExporter.h"

/// Writes a subject's solving setup as a KMS file, with the solving setup's subspace. A prop is
/// written after a warning.
class KmsExporter : public SubjectFileExporter {
public:
  static KmsExporter* createInstance();
  void deleteThis() override { delete this; }
  /// Fill each joint's bind pose from the bones' current pose.
  void setExportAsRetargetPose(bool i_value) { setExportAsRetargetPoseOption(i_value); }
  bool getExportAsRetargetPose() const { return getExportAsRetargetPoseOption(); }

private:
  KmsExporter();
  void fetchSubspace(Character& i_rCharacter, const AnvilSubjectCoreTypesConversion& i_rConversion,
                     CoreOstraTypes::VSubjectDynamicSubspace& o_rSubspace) override;
  void prepareRecords(Character& i_rCharacter, const AnvilSubjectCoreTypesConversion& i_rConversion,
                      CoreOstraTypes::VSubjectParametrised& io_rSubject,
                      CoreOstraTypes::VSubjectApplicationData& io_rApplication) override;
  void checkCharacter(const Character& i_rCharacter) override;
};
