#pragma once
#include "SubjectFileExporter.h"

/// Writes a subject's labeling setup as a KMF file: skeleton, markers, targets and the setup's
/// subspace.
class KmfExporter : public SubjectFileExporter {
public:
  static KmfExporter* createInstance();
  void deleteThis() override { delete this; }

private:
  KmfExporter();
  void fetchSubspace(Character& i_rCharacter, const AnvilSubjectCoreTypesConversion& i_rConversion,
                     CoreOstraTypes::VSubjectDynamicSubspace& o_rSubspace) override;
};
