#pragma once
#include "plugin/host/FileExporter.h"
#include <cstdint>

class Character;
class AnvilSubjectCoreTypesConversion;
namespace CoreOstraTypes {
class VSubjectApplicationData;
class VSubjectDynamicSubspace;
class VSubjectParametrised;
} // namespace CoreOstraTypes

/// Options of the KMF and KMT exporters: the writer's version code.
struct KmfExportOptions {
  int32_t m_versionToExport = 16;
};
struct KmtExportOptions {
  int32_t m_versionToExport = 16;
};
/// Options of the KMS and KMR exporters: the version code, then whether the bind pose is filled
/// from the current pose.
struct KmsExportOptions {
  int32_t m_versionToExport = 16;
  bool m_exportAsRetargetPose = false;
};
struct KmrExportOptions {
  int32_t m_versionToExport = 16;
  bool m_exportAsRetargetPose = false;
};
static_assert(sizeof(KmfExportOptions) == 4 && sizeof(KmtExportOptions) == 4);
static_assert(sizeof(KmsExportOptions) == 8 && sizeof(KmrExportOptions) == 8);

/// What the four subject file exporters share: find the one character whose setup is to be
/// written, convert it to subject records with the host's conversion, and hand them to the
/// subject file writer. The file is written by the writer, not through the host's stream.
class SubjectFileExporter : public FileExporter {
public:
  /// Constant parts of one exporter.
  struct Traits {
    const char* m_pExtension;   ///< "kmf"
    const char* m_pDescription; ///< "Ostra Labeling Setup File"
    const char* m_pSection;     ///< user setup section, "KMFExporter"
    const char* m_pSetupName;   ///< "LabelingSetup", for messages
    const char* m_pBoneName;    ///< "LabelingBone", for messages
    const char* m_pFileKind;    ///< "KMF" in "... can not be exported as a KMF file."
    const HRuntimeClass* m_pSetupClass;
    const HRuntimeClass* m_pBoneClass;
    int m_conversionMode;   ///< 0 labeling, 1 solving, 2 retargeting
    bool m_hasRetargetPose; ///< the option exists (KMS, KMR)
    bool m_singleBoneChild; ///< the setup must have exactly one bone child (KMF, KMT)
  };

  /// No stream: the writer opens the file itself.
  FILE* openFile(const HString& i_rPath, bool i_binary) override { return nullptr; }
  void closeFile(FILE* i_pFile) override {}
  int getDataType() override { return 4; }
  HString getDescription() override { return m_traits.m_pDescription; }
  /// True when the file name's extension is this exporter's.
  bool recognize(const HString& i_rFilename) override;
  bool getOptions(void* o_pOptions) override;
  bool setOptions(void* i_pOptions) override;
  /// "VersionToExport" in the exporter's section, as text.
  void loadUserSetup() override;
  void saveUserSetup() const override;
  /// Forgets the character of the last `write`.
  void reset() override { m_pCharacter = nullptr; }
  /// Writes the character's setup as a subject file. False, with the reason logged, when no
  /// single character can be found, it cannot be converted, or the writer fails.
  bool write() override;

  /// "1.0", "1.5", "2.0", "2.5", "3.0", "3.2", "3.3", "3.4" or "3.5"; any other text logs an
  /// error and selects 3.5.
  void setVersionToExport(const HString& i_rVersion);
  /// The version's text; code 8 (set by "2.5") reads back as "2.3".
  HString getVersionToExport() const;
  /// The writer's version code.
  int32_t getVersionCode() const { return m_options.m_versionToExport; }

protected:
  explicit SubjectFileExporter(const Traits& i_rTraits);

  /// The character whose setup is exported, or null with the reason logged.
  Character* getCharacterToExport();
  /// Fills the subspace the file holds; the base leaves it empty.
  virtual void fetchSubspace(Character& i_rCharacter,
                             const AnvilSubjectCoreTypesConversion& i_rConversion,
                             CoreOstraTypes::VSubjectDynamicSubspace& o_rSubspace) {}
  /// Last changes before writing (the retarget pose); the base does nothing.
  virtual void prepareRecords(Character& i_rCharacter,
                              const AnvilSubjectCoreTypesConversion& i_rConversion,
                              CoreOstraTypes::VSubjectParametrised& io_rSubject,
                              CoreOstraTypes::VSubjectApplicationData& io_rApplication) {}
  /// Warnings before converting (the prop warning of KMS); the base does nothing.
  virtual void checkCharacter(const Character& i_rCharacter) {}

  bool getExportAsRetargetPoseOption() const { return m_options.m_exportAsRetargetPose; }
  void setExportAsRetargetPoseOption(bool i_value) { m_options.m_exportAsRetargetPose = i_value; }

private:
  Traits m_traits;
  KmsExportOptions m_options; // the KMF and KMT blocks are its first four bytes
  Character* m_pCharacter = nullptr;
};
