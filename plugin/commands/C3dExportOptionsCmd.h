#pragma once
#include "plugin/host/Command.h"

/// `c3dExportOptions`: sets the C3D exporter's options on the live exporter. Options, in
/// identifier order: preserveGaps, collapseSubjects, real, writeTimeCode, writeUnlabeled,
/// removeLeadingUnderscore, decFormat, filterMin, filterMax (bool; toggle flips), minKeys,
/// maxKeys (integer, not negative), overrideHeaderRate (bool), headerRate (float, checked when
/// the exporter writes), upAxis (string: Scene, Y or Z).
class C3dExportOptionsCmd : public Command {
public:
  C3dExportOptionsCmd();
  /// False when there is no C3D exporter or a key count is negative (options before it stay
  /// applied). An unknown upAxis is logged and skipped; the result stays true.
  bool doCommand(const CommandArgList& i_rArgs) override;
};
