#include "plugin/host/FileExporter.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Module.h"

bool FileExporter::s_doProgress = true;
bool FileExporter::s_workLocally = false;

FileExporter::FileExporter(bool i_binary, const HString& i_rExtension, bool i_flag)
    : m_binary(i_binary), m_extension(i_rExtension), m_flag(i_flag) {}

FileExporter::~FileExporter() = default;

void FileExporter::getCompatibleFrameRates(std::vector<double>& o_rRates) {
  o_rRates.clear();
  for (uint64_t i = 0, n = getNumCompatibleFrameRates(); i < n; ++i)
    o_rRates.push_back(getCompatibleFrameRate(i));
}

// Any rate is compatible unless an exporter says otherwise.
uint64_t FileExporter::getNumCompatibleFrameRates() {
  return 0;
}
double FileExporter::getCompatibleFrameRate(uint64_t) {
  return 0.0;
}

FILE* FileExporter::openFile(const HString& i_rPath, bool i_binary) {
  return std::fopen(i_rPath.GetStr(), i_binary ? "wb" : "w");
}

void FileExporter::closeFile(FILE* i_pFile) {
  if (i_pFile) std::fclose(i_pFile);
}

HString FileExporter::extractExtension(const HString& i_rFilename) {
  const int dot = i_rFilename.ReverseFind('.');
  const int slash = i_rFilename.ReverseFind('/');
  if (dot < 0 || dot < slash) return HString();
  return i_rFilename.Mid(dot + 1);
}

bool FileExporter::isInModsList(const Module* i_pModule) const {
  for (Module* p : m_modules)
    if (p == i_pModule) return true;
  return false;
}

FileExporterMgr::~FileExporterMgr() {
  clear();
}

void FileExporterMgr::registerExporter(FileExporter* i_pExporter) {
  if (i_pExporter) m_exporters.push_back(i_pExporter);
}

FileExporter* FileExporterMgr::getExporter(const HString& i_rExtension) const {
  if (i_rExtension.GetLength() < 2 || i_rExtension[0] != '.') return nullptr;
  const HString bare = i_rExtension.Mid(1);
  for (FileExporter* p : m_exporters)
    if (p->getExtension() == bare) return p;
  return nullptr;
}

FileExporter* FileExporterMgr::findForFile(const HString& i_rPath) const {
  for (FileExporter* p : m_exporters)
    if (p->recognize(i_rPath)) return p;
  return nullptr;
}

void FileExporterMgr::clear() {
  for (FileExporter* p : m_exporters)
    p->deleteThis();
  m_exporters.clear();
}
