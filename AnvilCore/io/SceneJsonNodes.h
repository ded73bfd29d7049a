#pragma once
#include "SceneJson.h"

class Marker;
class Module;
class Node;

namespace AnvilCore {

/// Reads a marker object and adds it under `i_pParent`.
Marker* readMarker(const nlohmann::json& i_rValue, const std::string& i_path,
                   SceneJsonContext& io_rContext, Module* i_pParent);
/// Reads a node object (with its children) and adds it under `i_pParent`.
Node* readNode(const nlohmann::json& i_rValue, const std::string& i_path,
               SceneJsonContext& io_rContext, Module* i_pParent);
/// Reads the transform keys shared by nodes and subjects into `io_rNode`.
void readTransform(const nlohmann::json& i_rValue, const std::string& i_path,
                   SceneJsonContext& io_rContext, Node& io_rNode);
/// Fails when `i_pParent` already has a child called `i_name`.
void checkUniqueName(const Module* i_pParent, const std::string& i_name, const std::string& i_path);
/// Keys a transform object may hold.
#define ANVIL_SCENE_TRANSFORM_KEYS                                                                 \
  "preTranslation", "preRotation", "postRotation", "rotationOrder", "translation", "rotation",     \
      "scale", "animation"

} // namespace AnvilCore
