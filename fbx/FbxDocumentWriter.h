#pragma once
// Lays a scene out as the records of an FBX 7.x document: header extension, global settings,
// documents, definitions, objects, connections and takes.
#include "fbx/FbxRecordWriter.h"

namespace AnvilFbx {

class FbxScene;

/// The fixed creation time every file carries, and the two ids derived from it.
inline constexpr const char* kFbxCreationTime = "1970-01-01 10:00:00:000";
extern const uint8_t kFbxFileId[16];
extern const uint8_t kFbxFooterId[16];

/// Writes the whole file (header to footer) into the writer's sink.
void WriteFbxDocument(const FbxScene& i_rScene, VFbxRecordWriter& io_rWriter);

} // namespace AnvilFbx
