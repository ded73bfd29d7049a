#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"
#include "SubjectJointPose.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingConstraint.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectBone.h"
#include <algorithm>
#include <map>

using namespace CoreOstraTypes;
using CoreOstraTypesUtils::FormatExpressionNumber;

namespace {
// Radius given to a marker that only a constraint names, in millimetres.
constexpr double kDerivedMarkerRadius = 14.0;
// Diagonal of a rigid-body marker covariance that has no content.
constexpr double kDefaultMarkerVariance = 5.0;

std::array<std::string, 3> expressions(const std::array<double, 3>& i_rValues) {
  return {FormatExpressionNumber(i_rValues[0]), FormatExpressionNumber(i_rValues[1]),
          FormatExpressionNumber(i_rValues[2])};
}
std::array<std::string, 3> expressions(const Vec3& i_rValue) {
  return expressions(std::array<double, 3>{i_rValue.x, i_rValue.y, i_rValue.z});
}
bool complete(const std::array<std::string, 3>& i_rTexts) {
  return std::none_of(i_rTexts.begin(), i_rTexts.end(),
                      [](const std::string& s) { return s.empty(); });
}

ParameterizedSetup* setupOfMode(Character& io_rCharacter, int i_mode) {
  switch (i_mode) {
  case AnvilSubjectCoreTypesConversion::ELabeling:
    return io_rCharacter.getLabelingSetup(false);
  case AnvilSubjectCoreTypesConversion::ESolving:
    return io_rCharacter.getSolvingSetup(false);
  case AnvilSubjectCoreTypesConversion::ERetargeting:
    return io_rCharacter.getRetargetingSetup(false);
  default:
    return nullptr;
  }
}

const char* setupText(int i_mode) {
  return i_mode == 0 ? "labeling" : (i_mode == 1 ? "solving" : "retargeting");
}

// A constraint of the setup with the bone it hangs on, in tree order.
struct Entry {
  SubjectConstraint* pConstraint;
  uint32_t boneIndex;
  bool cluster;
};

std::vector<SubjectConstraint*> clusterMarkers(const SubjectConstraint& i_rCluster) {
  std::vector<SubjectConstraint*> markers;
  for (int i = 0; i < i_rCluster.getNumChildren(); ++i)
    if (i_rCluster.getChild(i)->isKindOf(&LabelingConstraint::s_classLabelingConstraint))
      markers.push_back(static_cast<SubjectConstraint*>(i_rCluster.getChild(i)));
  return markers;
}
} // namespace

AnvilSubjectCoreTypesConversion::AnvilSubjectCoreTypesConversion(int i_mode) : m_mode(i_mode) {}

void AnvilSubjectCoreTypesConversion::fail(const std::string& i_rText) {
  m_errors.push_back(i_rText);
  g_db->logError("%s", i_rText.c_str());
}

