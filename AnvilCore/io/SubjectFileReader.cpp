// Subject files as inputs: the subject joins the scene as a character with its three setups.
#include "SubjectFileReader.h"
#include "ISceneReader.h"
#include "River/CoreOstraKMTIO/Reader.h"
#include "plugin/host/Database.h"

namespace AnvilCore {

namespace {
std::string firstOf(const std::string& i_rPath, const std::vector<std::string>& i_rErrors) {
  std::string text = i_rPath + ": " + (i_rErrors.empty() ? "cannot be read" : i_rErrors.front());
  if (i_rErrors.size() > 1)
    text += " (and " + std::to_string(i_rErrors.size() - 1) + " more errors)";
  return text;
}

class SubjectFileReader : public ISceneReader {
public:
  std::vector<std::string> extensions() const override { return {"kmt", "kmf", "kms", "kmr"}; }
  std::string description() const override {
    return "Subject files: labeling (KMF, KMT template), solving (KMS), retargeting (KMR)";
  }
  bool read(const std::string& i_path, std::string& o_rError) override {
    SubjectRecords records;
    if (!readSubjectFile(i_path, std::string(), records, o_rError)) return false;
    std::vector<std::string> errors;
    if (!addSubjectToScene(records, errors)) {
      o_rError = firstOf(i_path, errors);
      return false;
    }
    return true;
  }
};
} // namespace

bool readSubjectFile(const std::string& i_rPath, const std::string& i_rName,
                     SubjectRecords& o_rRecords, std::string& o_rError) {
  CoreOstraKMTIO::VReader reader;
  std::vector<std::string> errors, warnings;
  const uint32_t result = reader.Read(i_rPath, o_rRecords.subject, o_rRecords.application,
                                      o_rRecords.subspace, errors, warnings, i_rName);
  for (const std::string& warning : warnings)
    g_db->logWarning("%s: %s", i_rPath.c_str(), warning.c_str());
  if ((result & 0x80000000u) != 0 || !errors.empty()) {
    o_rError = firstOf(i_rPath, errors);
    return false;
  }
  return true;
}

ANVIL_REGISTER_SCENE_READER(SubjectFileReader)

} // namespace AnvilCore
