#pragma once
#include "plugin/host/FileExporter.h"

/// Writes the scene's optical cameras as an "Extended Camera Parameter File": one `Camera`
/// element per camera number, sorted by it, with sensor, threshold grid, calibration records
/// and the calibration as key frame 0. Reads the cameras from the database, not from the module
/// list, and writes the file by path rather than through the base's stream. No options.
class XCPExporter : public FileExporter {
public:
  static XCPExporter* createInstance();
  void deleteThis() override { delete this; }

  int getDataType() override { return 192; }
  HString getDescription() override { return "Extended Camera Parameter File"; }
  bool recognize(const HString& i_rFilename) override;
  /// False when the file cannot be written; nothing is logged.
  bool write() override;

private:
  XCPExporter();
};
