#include "FbxExporter.h"
#include "FbxDocumentWriter.h"
#include "FbxScene.h"
#include <cerrno>
#include <cstring>
#include <exception>
#include <filesystem>
#include <string_view>
#include <unistd.h>

namespace AnvilFbx {

uint32_t FileVersionOf(const char* i_pVersionString) {
  static const std::pair<std::string_view, uint32_t> kVersions[] = {
      {"FBX202000", 7700}, {"FBX201900", 7700}, {"FBX201800", 7500},
      {"FBX201600", 7500}, {"FBX201400", 7400}, {"FBX201300", 7300},
  };
  if (!i_pVersionString) return 0;
  for (const auto& [text, version] : kVersions)
    if (text == i_pVersionString) return version;
  return 0;
}

FbxExporter* FbxExporter::Create(FbxManager* i_pManager, const char* i_pName) {
  FbxExporter* pExporter =
      i_pManager->adopt(std::unique_ptr<FbxExporter>(new FbxExporter(i_pName)));
  pExporter->m_pManager = i_pManager;
  return pExporter;
}

void FbxExporter::Destroy() {
  // The exporter holds no resource beyond its settings; its owner frees the memory.
  m_pStream = nullptr;
  m_initialized = false;
}

bool FbxExporter::SetFileExportVersion(const char* i_pVersionString, int) {
  const uint32_t version = FileVersionOf(i_pVersionString);
  if (version == 0) return false;
  m_version = version;
  return true;
}

bool FbxExporter::Initialize(const char* i_pPath) {
  m_status.Clear();
  m_pStream = nullptr;
  m_path = i_pPath ? i_pPath : "";
  m_initialized = false;
  if (m_path.empty()) {
    m_status.SetError("no output path");
    return false;
  }
  std::error_code ec;
  const std::filesystem::path folder = std::filesystem::path(m_path).parent_path();
  if (!folder.empty() && !std::filesystem::is_directory(folder, ec)) {
    m_status.SetError("no folder '" + folder.string() + "'");
    return false;
  }
  m_initialized = true;
  return true;
}

bool FbxExporter::Initialize(std::FILE* i_pStream) {
  m_status.Clear();
  m_path.clear();
  m_pStream = i_pStream;
  m_initialized = i_pStream != nullptr;
  if (!m_initialized) m_status.SetError("no output stream");
  return m_initialized;
}

namespace {
// Writes the bytes to a sibling of the path and renames it over the path once complete.
bool replaceFile(const std::string& i_rPath, const VFbxByteSink& i_rBytes, std::string& o_rError) {
  const std::filesystem::path path(i_rPath);
  // Built by appending: GCC 12 warns falsely (-Wrestrict) on a chain of string additions here.
  std::string tempName = ".";
  tempName += path.filename().string();
  tempName += ".fbx-";
  tempName += std::to_string(::getpid());
  const std::filesystem::path temp = path.parent_path() / tempName;
  std::FILE* pFile = std::fopen(temp.c_str(), "wb");
  if (!pFile) {
    o_rError = "cannot create '" + i_rPath + "': " + std::strerror(errno);
    return false;
  }
  const bool written = i_rBytes.writeTo(pFile);
  const bool closed = std::fclose(pFile) == 0;
  std::error_code ec;
  if (!written || !closed) {
    o_rError = "error writing '" + i_rPath + "'";
    std::filesystem::remove(temp, ec);
    return false;
  }
  std::filesystem::rename(temp, path, ec);
  if (ec) {
    o_rError = "cannot replace '" + i_rPath + "': " + ec.message();
    std::filesystem::remove(temp, ec);
    return false;
  }
  return true;
}
} // namespace

bool FbxExporter::Export(FbxScene* i_pScene) {
  m_status.Clear();
  if (!m_initialized) {
    m_status.SetError("the exporter has no output");
    return false;
  }
  if (!i_pScene) {
    m_status.SetError("no scene");
    return false;
  }
  VFbxByteSink bytes;
  try {
    VFbxRecordWriter writer(bytes, m_version, m_compressionThreshold);
    WriteFbxDocument(*i_pScene, writer);
  } catch (const std::exception& e) {
    m_status.SetError(e.what());
    return false;
  }
  if (m_pStream) {
    if (!bytes.writeTo(m_pStream)) {
      m_status.SetError("error writing the output stream");
      return false;
    }
    return true;
  }
  std::string error;
  if (!replaceFile(m_path, bytes, error)) {
    m_status.SetError(error);
    return false;
  }
  return true;
}

} // namespace AnvilFbx
