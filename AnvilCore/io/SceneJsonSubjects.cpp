// The setups of a subject in the scene file.
#include "SceneJsonSubjects.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"
#include "SceneJsonNodes.h"
#include "SubjectFileReader.h"
#include "plugin/host/Character.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingConstraint.h"
#include "plugin/host/SolvingSetup.h"
#include <filesystem>

namespace AnvilCore {

namespace {
using CoreOstraTypes::VJointTypeBase;
const char* const kKinds[] = {"labeling", "solving", "retargeting"};

std::unique_ptr<ParameterizedSetup> makeSetup(int i_kind, const HString& i_rName) {
  if (i_kind == 0) return std::make_unique<LabelingSetup>(i_rName);
  if (i_kind == 1) return std::make_unique<SolvingSetup>(i_rName);
  return std::make_unique<RetargetingSetup>(i_rName);
}

SubjectBone* makeBone(int i_kind, const HString& i_rName) {
  if (i_kind == 0) return new LabelingBone(i_rName);
  if (i_kind == 1) return new SolvingBone(i_rName);
  return new RetargetingBone(i_rName);
}

Vec3 position(const nlohmann::json& i_rValue, const std::string& i_path) {
  const std::vector<double> v = json::numbers(i_rValue, i_path, 3);
  return Vec3(v[0], v[1], v[2]);
}

void readJoint(const nlohmann::json& i_rBone, const std::string& i_path, SubjectBone& io_rBone) {
  static const std::pair<const char*, VJointTypeBase::EJointType> kTypes[] = {
      {"free", VJointTypeBase::EFree},
      {"ball", VJointTypeBase::EBall},
      {"hardySpicer", VJointTypeBase::EHardySpicer},
      {"hinge", VJointTypeBase::EHinge},
      {"slider", VJointTypeBase::ESlider},
      {"dummy", VJointTypeBase::EDummy}};
  VJointTypeBase::EJointType type = VJointTypeBase::EDummy;
  if (auto* p = json::optional(i_rBone, "joint")) {
    const std::string text = json::string(*p, i_path + "/joint");
    auto it = std::find_if(std::begin(kTypes), std::end(kTypes),
                           [&](const auto& e) { return text == e.first; });
    if (it == std::end(kTypes))
      json::fail(i_path + "/joint", "unknown joint \"" + text +
                                        "\" (free, ball, hardySpicer, hinge, slider or dummy)");
    type = it->second;
  }
  std::array<double, 3> orientation{};
  if (auto* p = json::optional(i_rBone, "axis")) {
    const std::vector<double> v = json::numbers(*p, i_path + "/axis", 3);
    if (!CoreOstraTypesUtils::JointOrientationFromAxis({v[0], v[1], v[2]}, orientation))
      json::fail(i_path + "/axis", "the axis has no direction");
  }
  if (auto* p = json::optional(i_rBone, "axisPair")) {
    const std::vector<double> v = json::numbers(*p, i_path + "/axisPair", 6);
    if (!CoreOstraTypesUtils::JointOrientationFromAxisPair({v[0], v[1], v[2], v[3], v[4], v[5]},
                                                           orientation))
      json::fail(i_path + "/axisPair", "the axes have no directions");
  }
  io_rBone.setJoint(type, orientation);
}

SubjectConstraint* makeConstraint(int i_kind, const HString& i_rName) {
  if (i_kind == 0) return new LabelingConstraint(i_rName);
  return new SolvingConstraint(i_rName);
}

// A marker on a bone or in a cluster: a name and a place.
void readPlacedMarker(const nlohmann::json& i_rValue, const std::string& i_path, int i_kind,
                      Module& io_rParent) {
  json::onlyKeys(i_rValue, i_path, {"name", "position"});
  const std::string name = json::name(json::member(i_rValue, i_path, "name"), i_path + "/name");
  checkUniqueName(&io_rParent, name, i_path + "/name");
  SubjectConstraint* pConstraint = makeConstraint(i_kind, HString(name));
  io_rParent.addChild(pConstraint);
  pConstraint->setStaticTransform(
      position(json::member(i_rValue, i_path, "position"), i_path + "/position"), AnvilRotation(),
      Vec3(1, 1, 1));
}

// `i_copy`: the bone is read for another setup than the one it is written in, which drops the
// parts this kind of setup does not hold.
void readBone(const nlohmann::json& i_rValue, const std::string& i_path, int i_kind, bool i_copy,
              SceneJsonContext& io_rContext, Module& io_rParent) {
  using namespace json;
  onlyKeys(i_rValue, i_path,
           {"name", "joint", "axis", "axisPair", "markers", "clusters", "children",
            ANVIL_SCENE_TRANSFORM_KEYS});
  const std::string boneName = name(member(i_rValue, i_path, "name"), i_path + "/name");
  checkUniqueName(&io_rParent, boneName, i_path + "/name");
  SubjectBone* pBone = makeBone(i_kind, HString(boneName));
  io_rParent.addChild(pBone);
  readJoint(i_rValue, i_path, *pBone);
  readTransform(i_rValue, i_path, io_rContext, *pBone);
  auto* pMarkers = optional(i_rValue, "markers");
  auto* pClusters = optional(i_rValue, "clusters");
  if (i_copy && i_kind == 2) pMarkers = nullptr;
  if (i_copy && i_kind != 0) pClusters = nullptr;
  if (pMarkers) {
    if (i_kind == 2) fail(i_path + "/markers", "a retargeting setup has no markers");
    array(*pMarkers, i_path + "/markers");
    for (size_t i = 0; i < pMarkers->size(); ++i)
      readPlacedMarker((*pMarkers)[i], i_path + "/markers/" + std::to_string(i), i_kind, *pBone);
  }
  if (pClusters) {
    if (i_kind != 0) fail(i_path + "/clusters", "only a labeling setup has clusters");
    array(*pClusters, i_path + "/clusters");
    for (size_t c = 0; c < pClusters->size(); ++c) {
      const std::string path = i_path + "/clusters/" + std::to_string(c);
      const nlohmann::json& cluster = (*pClusters)[c];
      onlyKeys(cluster, path, {"name", "markers", "translation", "rotation"});
      const std::string clusterName = name(member(cluster, path, "name"), path + "/name");
      checkUniqueName(pBone, clusterName, path + "/name");
      auto* pCluster = new LabelingCluster(HString(clusterName));
      pBone->addChild(pCluster);
      readTransform(cluster, path, io_rContext, *pCluster);
      const nlohmann::json& markers = member(cluster, path, "markers");
      array(markers, path + "/markers");
      if (markers.size() < 3) fail(path + "/markers", "a cluster needs at least 3 markers");
      for (size_t i = 0; i < markers.size(); ++i)
        readPlacedMarker(markers[i], path + "/markers/" + std::to_string(i), 0, *pCluster);
    }
  }
  if (auto* pChildren = optional(i_rValue, "children")) {
    array(*pChildren, i_path + "/children");
    for (size_t i = 0; i < pChildren->size(); ++i)
      readBone((*pChildren)[i], i_path + "/children/" + std::to_string(i), i_kind, i_copy,
               io_rContext, *pBone);
  }
}

std::unique_ptr<ParameterizedSetup> readSetup(const nlohmann::json& i_rValue,
                                              const std::string& i_path, int i_kind, bool i_copy,
                                              SceneJsonContext& io_rContext,
                                              const HString& i_rName) {
  json::onlyKeys(i_rValue, i_path, {"root"});
  std::unique_ptr<ParameterizedSetup> pSetup = makeSetup(i_kind, i_rName);
  readBone(json::member(i_rValue, i_path, "root"), i_path + "/root", i_kind, i_copy, io_rContext,
           *pSetup);
  return pSetup;
}
} // namespace

void readSubjectSetups(const nlohmann::json& i_rSubject, const std::string& i_path,
                       SceneJsonContext& io_rContext, Character& io_rCharacter) {
  using namespace json;
  std::unique_ptr<ParameterizedSetup> setups[3];
  if (auto* pFile = optional(i_rSubject, "file")) {
    std::filesystem::path file = string(*pFile, i_path + "/file");
    if (file.is_relative() && !io_rContext.directory.empty())
      file = std::filesystem::path(io_rContext.directory) / file;
    SubjectRecords records;
    std::string error;
    if (!readSubjectFile(file.string(), io_rCharacter.getName().GetStr(), records, error))
      fail(i_path + "/file", error);
    std::vector<std::string> errors;
    const ESetupKind kinds[3] = {ESetupKind::ELabeling, ESetupKind::ESolving,
                                 ESetupKind::ERetargeting};
    for (int k = 0; k < 3; ++k) {
      setups[k] = buildSetup(kinds[k], io_rCharacter.getName().GetStr(), records, errors);
      if (!setups[k]) fail(i_path + "/file", file.string() + ": " + errors.front());
    }
  }
  if (auto* pSetups = optional(i_rSubject, "setups")) {
    const std::string path = i_path + "/setups";
    onlyKeys(*pSetups, path, {kKinds[0], kKinds[1], kKinds[2]});
    for (int k = 0; k < 3; ++k) {
      const nlohmann::json* pSetup = optional(*pSetups, kKinds[k]);
      if (!pSetup || pSetup->is_string()) continue;
      setups[k] = readSetup(*pSetup, path + "/" + kKinds[k], k, false, io_rContext,
                            io_rCharacter.getName());
    }
    // A setup given as the name of another is built again from that one's description.
    for (int k = 0; k < 3; ++k) {
      const nlohmann::json* pSetup = optional(*pSetups, kKinds[k]);
      if (!pSetup || !pSetup->is_string()) continue;
      const std::string other = pSetup->get<std::string>();
      const int from =
          int(std::find(std::begin(kKinds), std::end(kKinds), other) - std::begin(kKinds));
      const nlohmann::json* pFrom = from < 3 ? optional(*pSetups, kKinds[from]) : nullptr;
      if (!pFrom || pFrom->is_string())
        fail(path + "/" + kKinds[k], "\"" + other + "\" names no setup written in this subject");
      setups[k] =
          readSetup(*pFrom, path + "/" + other, k, true, io_rContext, io_rCharacter.getName());
    }
  }
  for (auto& pSetup : setups)
    if (pSetup) io_rCharacter.addChild(pSetup.release());
}

} // namespace AnvilCore
