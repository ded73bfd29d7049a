#pragma once
#include "AnvilCore/SubjectSetupBuilder.h"
#include <string>

namespace AnvilCore {

/// Reads a subject file (KMT, KMF, KMS or KMR) into records. The subject is named `i_rName`, or
/// after the file's stem when that is empty. The reader's warnings are logged; on failure returns
/// false with "<path>: <first error>" (and the count of further errors) in `o_rError`.
bool readSubjectFile(const std::string& i_rPath, const std::string& i_rName,
                     SubjectRecords& o_rRecords, std::string& o_rError);

} // namespace AnvilCore
