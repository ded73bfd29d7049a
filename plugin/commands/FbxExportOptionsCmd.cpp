#include "FbxExportOptionsCmd.h"
#include "ExportOptionsCommand.h"
#include "exporters/scene/AnvilFbxExporter.h"

using namespace ExportOptionsCommand;

namespace {
enum EFbxOption : uint64_t {
  ECollapseSubjects,
  EExportActiveClipOnly,
  EUpAxis,
  ERotateToFacePositive,
  EExportLabelingSetups,
  ENamespaceMode,
  EUnrollAnimationCurves,
  EExportPlayRangeOnly,
  EUnscaleRetargeting,
  EVersion,
};

struct BoolField {
  bool (AnvilFbxExporter::*m_get)() const;
  void (AnvilFbxExporter::*m_set)(bool);
};

const BoolField* boolField(uint64_t i_id) {
  static const BoolField kCollapse = {&AnvilFbxExporter::getCollapseSubjects,
                                      &AnvilFbxExporter::setCollapseSubjects};
  static const BoolField kActiveClip = {&AnvilFbxExporter::getExportActiveClipOnly,
                                        &AnvilFbxExporter::setExportActiveClipOnly};
  static const BoolField kFace = {&AnvilFbxExporter::getRotateToFacePostive,
                                  &AnvilFbxExporter::setRotateToFacePostive};
  static const BoolField kLabeling = {&AnvilFbxExporter::getExportLabelingSetups,
                                      &AnvilFbxExporter::setExportLabelingSetups};
  static const BoolField kUnroll = {&AnvilFbxExporter::getUnrollAnimationCurves,
                                    &AnvilFbxExporter::setUnrollAnimationCurves};
  static const BoolField kPlayRange = {&AnvilFbxExporter::getExportPlayRangeOnly,
                                       &AnvilFbxExporter::setExportPlayRangeOnly};
  static const BoolField kUnscale = {&AnvilFbxExporter::getUnscaleRetargetingSubjects,
                                     &AnvilFbxExporter::setUnscaleRetargetingSubjects};
  switch (i_id) {
  case ECollapseSubjects:
    return &kCollapse;
  case EExportActiveClipOnly:
    return &kActiveClip;
  case ERotateToFacePositive:
    return &kFace;
  case EExportLabelingSetups:
    return &kLabeling;
  case EUnrollAnimationCurves:
    return &kUnroll;
  case EExportPlayRangeOnly:
    return &kPlayRange;
  case EUnscaleRetargeting:
    return &kUnscale;
  default:
    return nullptr;
  }
}

bool applyOption(AnvilFbxExporter& io_rExporter, uint64_t i_id, const Variable& i_rValue) {
  if (const BoolField* pField = boolField(i_id)) {
    (io_rExporter.*pField->m_set)(boolValue(i_rValue, (io_rExporter.*pField->m_get)()));
    return true;
  }
  int axis = 0;
  switch (i_id) {
  case EUpAxis:
    if (upAxisValue(i_rValue, axis)) io_rExporter.setDesiredUpAxis(AnvilFbxExporter::EUpAxis(axis));
    break;
  case ENamespaceMode: {
    // Lower-cased here, unlike the exporter's own setter; unknown texts are ignored.
    HString mode = i_rValue.getStringValue(-1);
    mode.MakeLower();
    if (mode == "full")
      io_rExporter.setNamespaceMode(FbxExportOptions::ENamespaceFull);
    else if (mode == "short")
      io_rExporter.setNamespaceMode(FbxExportOptions::ENamespaceShort);
    else if (mode == "none")
      io_rExporter.setNamespaceMode(FbxExportOptions::ENamespaceNone);
    else if (mode == "usename")
      io_rExporter.setNamespaceMode(FbxExportOptions::ENamespaceUseName);
    break;
  }
  case EVersion: {
    // Compared as given; unknown texts are ignored.
    static const char* const kTexts[] = {"2020", "2019", "2018", "2016", "2014", "2013"};
    const HString version = i_rValue.getStringValue(-1);
    for (int i = 0; i < 6; ++i)
      if (version == kTexts[i]) io_rExporter.setFBXVersion(AnvilFbxExporter::EFBXVersion(i));
    break;
  }
  default:
    break;
  }
  return true;
}
} // namespace

FbxExportOptionsCmd::FbxExportOptionsCmd()
    : Command("fbxExportOptions", "Set Fbx Export Options", "") {
  declareOptions(*this, {{"collapseSubjects", Variable::EBool},
                         {"exportActiveClipOnly", Variable::EBool},
                         {"upAxis", Variable::EString},
                         {"rotateToFacePositive", Variable::EBool},
                         {"exportLabelingSetups", Variable::EBool},
                         {"namespaceMode", Variable::EString},
                         {"unrollAnimationCurves", Variable::EBool},
                         {"exportPlayRangeOnly", Variable::EBool},
                         {"unscaleRetargeting", Variable::EBool},
                         {"version", Variable::EString}});
}

bool FbxExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return applyOptions<AnvilFbxExporter>(i_rArgs, ".fbx", "Could not find FBX exporter.",
                                        applyOption);
}
