#pragma once
#include "plugin/host/Command.h"

/// `kmtExportOptions`: sets the KmtExporter's options on the live exporter: 0 version (string).
class KmtExportOptionsCmd : public Command {
public:
  KmtExportOptionsCmd();
  /// False when there is no kmt exporter ("Could not find KMF exporter." is logged).
  bool doCommand(const CommandArgList& i_rArgs) override;
};
