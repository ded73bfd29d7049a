#pragma once
#include "SceneJson.h"

class Character;

namespace AnvilCore {

/// Keys of a subject object that `readSubjectSetups` reads.
#define ANVIL_SCENE_SUBJECT_SETUP_KEYS "file", "setups"

/// Gives a staged subject its setups: from a subject file (`"file"`, relative to the scene
/// file) and from `"setups"` (bone trees written in the scene file). Fails with the JSON path
/// when the file cannot be read or a setup is malformed.
void readSubjectSetups(const nlohmann::json& i_rSubject, const std::string& i_path,
                       SceneJsonContext& io_rContext, Character& io_rCharacter);

} // namespace AnvilCore
