#include "CheckCommand.h"

#include "Subcommands.h"
#include "SubjectSummary.h"

#include "AnvilCore/io/SceneInputs.h"
#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraKMTIO/Reader.h"
#include "River/CoreOstraTypesUtils/GenericDynamicSubspace.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/SubjectManager.h"

#include <nlohmann/json.hpp>

namespace anvil {

namespace {

/// Collects the records of the process-wide logger while it lives, at warning level and above.
class VCheckLog {
public:
  VCheckLog() {
    ZMT::GlobalLog().SetDefaultLevel(ZMT::ELogWarning);
    m_Previous =
        ZMT::SetLogSink([this](const ZMT::LogRecord& record) { m_Records.push_back(record); });
  }
  ~VCheckLog() { ZMT::SetLogSink(std::move(m_Previous)); }
  VCheckLog(const VCheckLog&) = delete;
  VCheckLog& operator=(const VCheckLog&) = delete;

  /// Hands over the records gathered since the last call.
  std::vector<ZMT::LogRecord> take() { return std::exchange(m_Records, {}); }

private:
  std::vector<ZMT::LogRecord> m_Records;
  ZMT::LogSink m_Previous;
};

const char* levelText(int i_level) {
  return i_level <= ZMT::ELogError ? "error" : "warning";
}

class VChecker {
public:
  std::vector<CheckMessage> m_Messages;
  bool m_Failed = false;
  bool m_Unreadable = false;

  void checkSubjectFile(const std::string& i_rPath) {
    CoreOstraKMTIO::VReader reader;
    CoreOstraTypes::VSubjectParametrised subject;
    CoreOstraTypes::VSubjectApplicationData appData;
    CoreOstraTypes::VSubjectDynamicSubspace subspace;
    std::vector<std::string> errors, warnings;
    const auto result = reader.Read(i_rPath, subject, appData, subspace, errors, warnings);
    m_Log.take(); // the reader's own log lines are in its lists
    if (result != CoreOstraKMTIO::ResultOk) {
      m_Unreadable = true;
      for (const auto& error : errors)
        m_Messages.push_back({i_rPath, "", "Input", "error", error});
      if (errors.empty()) m_Messages.push_back({i_rPath, "", "Input", "error", "cannot be read"});
      return;
    }
    for (const auto& warning : warnings)
      m_Messages.push_back({i_rPath, subject.m_Name, "KMTIO", "warning", warning});
    checkRecords(i_rPath, subject.m_Name, subject, &appData, &subspace);
  }

  void checkSceneInput(const std::string& i_rInput) {
    g_db->clearScene();
    std::string error;
    if (!AnvilCore::loadSceneInputs({i_rInput}, error)) {
      m_Log.take();
      m_Unreadable = true;
      m_Messages.push_back({i_rInput, "", "Input", "error", error});
      return;
    }
    m_Log.take();
    const SubjectManager* pSubjects = g_db->getSubjectManager();
    for (int i = 0; i < pSubjects->getNumSubjects(); ++i) {
      Character* pCharacter = pSubjects->getSubject(i);
      const std::string name = pCharacter->getName().GetStr();
      // Each setup that carries markers and targets is a subject of its own.
      const std::pair<int, const char*> modes[] = {
          {AnvilSubjectCoreTypesConversion::ELabeling, "labeling"},
          {AnvilSubjectCoreTypesConversion::ESolving, "solving"}};
      for (const auto& [mode, text] : modes) {
        const bool present = mode == AnvilSubjectCoreTypesConversion::ELabeling
                                 ? pCharacter->getLabelingSetup(false) != nullptr
                                 : pCharacter->getSolvingSetup(false) != nullptr;
        if (!present) continue;
        const std::string label = name + " (" + text + ")";
        AnvilSubjectCoreTypesConversion conversion(mode);
        if (!conversion.characterToVSubject2(pCharacter, false)) {
          m_Failed = true;
          for (const auto& reason : conversion.getErrors())
            m_Messages.push_back({i_rInput, label, "SubjectConversion", "error", reason});
          continue;
        }
        checkRecords(i_rInput, label, conversion.getSubjectParametrised(),
                     &conversion.getSubjectApplicationData(), nullptr);
      }
    }
  }

private:
  void checkRecords(const std::string& i_rFile, const std::string& i_rSubject,
                    const CoreOstraTypes::VSubjectParametrised& i_rSubjectRecord,
                    const CoreOstraTypes::VSubjectApplicationData* i_pAppData,
                    const CoreOstraTypes::VSubjectDynamicSubspace* i_pSubspace) {
    bool ok = CoreOstraTypesUtils::SubjectParametrisedCheck(i_rSubjectRecord, i_pAppData);
    if (i_pSubspace) {
      for (const auto& chunk : i_pSubspace->m_PcaControlledParams) {
        CoreOstraTypesUtils::VGenericDynamicSubspace generic;
        if (!CoreOstraTypesUtils::BuildGenericDynamicSubspace(i_rSubjectRecord, chunk, generic)) {
          m_Messages.push_back(
              {i_rFile, i_rSubject, "SubjectDynamicSubspaceUtils", "error",
               "Subspace " + chunk.m_Name + " does not cover whole joints of the subject"});
          ok = false;
          continue;
        }
        if (CoreOstraTypesUtils::ValidateGenericDynamicSubspace(generic) !=
            CoreOstraTypesUtils::ESubspaceValidation::EValid)
          ok = false;
      }
    }
    for (const auto& record : m_Log.take())
      m_Messages.push_back(
          {i_rFile, i_rSubject, record.Channel, levelText(record.Level), record.Message});
    if (!ok) m_Failed = true;
  }

  VCheckLog m_Log;
};

void printText(const std::vector<CheckMessage>& i_rMessages, std::ostream& o_rOut) {
  for (const auto& m : i_rMessages) {
    o_rOut << m.file << ": ";
    if (!m.subject.empty()) o_rOut << m.subject << ": ";
    o_rOut << m.rule << ": " << m.level << ": " << m.message << "\n";
  }
}

void printJson(const std::vector<CheckMessage>& i_rMessages, std::ostream& o_rOut) {
  nlohmann::json array = nlohmann::json::array();
  for (const auto& m : i_rMessages) {
    array.push_back({{"file", m.file},
                     {"subject", m.subject},
                     {"rule", m.rule},
                     {"level", m.level},
                     {"message", m.message}});
  }
  o_rOut << array.dump(2, ' ', false, nlohmann::json::error_handler_t::replace) << "\n";
}

} // namespace

int runCheck(const std::vector<std::string>& i_rInputs, bool i_json, std::ostream& o_rOut) {
  VChecker checker;
  // Messages of the host while scenes load and subjects convert are gathered, not printed.
  g_db->setLogSink([](HLogLevel, const std::string&) {});
  for (const auto& input : i_rInputs) {
    if (isSubjectFile(input)) {
      checker.checkSubjectFile(input);
    } else {
      checker.checkSceneInput(input);
    }
  }
  if (i_json) {
    printJson(checker.m_Messages, o_rOut);
  } else {
    printText(checker.m_Messages, o_rOut);
  }
  if (checker.m_Unreadable) return EExitUsage;
  return checker.m_Failed ? EExitWriteFailed : EExitOk;
}

} // namespace anvil
