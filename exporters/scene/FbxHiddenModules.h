#pragma once
#include <set>

class Module;

/// The modules an FBX export leaves out with their whole subtrees. The host's removal from the
/// scene destroys what it removes, so the exporter hides by skipping instead of detaching.
namespace FbxHiddenModules {

/// With `i_hide` set: every subject's labeling setup, and every labeling bone, constraint and
/// cluster of the scene, except those of a prop that has no solving setup. Empty otherwise.
std::set<const Module*> labelingSetups(bool i_hide);

/// True when the module or one of its ancestors is in the set.
bool isHidden(const std::set<const Module*>& i_rHidden, const Module* i_pModule);

} // namespace FbxHiddenModules
