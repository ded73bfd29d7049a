#pragma once
// Reads any file of the subject file language (KMT, KMF, KMS, KMR) into subject records, and
// writes the language's XSD. The grammar is the declaration in Declaration.h: run over a reader
// node it reads, run over a schema node it documents.

#include "River/CoreOstraKMTIO/KMTLanguage.h"
#include "River/CoreOstraKMTIO/SubjectKMTExtras.h"
#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <boost/filesystem/path.hpp>

#include <cstdint>
#include <istream>
#include <string>
#include <string_view>
#include <vector>

namespace CoreOstraKMTIO {

/// Namespace URI the XSD declares for the prefix "ostra" (its version annotations).
inline constexpr const char* SchemaNamespaceUri = "http://schemas.anvil-mocap.org/kmt";
/// Stylesheet named in the XSD's processing instruction.
inline constexpr const char* SchemaStylesheet = "Ostra_KMT_Schema-HTML.xsl";

class VReader {
public:
  using VSubjectParametrised = CoreOstraTypes::VSubjectParametrised;
  using VSubjectApplicationData = CoreOstraTypes::VSubjectApplicationData;
  using VSubjectDynamicSubspace = CoreOstraTypes::VSubjectDynamicSubspace;

  /// Reads a file. The subject is named `subjectName`, or after the file's stem when that is
  /// empty; its id is `subjectId`, or the hash of the name when that is 0xFFFFFFFF. Returns
  /// ResultOk, or ResultFailed when any error stands; errors and warnings are replaced by those
  /// of this read. The records are filled as far as the read got.
  std::uint32_t Read(const boost::filesystem::path& fileName, VSubjectParametrised& o_rSubject,
                     VSubjectApplicationData& o_rAppData, VSubjectDynamicSubspace& o_rSubspace,
                     std::vector<std::string>& o_rErrors, std::vector<std::string>& o_rWarnings,
                     const std::string& subjectName = {},
                     std::uint32_t subjectId = CoreOstraTypes::InvalidId);
  /// Reads an open stream to its end; as the path form, with the name given as it stands.
  std::uint32_t Read(std::istream& stream, VSubjectParametrised& o_rSubject,
                     VSubjectApplicationData& o_rAppData, VSubjectDynamicSubspace& o_rSubspace,
                     std::vector<std::string>& o_rErrors, std::vector<std::string>& o_rWarnings,
                     const std::string& subjectName = {},
                     std::uint32_t subjectId = CoreOstraTypes::InvalidId);
  /// Reads a document held in memory.
  std::uint32_t ReadText(std::string_view text, VSubjectParametrised& o_rSubject,
                         VSubjectApplicationData& o_rAppData, VSubjectDynamicSubspace& o_rSubspace,
                         std::vector<std::string>& o_rErrors, std::vector<std::string>& o_rWarnings,
                         const std::string& subjectName = {},
                         std::uint32_t subjectId = CoreOstraTypes::InvalidId);

  /// Writes the XSD of the language; false (with a log line) when the file can't be written.
  bool WriteSchema(const boost::filesystem::path& fileName) const;
  /// The XSD as text.
  static std::string SchemaText();

  /// Version of the last file read; 1.0 when it had none.
  IVersion FileVersion() const { return m_FileVersion; }
  /// Values of the last file that the records don't hold (retired attributes, evaluated pre
  /// transforms, joint axes).
  const VSubjectKMTExtras& Extras() const { return m_Extras; }

  IVersion m_MinVersion = MinVersion;
  IVersion m_MaxVersion = MaxVersion;

private:
  /// Reads a zero-terminated buffer, parsed in place.
  std::uint32_t ReadBuffer(std::vector<char>& buffer, VSubjectParametrised& o_rSubject,
                           VSubjectApplicationData& o_rAppData,
                           VSubjectDynamicSubspace& o_rSubspace,
                           std::vector<std::string>& o_rErrors,
                           std::vector<std::string>& o_rWarnings, const std::string& subjectName,
                           std::uint32_t subjectId);

  IVersion m_FileVersion{1, 0};
  VSubjectKMTExtras m_Extras;
};

} // namespace CoreOstraKMTIO
