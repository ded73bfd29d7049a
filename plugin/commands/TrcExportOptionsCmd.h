#pragma once
#include "plugin/host/Command.h"

/// `trcExportOptions`: sets the TRC exporter's four flags on the live exporter.
/// Options: 0 writeSubjectNames, 1 removeLeadingUnderscore, 2 writeUnlabeled, 3 collapseSubjects
/// (all bool; toggle flips).
class TrcExportOptionsCmd : public Command {
public:
  TrcExportOptionsCmd();
  /// False when there is no TRC exporter ("Could not find TRC exporter." is logged).
  bool doCommand(const CommandArgList& i_rArgs) override;
};
