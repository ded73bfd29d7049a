#pragma once
// What the four subject file option commands share: option 0 `version` (string, handed to
// `setVersionToExport`), and for KMS and KMR option 1 `retargetPose` (bool; toggle reads the
// exporter's current value). All four report a missing exporter as the KMF exporter.
#include "ExportOptionsCommand.h"

namespace SubjectExportOptions {

enum ESubjectOption : uint64_t { EVersion, ERetargetPose };

inline const char* const kNotFound = "Could not find KMF exporter.";

/// Declares `version`, and `retargetPose` when `i_retargetPose`.
void declare(Command& io_rCommand, bool i_retargetPose);

/// Applies the call's options to the live exporter of `i_pExtension`.
template <typename TExporter> bool apply(const CommandArgList& i_rArgs, const char* i_pExtension) {
  return ExportOptionsCommand::applyOptions<TExporter>(
      i_rArgs, i_pExtension, kNotFound,
      [](TExporter& io_rExporter, uint64_t i_id, const Variable& i_rValue) {
        if (i_id == EVersion) {
          io_rExporter.setVersionToExport(i_rValue.getStringValue(-1));
        } else if constexpr (requires { io_rExporter.setExportAsRetargetPose(true); }) {
          if (i_id == ERetargetPose)
            io_rExporter.setExportAsRetargetPose(
                ExportOptionsCommand::boolValue(i_rValue, io_rExporter.getExportAsRetargetPose()));
        }
        return true;
      });
}

} // namespace SubjectExportOptions
