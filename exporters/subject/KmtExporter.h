#pragma once
#include "SubjectFileExporter.h"

/// Writes a subject's labeling setup as a KMT template: as a KMF, without a subspace.
class KmtExporter : public SubjectFileExporter {
public:
  static KmtExporter* createInstance();
  void deleteThis() override { delete this; }

private:
  KmtExporter();
};
