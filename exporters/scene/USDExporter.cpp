#include "USDExporter.h"
#include "UpAxisText.h"

#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectManager.h"
#include "plugin/host/SubjectScaler.h"
#include "usd/UsdNames.h"
#include "usd/UsdSkel.h"

#include <cstring>
#include <set>
#include <string>
#include <vector>

namespace {

const char* const kSection = "USDExporter";

struct Joint {
  std::string m_path;
  Node* m_pBone;
};

template <class TSetup, class TBone, class... TArgs>
void collectBones(TSetup* i_pSetup, std::vector<Node*>& o_rBones, TArgs... i_args) {
  TSimpleArray<TBone*> bones;
  i_pSetup->getBones(bones, i_args...);
  for (TBone* pBone : bones)
    o_rBones.push_back(pBone);
}

/// The joints of a subject: the bones of its retargeting setup, else its solving setup, else
/// its labeling setup, with their paths below the setup.
std::vector<Joint> gatherJoints(Character& i_rSubject) {
  std::vector<Node*> bones;
  const char* pPrefix = "";
  if (RetargetingSetup* pSetup = i_rSubject.getRetargetingSetup(false)) {
    collectBones<RetargetingSetup, RetargetingBone>(pSetup, bones, true);
    pPrefix = "Retargeting/";
  } else if (SolvingSetup* pSetup = i_rSubject.getSolvingSetup(false)) {
    collectBones<SolvingSetup, SolvingBone>(pSetup, bones);
    pPrefix = "Solving/";
  } else if (LabelingSetup* pSetup = i_rSubject.getLabelingSetup(false)) {
    collectBones<LabelingSetup, LabelingBone>(pSetup, bones);
    pPrefix = "Labeling/";
  }
  const HString subjectPrefix = i_rSubject.getName() + "/";
  std::vector<Joint> joints;
  std::set<std::string> taken;
  for (Node* pBone : bones) {
    HString path = pBone->getFullPathString();
    path.Replace("\\", "/");
    path.Replace(subjectPrefix.GetStr(), "");
    path.Replace(pPrefix, "");
    // The host's paths start at its root separator; joints are relative paths of identifiers.
    std::string token = AnvilUsd::MakeValidRelativePath(path.GetString());
    if (token.empty()) token.push_back('_');
    // Names that collide once made valid get a number.
    const std::string base = token;
    for (int n = 1; !taken.insert(token).second; ++n)
      token = base + "_" + std::to_string(n);
    joints.push_back({token, pBone});
  }
  return joints;
}

AnvilUsd::Vec3f centimetres(const Vec3& i_rPosition) {
  return {float(i_rPosition.x * 0.1), float(i_rPosition.y * 0.1), float(i_rPosition.z * 0.1)};
}

AnvilUsd::Quatf quaternion(const AnvilRotation& i_rRotation) {
  double x = 0, y = 0, z = 0, w = 1;
  i_rRotation.getAsQuaternion(x, y, z, w);
  return {float(w), float(x), float(y), float(z)};
}

const AnvilUsd::Vec3h kUnitScale = {AnvilUsd::FloatToHalf(1.0f), AnvilUsd::FloatToHalf(1.0f),
                                    AnvilUsd::FloatToHalf(1.0f)};

} // namespace

USDExporter* USDExporter::createInstance() {
  return new USDExporter();
}

USDExporter::USDExporter() : FileExporter(false, "usd", false) {}
USDExporter::~USDExporter() = default;

bool USDExporter::getOptions(void* o_pOptions) {
  std::memcpy(o_pOptions, &m_options, sizeof m_options);
  return true;
}

bool USDExporter::setOptions(void* i_pOptions) {
  std::memcpy(&m_options, i_pOptions, sizeof m_options);
  return true;
}

bool USDExporter::recognize(const HString& i_rFilename) {
  return extractExtension(i_rFilename) == "usd";
}

bool USDExporter::setDesiredUpAxis(const HString& i_rAxis) {
  return SceneUpAxis::parse(i_rAxis, m_options.m_desiredUpAxis);
}

