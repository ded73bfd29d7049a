#pragma once
#include "plugin/host/HTime.h"
#include <optional>
#include <string>

class FileExporter;
class Module;

namespace AnvilCore {

/// The `FileExporter::getDataType` bits that a scene module answers to.
int dataTypeOf(const Module* i_pModule);

enum class EExportStatus {
  EOk,          ///< written
  ECannotOpen,  ///< the output could not be created; nothing written
  EWriteFailed, ///< `write` returned false; the error is in the log; nothing written
};

struct ExportRequest {
  std::string path;                ///< output file as the user gave it
  std::optional<HTimeRange> range; ///< default: the animation range
  bool selectedOnly = false;       ///< export only selected modules
};

/// Runs one export the way the host does: open the stream, fill the module list and range,
/// `reset`, `write`, close. The file appears only when `write` succeeds: the stream goes to a
/// sibling temporary file that replaces the output once every byte is on disk. On a failure
/// `o_rError` names the file and the reason ("error writing 'take.c3d': disk full") whenever
/// the file layer knows it, whether the exporter wrote to the stream or by path.
EExportStatus runExport(FileExporter& i_rExporter, const ExportRequest& i_rRequest,
                        std::string& o_rError);

} // namespace AnvilCore
