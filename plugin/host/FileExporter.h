#pragma once
#include "HObject.h"
#include "HString.h"
#include "HTime.h"
#include "TSimpleArray.h"
#include <cstdint>
#include <cstdio>
#include <vector>

class Module;

/// Bits of `FileExporter::getDataType`: the kinds of module an exporter consumes.
enum EHostDataType : int {
  EDataMarkers = 1,     ///< markers, labelled or not
  EDataReserved = 2,    ///< unused
  EDataSubjects = 4,    ///< characters (subjects and props)
  EDataNodes = 8,       ///< other nodes: bones and plain transforms
  EDataAudio = 16,      ///< audio sources
  EDataReserved32 = 32, ///< unused
  EDataOpticalCameras = 64,
  EDataVideoCameras = 128,
};

/// Base of every exporter. The host fills the stream, module list, range and path, then calls
/// `reset` and `write`.
class ANVIL_HOST_API FileExporter : public HObject {
public:
  static const HRuntimeClass s_classFileExporter;

  FileExporter(bool i_binary, const HString& i_rExtension, bool i_flag);
  ~FileExporter() override;

  const HRuntimeClass* getRuntimeClass() const override { return &s_classFileExporter; }
  virtual bool getOptions(void* o_pOptions) { return false; }
  virtual bool setOptions(void* i_pOptions) { return false; }
  virtual void getCompatibleFrameRates(std::vector<double>& o_rRates);
  virtual uint64_t getNumCompatibleFrameRates();
  virtual double getCompatibleFrameRate(uint64_t i_index);
  /// Opens the path with mode "wb" when `i_binary`, else "w". Null when it cannot be opened.
  virtual FILE* openFile(const HString& i_rPath, bool i_binary);
  virtual void closeFile(FILE* i_pFile);
  virtual int getDataType() { return 0; }
  virtual HString getDescription() { return HString(); }
  virtual bool recognize(const HString& i_rFilename) { return false; }
  virtual bool hasEditableOptions() { return false; }
  virtual void loadUserSetup() {}
  virtual void saveUserSetup() const {}
  virtual void reset() {}
  virtual bool write() = 0;

  /// Extension of a file name without the dot; empty when there is none.
  static HString extractExtension(const HString& i_rFilename);
  bool isInModsList(const Module* i_pModule) const;

  /// Construction arguments, for the host.
  bool isBinary() const { return m_binary; }
  const HString& getExtension() const { return m_extension; }
  bool getSecondFlag() const { return m_flag; }

  /// Host side: what one export works on.
  void setStream(FILE* i_pFile) { m_pFile = i_pFile; }
  FILE* getStream() const { return m_pFile; }
  TSimpleArray<Module*>& moduleList() { return m_modules; }
  void setTimeRange(const HTimeRange& i_rRange) { m_timeRange = i_rRange; }
  void setFilePath(const HString& i_rPath) { m_filePath = i_rPath; }
  const HString& getFilePath() const { return m_filePath; }

  /// Report progress to `g_theOperationStack`.
  static bool s_doProgress;
  /// Write to a scratch file first when the output path is remote.
  static bool s_workLocally;

protected:
  FILE* m_pFile = nullptr;
  TSimpleArray<Module*> m_modules;
  HTimeRange m_timeRange;
  HString m_filePath;

private:
  bool m_binary;
  HString m_extension;
  bool m_flag;
};

/// The registered exporters. Owns them once registered.
class ANVIL_HOST_API FileExporterMgr {
public:
  ~FileExporterMgr();
  /// The exporter of an extension given with its dot (".c3d"), or null.
  FileExporter* getExporter(const HString& i_rExtension) const;
  bool getExportSelectedOnly() const { return m_selectedOnly; }
  void setExportSelectedOnly(bool i_selected) { m_selectedOnly = i_selected; }

  /// Host side.
  void registerExporter(FileExporter* i_pExporter);
  int getNumExporters() const { return static_cast<int>(m_exporters.size()); }
  FileExporter* getExporterAt(int i_index) const { return m_exporters[size_t(i_index)]; }
  /// The first exporter whose `recognize` accepts the file name, or null.
  FileExporter* findForFile(const HString& i_rPath) const;
  /// Releases every exporter.
  void clear();

private:
  std::vector<FileExporter*> m_exporters;
  bool m_selectedOnly = false;
};