HString USDExporter::getDesiredUpAxisAsString() const {
  return SceneUpAxis::text(m_options.m_desiredUpAxis);
}

void USDExporter::loadUserSetup() {
  const HString& scope = HString::EMPTY_STRING;
  setDesiredUpAxis(g_interface.getUserSetupString(kSection, "DesiredUpAxis",
                                                  getDesiredUpAxisAsString().GetStr(), scope));
  m_options.m_rotateToFacePositive =
      g_interface.getUserSetupInt(kSection, "RotateToFacePositive",
                                  m_options.m_rotateToFacePositive, scope) != 0;
  m_options.m_unscaleRetargetingSubjects =
      g_interface.getUserSetupInt(kSection, "UnscaleRetargetingSubjects",
                                  m_options.m_unscaleRetargetingSubjects, scope) != 0;
}

void USDExporter::saveUserSetup() const {
  const HString& scope = HString::EMPTY_STRING;
  g_interface.setUserSetupString(kSection, "DesiredUpAxis", getDesiredUpAxisAsString(), scope);
  g_interface.setUserSetupInt(kSection, "RotateToFacePositive", m_options.m_rotateToFacePositive,
                              scope);
  g_interface.setUserSetupInt(kSection, "UnscaleRetargetingSubjects",
                              m_options.m_unscaleRetargetingSubjects, scope);
}

bool USDExporter::write() {
  const HString path = m_filePath;
  return writeStage(path);
}

namespace {
/// Turns the scene to the asked up axis for the time of one export and back at the end, on
/// every road out: one run of the program exports several files from the same scene.
class SceneAxisTurn {
public:
  SceneAxisTurn(UsdExportOptions::EUpAxis i_axis, bool i_faceForward)
      : m_wasZUp(g_db->isZUp()), m_faceForward(i_faceForward) {
    if (i_axis == UsdExportOptions::EUpAxisY && m_wasZUp) {
      m_toY = true;
      g_db->rotateScene(-90.0, 0);
      g_db->setZUp(false);
      if (m_faceForward) g_db->rotateScene(180.0, 1);
    } else if (i_axis == UsdExportOptions::EUpAxisZ && !m_wasZUp) {
      m_toZ = true;
      g_db->rotateScene(90.0, 0);
      g_db->setZUp(true);
      if (m_faceForward) g_db->rotateScene(180.0, 2);
    }
  }
  ~SceneAxisTurn() {
    if (m_toY) {
      if (m_faceForward) g_db->rotateScene(-180.0, 1);
      g_db->rotateScene(90.0, 0);
    } else if (m_toZ) {
      if (m_faceForward) g_db->rotateScene(-180.0, 2);
      g_db->rotateScene(-90.0, 0);
    }
    g_db->setZUp(m_wasZUp);
  }
  SceneAxisTurn(const SceneAxisTurn&) = delete;
  SceneAxisTurn& operator=(const SceneAxisTurn&) = delete;

private:
  bool m_wasZUp;
  bool m_faceForward;
  bool m_toY = false;
  bool m_toZ = false;
};
} // namespace

