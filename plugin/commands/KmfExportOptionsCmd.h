#pragma once
#include "plugin/host/Command.h"

/// `kmfExportOptions`: sets the KmfExporter's options on the live exporter: 0 version (string).
class KmfExportOptionsCmd : public Command {
public:
  KmfExportOptionsCmd();
  /// False when there is no kmf exporter ("Could not find KMF exporter." is logged).
  bool doCommand(const CommandArgList& i_rArgs) override;
};
