#include "SubjectFileExporter.h"
#include "River/CoreOstraKMTIO/Writer.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/ParameterizedSetup.h"
#include "plugin/host/SubjectBone.h"
#include <cstring>

namespace {
// Version texts in the order they are compared, their codes, and the text each code reads back
// as. Code 8 reads back as "2.3", so a 2.5 choice comes back from the user setup as 3.5.
struct VersionEntry {
  const char* m_pText;
  int32_t m_code;
  const char* m_pReadBack;
};
const VersionEntry kVersions[] = {{"1.0", 0, "1.0"},  {"1.5", 1, "1.5"},  {"2.0", 3, "2.0"},
                                  {"2.5", 8, "2.3"},  {"3.0", 11, "3.0"}, {"3.2", 13, "3.2"},
                                  {"3.3", 14, "3.3"}, {"3.4", 15, "3.4"}, {"3.5", 16, "3.5"}};
constexpr int32_t kDefaultVersionCode = 16;
const char* const kVersionKey = "VersionToExport";
const char* const kRootNotFound = "Export failed: Root node could not be determined.";

// A module at the top of the scene: the scene's own root, if any, is not a parent.
bool isTopLevel(const Module* i_pModule) {
  return !i_pModule->hasParent() || !i_pModule->getParent()->hasParent();
}
} // namespace

SubjectFileExporter::SubjectFileExporter(const Traits& i_rTraits)
    : FileExporter(false, i_rTraits.m_pExtension, true), m_traits(i_rTraits) {}

bool SubjectFileExporter::recognize(const HString& i_rFilename) {
  return extractExtension(i_rFilename) == m_traits.m_pExtension;
}

bool SubjectFileExporter::getOptions(void* o_pOptions) {
  std::memcpy(o_pOptions, &m_options,
              m_traits.m_hasRetargetPose ? sizeof(KmsExportOptions) : sizeof(KmfExportOptions));
  return true;
}

bool SubjectFileExporter::setOptions(void* i_pOptions) {
  std::memcpy(&m_options, i_pOptions,
              m_traits.m_hasRetargetPose ? sizeof(KmsExportOptions) : sizeof(KmfExportOptions));
  return true;
}

void SubjectFileExporter::setVersionToExport(const HString& i_rVersion) {
  for (const VersionEntry& entry : kVersions)
    if (i_rVersion == entry.m_pText) {
      m_options.m_versionToExport = entry.m_code;
      return;
    }
  g_db->logError("Unsupported KMF export version. Supported versions are 1.0, 1.5, 2.0, 2.5, "
                 "3.0, 3.2, 3.3, 3.4, 3.5");
  m_options.m_versionToExport = kDefaultVersionCode;
}

HString SubjectFileExporter::getVersionToExport() const {
  for (const VersionEntry& entry : kVersions)
    if (m_options.m_versionToExport == entry.m_code) return entry.m_pReadBack;
  return "3.5";
}

void SubjectFileExporter::loadUserSetup() {
  const HString current = getVersionToExport();
  setVersionToExport(g_interface.getUserSetupString(m_traits.m_pSection, kVersionKey,
                                                    current.GetStr(), HString::EMPTY_STRING));
}

void SubjectFileExporter::saveUserSetup() const {
  g_interface.setUserSetupString(m_traits.m_pSection, kVersionKey, getVersionToExport(),
                                 HString::EMPTY_STRING);
}

Character* SubjectFileExporter::getCharacterToExport() {
  if (m_modules.getCount() == 0) {
    g_db->logInfo("%s", kRootNotFound);
    return nullptr;
  }
  Node* pRoot = nullptr;
  Node* pSetup = nullptr;
  for (Module* pModule : m_modules) {
    if (!pModule->isKindOf(&Node::s_classNode) || !isInModsList(pModule) || !isTopLevel(pModule) ||
        pModule->getNumNodeChildren() == 0)
      continue;
    for (int i = 0; i < pModule->getNumNodeChildren() && !pSetup; ++i)
      if (pModule->getNodeChild(i)->isKindOf(m_traits.m_pSetupClass))
        pSetup = pModule->getNodeChild(i);
    if (pSetup) {
      pRoot = static_cast<Node*>(pModule);
      break;
    }
  }
  if (!pRoot) {
    g_db->logInfo("%s", kRootNotFound);
    return nullptr;
  }
  if (pRoot->getNumChildrenOfType(m_traits.m_pSetupClass) != 1) {
    g_db->logError("%s must have a single %s module.", pRoot->getName().GetStr(),
                   m_traits.m_pSetupName);
    return nullptr;
  }
  const HString& setupName = pSetup->getName();
  if (m_traits.m_singleBoneChild && pSetup->getNumChildrenOfType(m_traits.m_pBoneClass) != 1) {
    g_db->logError("%s must have a single LabelingBone child.", setupName.GetStr());
    return nullptr;
  }
  SubjectBone* pBone = static_cast<ParameterizedSetup*>(pSetup)->getRootBone(false);
  if (!pBone) {
    g_db->logError("%s must have a single %s child.", setupName.GetStr(), m_traits.m_pBoneName);
    return nullptr;
  }
  Character* pCharacter = pBone->getCharacterParent();
  if (!pCharacter)
    g_db->logError("Export failed: Character does not exist or root node is not a decedent of "
                   "the character.");
  return pCharacter;
}

bool SubjectFileExporter::write() {
  m_pCharacter = getCharacterToExport();
  if (!m_pCharacter) return false;
  checkCharacter(*m_pCharacter);

  const HString fileName = m_filePath;
  CoreOstraTypes::VSubjectParametrised subject;
  CoreOstraTypes::VSubjectApplicationData application;
  CoreOstraTypes::VSubjectDynamicSubspace subspace;
  std::vector<std::string>* pMessages = nullptr; // the writer's errors go to its log channel

  AnvilSubjectCoreTypesConversion conversion(m_traits.m_conversionMode);
  if (!conversion.characterToVSubject2(m_pCharacter, false)) {
    g_db->logError("%s can not be exported as a %s file.", m_pCharacter->getName().GetStr(),
                   m_traits.m_pFileKind);
    return false;
  }
  subject = conversion.getSubjectParametrised();
  application = conversion.getSubjectApplicationData();
  fetchSubspace(*m_pCharacter, conversion, subspace);
  prepareRecords(*m_pCharacter, conversion, subject, application);

  const int32_t result = static_cast<int32_t>(CoreOstraKMTIO::Write(
      fileName.GetStr(), subject, application, subspace, pMessages, m_options.m_versionToExport));
  if (result < 0) {
    if (pMessages)
      for (const std::string& message : *pMessages)
        g_db->logError("Unable to export %s - %s", fileName.GetStr(), message.c_str());
    return false;
  }
  return true;
}