bool USDExporter::writeStage(const HString& i_rPath) {
  if (m_options.m_unscaleRetargetingSubjects) SubjectScaler().unscaleRetargetingSubjects();
  const SceneAxisTurn turn(m_options.m_desiredUpAxis, m_options.m_rotateToFacePositive);

  std::string reason;
  m_pStage = AnvilUsd::VStage::CreateNew(i_rPath.GetString(), reason);
  if (!m_pStage) {
    g_db->logError("USD Exporter: Failed to create stage file '%s'", i_rPath.GetStr());
    return false;
  }
  m_pStage->SetUpAxis(g_db->isZUp() ? "Z" : "Y");
  HTimeManager* pTime = g_db->getTimeManager();
  m_pStage->SetFramesPerSecond(pTime->getFrameRate());
  m_pStage->SetTimeCodesPerSecond(pTime->getFrameRate());
  // Joint translations are written in centimetres.
  m_pStage->SetMetersPerUnit(0.01);
  const HTimeRange& play = pTime->getPlayRange();
  m_pStage->SetStartTimeCode(double(pTime->getFrame(play.getStart())));
  m_pStage->SetEndTimeCode(double(pTime->getFrame(play.getEnd())));

  SubjectManager* pSubjects = g_db->getSubjectManager();
  std::set<std::string> names;
  for (int i = 0; i < pSubjects->getNumSubjects(); ++i) {
    Character* pSubject = pSubjects->getSubject(i);
    // A prim name is an identifier, unique among its siblings.
    std::string name = AnvilUsd::MakeValidIdentifier(pSubject->getName().GetString());
    const std::string base = name;
    for (int n = 1; !names.insert(name).second; ++n)
      name = base + "_" + std::to_string(n);
    if (!writeSubject(*pSubject, "/" + name)) {
      m_pStage.reset();
      return false;
    }
  }

  const bool saved = m_pStage->Export(i_rPath.GetString(), true, reason);
  m_pStage.reset();
  if (!saved) {
    g_db->logError("USD Exporter: Failed to write stage file '%s': %s", i_rPath.GetStr(),
                   reason.c_str());
  }
  return saved;
}

bool USDExporter::writeSubject(Character& i_rSubject, const std::string& i_rSkeletonPath) {
  AnvilUsd::VSkeleton skeleton = AnvilUsd::VSkeleton::Define(*m_pStage, i_rSkeletonPath);
  const std::vector<Joint> joints = gatherJoints(i_rSubject);

  AnvilUsd::TokenArray tokens;
  for (const Joint& joint : joints)
    tokens.push_back(joint.m_path);
  std::string reason;
  if (!AnvilUsd::VSkelTopology(tokens).Validate(&reason)) {
    g_db->logError("Invalid topology: %s", reason.c_str());
    return false;
  }
  skeleton.GetJointsAttr().Set(tokens);

  const std::size_t count = joints.size();
  AnvilUsd::Vec3fArray translations(count);
  AnvilUsd::QuatfArray rotations(count);
  const AnvilUsd::Vec3hArray scales(count, kUnitScale);
  AnvilUsd::Matrix4dArray transforms;
  for (std::size_t j = 0; j < count; ++j) {
    translations[j] = centimetres(joints[j].m_pBone->getPreTranslation());
    rotations[j] = quaternion(joints[j].m_pBone->getPreRotation().inverse());
  }
  AnvilUsd::MakeTransforms(translations, rotations, scales, transforms);
  skeleton.GetRestTransformsAttr().Set(transforms);
  // The bind pose is the world pose of the static transforms.
  for (std::size_t j = 0; j < count; ++j) {
    translations[j] = centimetres(joints[j].m_pBone->getConstWSPos());
    rotations[j] = quaternion(joints[j].m_pBone->getConstWSRot());
  }
  AnvilUsd::MakeTransforms(translations, rotations, scales, transforms);
  skeleton.GetBindTransformsAttr().Set(transforms);

  const std::string animationPath = i_rSkeletonPath + "/Anim";
  AnvilUsd::VSkelAnimation animation = AnvilUsd::VSkelAnimation::Define(*m_pStage, animationPath);
  AnvilUsd::VSkelBindingAPI::Apply(skeleton.GetPrim())
      .CreateAnimationSourceRel()
      .SetTargets({animationPath});
  animation.GetJointsAttr().Set(tokens);

  HTimeManager* pTime = g_db->getTimeManager();
  const int64_t step = pTime->getTicksPerFrame();
  const HTimeRange& play = pTime->getPlayRange();
  for (HTime t = play.getStart(); t <= play.getEnd(); t += step) {
    const double timeCode = double(pTime->getFrame(t));
    for (std::size_t j = 0; j < count; ++j) {
      translations[j] = centimetres(joints[j].m_pBone->getLocalPos(t));
      rotations[j] = quaternion(joints[j].m_pBone->getLocalRot(t));
    }
    animation.GetTranslationsAttr().Set(translations, timeCode);
    animation.GetRotationsAttr().Set(rotations, timeCode);
    animation.GetScalesAttr().Set(scales, timeCode);
  }
  return true;
}
