#pragma once
#include "plugin/host/Command.h"

/// `usdExportOptions`: sets the USD exporter's options on the live exporter.
/// Options: 0 upAxis (string), 1 rotateToFacePositive (bool), 2 unscaleRetargeting (bool).
class UsdExportOptionsCmd : public Command {
public:
  UsdExportOptionsCmd();
  /// False when there is no USD exporter ("Could not find USD exporter." is logged).
  bool doCommand(const CommandArgList& i_rArgs) override;
};
