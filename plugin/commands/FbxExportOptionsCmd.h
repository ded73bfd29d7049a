#pragma once
#include "plugin/host/Command.h"

/// `fbxExportOptions`: sets the FBX exporter's options on the live exporter.
/// Options: 0 collapseSubjects, 1 exportActiveClipOnly, 2 upAxis, 3 rotateToFacePositive,
/// 4 exportLabelingSetups, 5 namespaceMode, 6 unrollAnimationCurves, 7 exportPlayRangeOnly,
/// 8 unscaleRetargeting (bools; toggle flips), 9 version ("2020" ... "2013").
class FbxExportOptionsCmd : public Command {
public:
  FbxExportOptionsCmd();
  /// False when there is no FBX exporter ("Could not find FBX exporter." is logged).
  bool doCommand(const CommandArgList& i_rArgs) override;
};
