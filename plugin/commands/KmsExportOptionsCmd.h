#pragma once
#include "plugin/host/Command.h"

/// `kmsExportOptions`: sets the KmsExporter's options on the live exporter: 0 version (string), 1
/// retargetPose (bool; toggle flips).
class KmsExportOptionsCmd : public Command {
public:
  KmsExportOptionsCmd();
  /// False when there is no kms exporter ("Could not find KMF exporter." is logged).
  bool doCommand(const CommandArgList& i_rArgs) override;
};