bool AnvilSubjectCoreTypesConversion::characterToVSubject2(Character* i_pCharacter,
                                                           bool i_bakeExpressions) {
  m_subject = VSubjectParametrised();
  m_application = VSubjectApplicationData();
  m_errors.clear();
  m_pCharacter = i_pCharacter;
  m_pSetup = nullptr;
  if (!i_pCharacter) {
    fail("No character to convert.");
    return false;
  }
  const std::string subjectName = i_pCharacter->getName().GetStr();
  ParameterizedSetup* pSetup = setupOfMode(*i_pCharacter, m_mode);
  if (!pSetup) {
    fail("Subject " + subjectName + " has no " + setupText(m_mode) + " setup.");
    return false;
  }
  if (!pSetup->getRootBone(true)) {
    fail("The " + std::string(setupText(m_mode)) + " setup of " + subjectName +
         " must have exactly one root bone.");
    return false;
  }
  m_pSetup = pSetup;

  // Subject-wide records.
  const VSubjectParametrised& header = pSetup->subjectRecord();
  m_subject.m_Name = subjectName;
  m_subject.m_SubjectId = NameHash(subjectName);
  m_subject.m_Model = header.m_Model;
  m_subject.m_ModelVersion = header.m_ModelVersion;
  m_subject.m_MarkerSetName = header.m_MarkerSetName;
  m_subject.m_StaticParameters = header.m_StaticParameters;
  m_subject.m_DynamicParameters = header.m_DynamicParameters;
  m_subject.m_TPoseConstraints = header.m_TPoseConstraints;
  const VSubjectApplicationData& appHeader = pSetup->applicationRecord();
  m_application.m_SubjectId = m_subject.m_SubjectId;
  m_application.m_Colour = appHeader.m_Colour;
  m_application.m_Skin = appHeader.m_Skin;
  m_application.m_SkinColourA = appHeader.m_SkinColourA;
  m_application.m_SkinColourB = appHeader.m_SkinColourB;
  m_application.m_RetargetSourceTemplate = appHeader.m_RetargetSourceTemplate;
  m_application.m_RetargetSourceSubject = appHeader.m_RetargetSourceSubject;

  // Segments: the bones, depth first.
  std::vector<SubjectBone*> bones;
  pSetup->collectBones(bones);
  std::map<const Module*, uint32_t> boneIndex;
  std::map<std::string, uint32_t> boneByName;
  for (SubjectBone* pBone : bones) {
    const uint32_t index = static_cast<uint32_t>(m_subject.m_Segments.size());
    VSubjectParametrised::VSegment segment = pBone->segmentRecord();
    segment.m_Name = pBone->getName().GetStr();
    segment.m_SegmentIndex = index;
    auto parent = boneIndex.find(pBone->getParent());
    segment.m_ParentSegmentIndex = parent == boneIndex.end()
                                       ? ZMT::IOptional<uint32_t>()
                                       : ZMT::IOptional<uint32_t>(parent->second);
    segment.m_TreeDepth =
        parent == boneIndex.end() ? 0 : m_subject.m_Segments[parent->second].m_TreeDepth + 1;
    if (i_bakeExpressions || !complete(segment.m_PreTranslation))
      segment.m_PreTranslation = expressions(pBone->getPreTranslation());
    if (i_bakeExpressions || !complete(segment.m_PreRotation))
      segment.m_PreRotation =
          expressions(AnvilCore::angleAxisFromRotation(pBone->getPreRotation()));
    if (segment.m_InversePostRotation == std::array<double, 3>{} &&
        !pBone->getPostRotation().isIdentity())
      segment.m_InversePostRotation = AnvilCore::angleAxisFromRotation(pBone->getPostRotation());
    if (segment.m_Joint.m_Name.empty())
      segment.m_Joint.m_Name =
          (parent == boneIndex.end() ? std::string("World")
                                     : m_subject.m_Segments[parent->second].m_Name) +
          "_" + segment.m_Name;
    m_subject.m_Segments.push_back(std::move(segment));
    m_application.m_Segments.push_back(pBone->applicationRecord());
    boneIndex[pBone] = index;
    boneByName.emplace(pBone->getName().GetStr(), index);
  }
  if (!pSetup->hasConstraints()) return true;

  // Markers: the setup's records, then markers only constraints name.
  m_subject.m_Markers = header.m_Markers;
  m_subject.m_Rotations = header.m_Rotations;
  m_application.m_Markers = appHeader.m_Markers;
  m_application.m_Markers.resize(m_subject.m_Markers.size());
  for (const VSubjectApplicationData::VStick& stick : appHeader.m_Sticks)
    if (stick.m_MarkerIndexA < m_subject.m_Markers.size() &&
        stick.m_MarkerIndexB < m_subject.m_Markers.size())
      m_application.m_Sticks.push_back(stick);
  std::map<std::string, uint32_t> markerByName;
  for (uint32_t i = 0; i < m_subject.m_Markers.size(); ++i)
    markerByName.emplace(m_subject.m_Markers[i].m_Name, i);
  auto markerIndex = [&](const std::string& i_rName) {
    auto it = markerByName.find(i_rName);
    if (it != markerByName.end()) return it->second;
    VSubjectParametrised::VMarker marker;
    marker.m_Name = i_rName;
    marker.m_MarkerId = NameHash(i_rName);
    marker.m_Radius = kDerivedMarkerRadius;
    m_subject.m_Markers.push_back(marker);
    m_application.m_Markers.emplace_back();
    const uint32_t index = static_cast<uint32_t>(m_subject.m_Markers.size() - 1);
    markerByName.emplace(i_rName, index);
    return index;
  };

  // Targets: constraints and clusters of the setup's class, ordered ones first.
  const HRuntimeClass* pConstraintClass = m_mode == ELabeling
                                              ? &LabelingConstraint::s_classLabelingConstraint
                                              : &SolvingConstraint::s_classSolvingConstraint;
  std::vector<Entry> entries;
  for (SubjectBone* pBone : bones)
    for (int i = 0; i < pBone->getNumChildren(); ++i) {
      Module* pChild = pBone->getChild(i);
      const bool cluster =
          m_mode == ELabeling && pChild->isKindOf(&LabelingCluster::s_classLabelingCluster);
      if (cluster || pChild->isKindOf(pConstraintClass))
        entries.push_back({static_cast<SubjectConstraint*>(pChild), boneIndex[pBone], cluster});
    }
  std::stable_sort(entries.begin(), entries.end(), [](const Entry& a, const Entry& b) {
    const int oa = a.pConstraint->getOrder(), ob = b.pConstraint->getOrder();
    return oa >= 0 && (ob < 0 || oa < ob);
  });

  bool ok = true;
  for (const Entry& entry : entries) {
    const SubjectConstraint& constraint = *entry.pConstraint;
    const std::string name = constraint.getName().GetStr();
    VSubjectParametrised::VTarget target = constraint.targetRecord();
    target.m_MarkerIndices.clear();
    target.m_RotationObservationIndices.clear();
    target.m_SegmentIndices = {entry.boneIndex};
    for (const std::string& bone : constraint.extraBoneNames()) {
      auto it = boneByName.find(bone);
      if (it == boneByName.end()) {
        fail("Constraint " + name + " of " + subjectName + " names unknown bone " + bone + ".");
        ok = false;
      } else {
        target.m_SegmentIndices.push_back(it->second);
      }
    }
    for (const std::string& rotation : constraint.rotationNames()) {
      auto it = std::find_if(m_subject.m_Rotations.begin(), m_subject.m_Rotations.end(),
                             [&](const auto& r) { return r.m_Name == rotation; });
      if (it == m_subject.m_Rotations.end()) {
        fail("Constraint " + name + " of " + subjectName + " names unknown rotation observation " +
             rotation + ".");
        ok = false;
      } else {
        target.m_RotationObservationIndices.push_back(
            static_cast<uint32_t>(it - m_subject.m_Rotations.begin()));
      }
    }
    const bool bake = i_bakeExpressions || target.m_StateExpressions.empty();
    if (entry.cluster) {
      const std::vector<SubjectConstraint*> markers = clusterMarkers(constraint);
      for (const SubjectConstraint* pMarker : markers)
        target.m_MarkerIndices.push_back(markerIndex(pMarker->getName().GetStr()));
      const size_t m = markers.size();
      if (bake || target.m_StateExpressions.size() != 3 * (m + 2)) {
        target.m_StateExpressions.clear();
        for (const auto& text :
             expressions(AnvilCore::angleAxisFromRotation(constraint.getStaticRot())))
          target.m_StateExpressions.push_back(text);
        for (const auto& text : expressions(constraint.getStaticPos()))
          target.m_StateExpressions.push_back(text);
        for (const SubjectConstraint* pMarker : markers)
          for (const auto& text : expressions(pMarker->getStaticPos()))
            target.m_StateExpressions.push_back(text);
      }
      if (target.m_Covariance.size() != 36 + 9 * m) {
        target.m_Covariance.assign(36 + 9 * m, 0.0);
        for (size_t i = 0; i < m; ++i)
          for (size_t d = 0; d < 3; ++d)
            target.m_Covariance[36 + 9 * i + 4 * d] = kDefaultMarkerVariance;
      }
    } else {
      for (const std::string& marker : constraint.markerNames())
        target.m_MarkerIndices.push_back(markerIndex(marker));
      const bool point = target.m_Type == VTargetTypeBase::ELocalPointToWorldPoint ||
                         target.m_Type == VTargetTypeBase::ELocalPointToWorldPointGaussian;
      if (point && bake) {
        const auto texts = expressions(constraint.getStaticPos());
        target.m_StateExpressions.assign(texts.begin(), texts.end());
      }
    }
    if (target.m_ViewNormals.size() != target.m_MarkerIndices.size())
      target.m_ViewNormals.assign(target.m_MarkerIndices.size(), {0.0, 0.0, 0.0});
    VSubjectApplicationData::VTarget appTarget = constraint.applicationRecord();
    if (appTarget.m_Name.empty()) appTarget.m_Name = name;
    m_subject.m_Targets.push_back(std::move(target));
    m_application.m_Targets.push_back(std::move(appTarget));
  }
  return ok;
}

bool AnvilSubjectCoreTypesConversion::populateBindPose(VSubjectParametrised& io_rSubject) const {
  if (!m_pSetup) return false;
  std::vector<SubjectBone*> bones;
  m_pSetup->collectBones(bones);
  const HTime now = g_db->getTimeManager()->getCurrentTime();
  for (VSubjectParametrised::VSegment& segment : io_rSubject.m_Segments) {
    if (JointParameterCount(segment.m_Joint.m_JointType) == 0) continue;
    auto it = std::find_if(bones.begin(), bones.end(), [&](const SubjectBone* p) {
      return segment.m_Name == p->getName().GetStr();
    });
    if (it == bones.end()) continue;
    segment.m_Joint.m_BindPose = AnvilCore::boneMotionToJoint(
        segment.m_Joint, (*it)->getPreRotation(), (*it)->getLocalPos(now), (*it)->getLocalRot(now));
  }
  return true;
}
