#pragma once
#include "plugin/host/Command.h"

/// `kmrExportOptions`: sets the KmrExporter's options on the live exporter: 0 version (string), 1
/// retargetPose (bool; toggle flips).
class KmrExportOptionsCmd : public Command {
public:
  KmrExportOptionsCmd();
  /// False when there is no kmr exporter ("Could not find KMF exporter." is logged).
  bool doCommand(const CommandArgList& i_rArgs) override;
};
