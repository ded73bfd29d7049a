#pragma once
// Saves a scene as a binary FBX file, either to a path (through a temporary sibling that replaces
// the file only once it is complete) or to an open stream.
#include "fbx/FbxObject.h"
#include <cstdint>
#include <cstdio>
#include <string>

namespace AnvilFbx {

class FbxScene;

class FbxStatus {
public:
  const char* GetErrorString() const { return m_error.c_str(); }
  bool Error() const { return !m_error.empty(); }
  void SetError(std::string i_text) { m_error = std::move(i_text); }
  void Clear() { m_error.clear(); }

private:
  std::string m_error;
};

/// File version of an SDK version string ("FBX202000" 7700, "FBX201400" 7400, ...); 0 when the
/// string is unknown.
uint32_t FileVersionOf(const char* i_pVersionString);

class FbxExporter : public FbxObject {
public:
  static FbxExporter* Create(FbxManager* i_pManager, const char* i_pName);
  /// Destroys the exporter now (otherwise it goes with its scene or manager).
  void Destroy();

  /// Chooses the file version by SDK version string. False, keeping the current one, for an
  /// unknown string. The default is "FBX202000".
  bool SetFileExportVersion(const char* i_pVersionString, int i_renameMode = 0);
  uint32_t fileVersion() const { return m_version; }
  /// Arrays above this many bytes are compressed with zlib; by default none is (see
  /// docs/fbx.md: for key data the time outweighs the space).
  void setCompressionThreshold(size_t i_bytes) { m_compressionThreshold = i_bytes; }

  /// Output to a path. False when the path's folder cannot take a new file.
  bool Initialize(const char* i_pPath);
  /// Output to an open stream, written from its current position; the stream stays open.
  bool Initialize(std::FILE* i_pStream);
  /// Writes the scene. False with the reason in `GetStatus` when it cannot be written; a path
  /// output is then left as it was.
  bool Export(FbxScene* i_pScene);
  FbxStatus& GetStatus() { return m_status; }

private:
  using FbxObject::FbxObject;
  uint32_t m_version = 7700;
  size_t m_compressionThreshold = SIZE_MAX;
  std::string m_path;
  std::FILE* m_pStream = nullptr;
  bool m_initialized = false;
  FbxStatus m_status;
  FbxManager* m_pManager = nullptr;
};

} // namespace AnvilFbx
