#pragma once
#include <string>
#include <vector>

namespace AnvilCore {

/// Loads inputs into one scene, in order: "demo" (the bundled demo scene) or a file whose
/// extension a registered reader knows. Stops at the first failure with its message.
bool loadSceneInputs(const std::vector<std::string>& i_inputs, std::string& o_rError);

/// Extensions that `loadSceneInputs` reads, sorted.
std::vector<std::string> readableExtensions();

} // namespace AnvilCore
