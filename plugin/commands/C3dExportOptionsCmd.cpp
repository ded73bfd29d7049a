#include "C3dExportOptionsCmd.h"
#include "ExportOptionsCommand.h"
#include "exporters/trajectory/C3DExporter.h"

using namespace ExportOptionsCommand;

namespace {
enum EC3dOption : uint64_t {
  EPreserveGaps,
  ECollapseSubjects,
  EReal,
  EWriteTimeCode,
  EWriteUnlabeled,
  ERemoveLeadingUnderscore,
  EDecFormat,
  EFilterMin,
  EFilterMax,
  EMinKeys,
  EMaxKeys,
  EOverrideHeaderRate,
  EHeaderRate,
  EUpAxis,
};

// A bool option: the exporter's getter and setter.
struct BoolField {
  bool (C3DExporter::*m_get)() const;
  void (C3DExporter::*m_set)(bool);
};

const BoolField* boolField(uint64_t i_id) {
  static const BoolField fields[] = {
      {&C3DExporter::getPreserveGaps, &C3DExporter::setPreserveGaps},
      {&C3DExporter::getCollapseToSubjects, &C3DExporter::setCollapseToSubjects},
      {&C3DExporter::getRealFormat, &C3DExporter::setRealFormat},
      {&C3DExporter::getWriteTimeCode, &C3DExporter::setWriteTimeCode},
      {&C3DExporter::getWriteUnlabelled, &C3DExporter::setWriteUnlabelled},
      {&C3DExporter::getRemoveLeadingUnderscores, &C3DExporter::setRemoveLeadingUnderscores},
      {&C3DExporter::getDecFormat, &C3DExporter::setDecFormat},
      {&C3DExporter::getFilterMinKeys, &C3DExporter::setFilterMinKeys},
      {&C3DExporter::getFilterMaxKeys, &C3DExporter::setFilterMaxKeys},
  };
  if (i_id <= EFilterMax) return &fields[i_id];
  static const BoolField overrideRate = {&C3DExporter::getOverrideHeaderRate,
                                         &C3DExporter::setOverrideHeaderRate};
  return i_id == EOverrideHeaderRate ? &overrideRate : nullptr;
}

bool applyOption(C3DExporter& io_rExporter, uint64_t i_id, const Variable& i_rValue) {
  if (const BoolField* pField = boolField(i_id)) {
    (io_rExporter.*pField->m_set)(boolValue(i_rValue, (io_rExporter.*pField->m_get)()));
    return true;
  }
  int count = 0;
  int axis = 0;
  switch (i_id) {
  case EMinKeys:
    if (!keyCountValue(i_rValue, "minKeys", count)) return false;
    io_rExporter.setMinKeys(count);
    break;
  case EMaxKeys:
    if (!keyCountValue(i_rValue, "maxKeys", count)) return false;
    io_rExporter.setMaxKeys(count);
    break;
  case EHeaderRate:
    io_rExporter.setHeaderRate(rateValue(i_rValue));
    break;
  case EUpAxis:
    if (upAxisValue(i_rValue, axis)) io_rExporter.setDesiredUpAxis(C3DExporter::EUpAxis(axis));
    break;
  default:
    break;
  }
  return true;
}
} // namespace

C3dExportOptionsCmd::C3dExportOptionsCmd()
    : Command("c3dExportOptions", "Set C3D Export Options", "") {
  declareOptions(*this, {{"preserveGaps", Variable::EBool},
                         {"collapseSubjects", Variable::EBool},
                         {"real", Variable::EBool},
                         {"writeTimeCode", Variable::EBool},
                         {"writeUnlabeled", Variable::EBool},
                         {"removeLeadingUnderscore", Variable::EBool},
                         {"decFormat", Variable::EBool},
                         {"filterMin", Variable::EBool},
                         {"filterMax", Variable::EBool},
                         {"minKeys", Variable::EInteger},
                         {"maxKeys", Variable::EInteger},
                         {"overrideHeaderRate", Variable::EBool},
                         {"headerRate", Variable::EFloat},
                         {"upAxis", Variable::EString}});
}

bool C3dExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return applyOptions<C3DExporter>(i_rArgs, ".c3d", "Could not find C3D exporter.", applyOption);
}
