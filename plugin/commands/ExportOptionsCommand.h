#pragma once
#include "plugin/host/Command.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"
#include <initializer_list>

/// What the exporters' option commands share: their declaration and the handling of each kind
/// of option value.
namespace ExportOptionsCommand {

/// One option of a command, in identifier order.
struct OptionSpec {
  const char* m_pName;
  Variable::VarType m_type;
};

/// Puts the command in the "File Handling" category and adds each option (arity 1, optional).
void declareOptions(Command& io_rCommand, std::initializer_list<OptionSpec> i_options);

/// The live exporter of an extension given with its dot (".c3d"), or null.
FileExporter* findExporter(const char* i_pExtension);

/// A bool option applied to `i_current`: toggle flips it, otherwise it becomes (value == true).
bool boolValue(const Variable& i_rValue, bool i_current);

/// A key count. A negative count logs "<name> value must be positive" and gives false.
bool keyCountValue(const Variable& i_rValue, const char* i_pName, int& o_rCount);

/// A rate, passed on unchecked: the exporter validates it when it writes.
double rateValue(const Variable& i_rValue);

/// An up axis: "scene" 0, "y" 1, "z" 2 after lower-casing. Any other text logs the list of valid
/// values and gives false, leaving `o_rAxis` untouched.
bool upAxisValue(const Variable& i_rValue, int& o_rAxis);

/// The common frame of `doCommand`: finds the exporter (logs `i_pNotFound` and fails when there
/// is none), warns when no option is given, then applies each option in call order with
/// `i_apply(exporter, id, value)` until one returns false.
template <typename TExporter, typename FApply>
bool applyOptions(const CommandArgList& i_rArgs, const char* i_pExtension, const char* i_pNotFound,
                  FApply i_apply) {
  TExporter* pExporter = dynamic_cast<TExporter*>(findExporter(i_pExtension));
  if (!pExporter) {
    Command::logError("%s", i_pNotFound);
    return false;
  }
  if (i_rArgs.empty()) {
    Command::logWarning("No options specified. Command has no effect.");
    return true;
  }
  for (const CommandArgument& arg : i_rArgs)
    if (!i_apply(*pExporter, arg.m_id, arg.m_value)) return false;
  return true;
}

} // namespace ExportOptionsCommand
