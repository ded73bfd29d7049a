#include "SubjectExportOptions.h"

namespace SubjectExportOptions {

void declare(Command& io_rCommand, bool i_retargetPose) {
  if (i_retargetPose)
    ExportOptionsCommand::declareOptions(
        io_rCommand, {{"version", Variable::EString}, {"retargetPose", Variable::EBool}});
  else
    ExportOptionsCommand::declareOptions(io_rCommand, {{"version", Variable::EString}});
}

} // namespace SubjectExportOptions
