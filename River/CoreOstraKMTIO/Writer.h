#pragma once
// Writes subject records as a file of the subject file language, in any of its versions. The
// four subject exporters call the free function Write.

#include "River/CoreOstraKMTIO/KMTLanguage.h"
#include "River/CoreOstraKMTIO/SubjectKMTExtras.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <boost/filesystem/path.hpp>

#include <cstdint>
#include <string>
#include <vector>

namespace CoreOstraKMTIO {

class VWriter {
public:
  using VSubjectParametrised = CoreOstraTypes::VSubjectParametrised;
  using VSubjectApplicationData = CoreOstraTypes::VSubjectApplicationData;
  using VSubjectDynamicSubspace = CoreOstraTypes::VSubjectDynamicSubspace;

  /// Writes `fileName` in the version of `versionCode` (0 to 16, see VersionOfCode; other codes
  /// write every attribute of every version; AutomaticVersionCode chooses). The document is
  /// built in memory first: when any error stands (see Messages) the file is not touched.
  /// Returns ResultOk or ResultFailed.
  std::uint32_t Write(const boost::filesystem::path& fileName, const VSubjectParametrised& subject,
                      const VSubjectApplicationData& appData,
                      const VSubjectDynamicSubspace& subspace, int versionCode);
  /// As Write, into `o_rText` instead of a file.
  std::uint32_t WriteText(std::string& o_rText, const VSubjectParametrised& subject,
                          const VSubjectApplicationData& appData,
                          const VSubjectDynamicSubspace& subspace, int versionCode);

  /// `xmlns:xsi` and `xsi:noNamespaceSchemaLocation` of the root; empty ones aren't written.
  void SetSchemaLocation(const std::string& xmlnsXsi, const std::string& schemaLocation);

  /// Errors of the last run.
  const std::vector<std::string>& Messages() const { return m_Messages; }
  /// Version the last run wrote.
  IVersion WrittenVersion() const { return m_Version; }

  /// The version of `versionCode`, choosing for AutomaticVersionCode: 3.2, raised to 3.3 for a
  /// skin or a placement covariance, to 3.4 for rotation observations, to 3.5 for a subspace, a
  /// model version, a retarget source, a bind pose, a direction target, a calibration weight
  /// other than 1 or a rotation calibration behaviour.
  static IVersion VersionFor(int versionCode, const VSubjectParametrised& subject,
                             const VSubjectApplicationData& appData,
                             const VSubjectDynamicSubspace& subspace);

private:
  /// Builds the document text; false with messages on any error.
  bool Build(std::string& o_rText, const VSubjectParametrised& subject,
             const VSubjectApplicationData& appData, const VSubjectDynamicSubspace& subspace,
             int versionCode);
  /// Evaluated pre transforms, post texts of the older eras and joint axes.
  bool PrepareExtras();

  VSubjectParametrised m_Subject;
  VSubjectApplicationData m_AppData;
  VSubjectDynamicSubspace m_Subspace;
  VSubjectKMTExtras m_Extras;
  std::string m_XmlnsXsi;
  std::string m_SchemaLocation;
  IVersion m_Version;
  std::vector<std::string> m_Messages;
};

/// Writes a subject file. With `o_pMessages` the errors go there; without, each is logged on
/// channel "KMTIO" at error level. Returns ResultOk (0) or ResultFailed (0x80000020).
std::uint32_t Write(const boost::filesystem::path& fileName,
                    const CoreOstraTypes::VSubjectParametrised& subject,
                    const CoreOstraTypes::VSubjectApplicationData& appData,
                    const CoreOstraTypes::VSubjectDynamicSubspace& subspace,
                    std::vector<std::string>* o_pMessages, int versionCode);

} // namespace CoreOstraKMTIO
