#pragma once
#include "SubjectFileExporter.h"

/// Writes a subject's retargeting setup as a KMR file: the skeleton with the retargeting setup's
/// subspace.
class KmrExporter : public SubjectFileExporter {
public:
  static KmrExporter* createInstance();
  void deleteThis() override { delete this; }
  /// Fill each joint's bind pose from the bones' current pose, and name the retarget source
  /// subject "<character>_<current frame>".
  void setExportAsRetargetPose(bool i_value) { setExportAsRetargetPoseOption(i_value); }
  bool getExportAsRetargetPose() const { return getExportAsRetargetPoseOption(); }

private:
  KmrExporter();
  void fetchSubspace(Character& i_rCharacter, const AnvilSubjectCoreTypesConversion& i_rConversion,
                     CoreOstraTypes::VSubjectDynamicSubspace& o_rSubspace) override;
  void prepareRecords(Character& i_rCharacter, const AnvilSubjectCoreTypesConversion& i_rConversion,
                      CoreOstraTypes::VSubjectParametrised& io_rSubject,
                      CoreOstraTypes::VSubjectApplicationData& io_rApplication) override;
};
