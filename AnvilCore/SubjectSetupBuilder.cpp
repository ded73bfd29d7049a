#include "SubjectSetupBuilder.h"
#include "River/CoreOstraTypesUtils/ExpressionParsers.h"
#include "SubjectJointPose.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/Marker.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingConstraint.h"
#include "plugin/host/SolvingSetup.h"

using namespace CoreOstraTypes;

namespace AnvilCore {

namespace {
// Evaluates expression texts of one subject, collecting what fails.
class Evaluator {
public:
  Evaluator(const VSubjectParametrised& i_rSubject, std::vector<std::string>& o_rErrors)
      : m_rErrors(o_rErrors) {
    m_ok = m_parser.SetParameters(i_rSubject, o_rErrors);
  }
  bool ok() const { return m_ok; }
  double value(const std::string& i_rText, const std::string& i_rWhere) {
    double result = 0.0;
    std::string message;
    if (!m_parser.Evaluate(i_rText, result, message)) {
      m_rErrors.push_back("Could not evaluate " + i_rWhere + " \"" + i_rText + "\": " + message);
      m_ok = false;
      return 0.0;
    }
    return result;
  }
  template <size_t N>
  std::array<double, N> values(const std::array<std::string, N>& i_rTexts,
                               const std::string& i_rWhere) {
    std::array<double, N> result{};
    for (size_t i = 0; i < N; ++i)
      result[i] = value(i_rTexts[i], i_rWhere);
    return result;
  }
  Vec3 vec3(const std::vector<std::string>& i_rTexts, size_t i_first, const std::string& i_rWhere) {
    Vec3 result;
    for (int i = 0; i < 3; ++i)
      result[i] = i_first + i < i_rTexts.size() ? value(i_rTexts[i_first + i], i_rWhere) : 0.0;
    return result;
  }

private:
  CoreOstraTypesUtils::VDynamicExpressionParserSimple m_parser;
  std::vector<std::string>& m_rErrors;
  bool m_ok = true;
};

Vec3 toVec3(const std::array<double, 3>& i_r) {
  return Vec3(i_r[0], i_r[1], i_r[2]);
}

std::unique_ptr<ParameterizedSetup> makeSetup(ESetupKind i_kind, const std::string& i_rName) {
  const HString name(i_rName);
  switch (i_kind) {
  case ESetupKind::ELabeling:
    return std::make_unique<LabelingSetup>(name);
  case ESetupKind::ESolving:
    return std::make_unique<SolvingSetup>(name);
  default:
    return std::make_unique<RetargetingSetup>(name);
  }
}

SubjectBone* makeBone(ESetupKind i_kind, const std::string& i_rName) {
  const HString name(i_rName);
  switch (i_kind) {
  case ESetupKind::ELabeling:
    return new LabelingBone(name);
  case ESetupKind::ESolving:
    return new SolvingBone(name);
  default:
    return new RetargetingBone(name);
  }
}

SubjectConstraint* makeConstraint(ESetupKind i_kind, const std::string& i_rName) {
  if (i_kind == ESetupKind::ELabeling) return new LabelingConstraint(HString(i_rName));
  return new SolvingConstraint(HString(i_rName));
}

std::string targetName(const VSubjectParametrised& i_rSubject,
                       const VSubjectApplicationData& i_rApp, size_t i_index) {
  if (i_index < i_rApp.m_Targets.size() && !i_rApp.m_Targets[i_index].m_Name.empty())
    return i_rApp.m_Targets[i_index].m_Name;
  const VSubjectParametrised::VTarget& target = i_rSubject.m_Targets[i_index];
  if (!target.m_MarkerIndices.empty() && target.m_MarkerIndices[0] < i_rSubject.m_Markers.size())
    return i_rSubject.m_Markers[target.m_MarkerIndices[0]].m_Name;
  return "Target" + std::to_string(i_index + 1);
}

bool hasConstraints(ESetupKind i_kind) {
  return i_kind != ESetupKind::ERetargeting;
}

// Adds the targets of the records as constraints under `i_rBones`.
void addConstraints(ESetupKind i_kind, const SubjectRecords& i_rRecords,
                    const std::vector<SubjectBone*>& i_rBones, Evaluator& io_rEval,
                    std::vector<std::string>& o_rErrors) {
  const VSubjectParametrised& subject = i_rRecords.subject;
  auto markerName = [&](uint32_t i_index) {
    return i_index < subject.m_Markers.size() ? subject.m_Markers[i_index].m_Name : std::string();
  };
  for (size_t t = 0; t < subject.m_Targets.size(); ++t) {
    const VSubjectParametrised::VTarget& target = subject.m_Targets[t];
    const std::string name = targetName(subject, i_rRecords.application, t);
    if (target.m_SegmentIndices.empty() || target.m_SegmentIndices[0] >= i_rBones.size()) {
      o_rErrors.push_back("Target " + name + " has no valid segment");
      continue;
    }
    SubjectBone* pBone = i_rBones[target.m_SegmentIndices[0]];
    const bool cluster =
        i_kind == ESetupKind::ELabeling && target.m_Type == VTargetTypeBase::ERigidBody;
    SubjectConstraint* pConstraint =
        cluster ? new LabelingCluster(HString(name)) : makeConstraint(i_kind, name);
    pBone->addChild(pConstraint);
    pConstraint->targetRecord() = target;
    if (t < i_rRecords.application.m_Targets.size())
      pConstraint->applicationRecord() = i_rRecords.application.m_Targets[t];
    pConstraint->setOrder(static_cast<int>(t));
    pConstraint->markerNames().clear();
    for (uint32_t m : target.m_MarkerIndices) {
      if (m >= subject.m_Markers.size())
        o_rErrors.push_back("Target " + name + " has a bad marker index");
      else if (!cluster)
        pConstraint->markerNames().push_back(markerName(m));
    }
    for (uint32_t r : target.m_RotationObservationIndices) {
      if (r < subject.m_Rotations.size())
        pConstraint->rotationNames().push_back(subject.m_Rotations[r].m_Name);
      else
        o_rErrors.push_back("Target " + name + " has a bad rotation observation index");
    }
    for (size_t s = 1; s < target.m_SegmentIndices.size(); ++s) {
      if (target.m_SegmentIndices[s] < i_rBones.size())
        pConstraint->extraBoneNames().push_back(
            i_rBones[target.m_SegmentIndices[s]]->getName().GetStr());
      else
        o_rErrors.push_back("Target " + name + " has a bad segment index");
    }
    const std::string where = "the state of target " + name;
    const auto& state = target.m_StateExpressions;
    if (cluster) {
      const Vec3 orientation = io_rEval.vec3(state, 0, where);
      pConstraint->setStaticTransform(
          io_rEval.vec3(state, 3, where),
          rotationFromAngleAxis({orientation.x, orientation.y, orientation.z}), Vec3(1, 1, 1));
      for (size_t m = 0; m < target.m_MarkerIndices.size(); ++m) {
        auto* pMarker = new LabelingConstraint(HString(markerName(target.m_MarkerIndices[m])));
        pMarker->setStaticTransform(io_rEval.vec3(state, 6 + 3 * m, where), AnvilRotation(),
                                    Vec3(1, 1, 1));
        pConstraint->addChild(pMarker);
      }
    } else if (target.m_Type == VTargetTypeBase::ELocalPointToWorldPoint ||
               target.m_Type == VTargetTypeBase::ELocalPointToWorldPointGaussian) {
      pConstraint->setStaticTransform(io_rEval.vec3(state, 0, where), AnvilRotation(),
                                      Vec3(1, 1, 1));
    }
  }
}
} // namespace

std::unique_ptr<ParameterizedSetup> buildSetup(ESetupKind i_kind, const std::string& i_rName,
                                               const SubjectRecords& i_rRecords,
                                               std::vector<std::string>& o_rErrors) {
  const size_t errorCount = o_rErrors.size();
  const VSubjectParametrised& subject = i_rRecords.subject;
  Evaluator eval(subject, o_rErrors);
  std::unique_ptr<ParameterizedSetup> pSetup = makeSetup(i_kind, i_rName);

  VSubjectParametrised& header = pSetup->subjectRecord();
  header = subject;
  header.m_Segments.clear();
  header.m_Targets.clear();
  VSubjectApplicationData& appHeader = pSetup->applicationRecord();
  appHeader = i_rRecords.application;
  appHeader.m_Segments.clear();
  appHeader.m_Targets.clear();
  if (!hasConstraints(i_kind)) {
    header.m_Markers.clear();
    header.m_Rotations.clear();
    appHeader.m_Markers.clear();
    appHeader.m_Sticks.clear();
  }
  pSetup->setSubspace(i_rRecords.subspace);

  std::vector<SubjectBone*> bones;
  for (size_t i = 0; i < subject.m_Segments.size(); ++i) {
    const VSubjectParametrised::VSegment& segment = subject.m_Segments[i];
    SubjectBone* pBone = makeBone(i_kind, segment.m_Name);
    Module* pParent = pSetup.get();
    if (segment.m_ParentSegmentIndex.IsSet()) {
      if (segment.m_ParentSegmentIndex.Value() < i) {
        pParent = bones[segment.m_ParentSegmentIndex.Value()];
      } else {
        o_rErrors.push_back("Segment " + segment.m_Name + " has a bad parent index");
      }
    }
    pParent->addChild(pBone);
    bones.push_back(pBone);
    pBone->segmentRecord() = segment;
    if (i < i_rRecords.application.m_Segments.size())
      pBone->applicationRecord() = i_rRecords.application.m_Segments[i];
    pBone->setPreTranslation(toVec3(
        eval.values(segment.m_PreTranslation, "the pre-translation of segment " + segment.m_Name)));
    pBone->setPreRotation(rotationFromAngleAxis(
        eval.values(segment.m_PreRotation, "the pre-rotation of segment " + segment.m_Name)));
    pBone->setPostRotation(rotationFromAngleAxis(segment.m_InversePostRotation));
    Vec3 translation;
    AnvilRotation rotation;
    jointToBoneMotion(segment.m_Joint, pBone->getPreRotation(), segment.m_Joint.m_BindPose,
                      translation, rotation);
    pBone->setStaticTransform(translation, rotation, Vec3(1, 1, 1));
  }
  if (hasConstraints(i_kind)) addConstraints(i_kind, i_rRecords, bones, eval, o_rErrors);
  if (!eval.ok() || o_rErrors.size() != errorCount) return nullptr;
  return pSetup;
}

Character* addSubjectToScene(const SubjectRecords& i_rRecords,
                             std::vector<std::string>& o_rErrors) {
  const std::string& name = i_rRecords.subject.m_Name;
  if (name.empty()) {
    o_rErrors.push_back("The subject has no name");
    return nullptr;
  }
  std::unique_ptr<ParameterizedSetup> setups[3];
  const ESetupKind kinds[3] = {ESetupKind::ELabeling, ESetupKind::ESolving,
                               ESetupKind::ERetargeting};
  for (int i = 0; i < 3; ++i) {
    setups[i] = buildSetup(kinds[i], name, i_rRecords, o_rErrors);
    if (!setups[i]) return nullptr;
  }

  Module* pRoot = g_db->getRoot();
  Character* pCharacter = nullptr;
  std::vector<Marker*> prefixed;
  const std::string prefix = name + ":";
  for (int i = 0; i < pRoot->getNumChildren(); ++i) {
    Module* p = pRoot->getChild(i);
    const std::string childName = p->getName().GetStr();
    if (!pCharacter && p->isKindOf(&Character::s_classCharacter) && childName == name)
      pCharacter = static_cast<Character*>(p);
    else if (p->isKindOf(&Marker::s_classMarker) && childName.size() > prefix.size() &&
             childName.compare(0, prefix.size(), prefix) == 0)
      prefixed.push_back(static_cast<Marker*>(p));
  }
  if (!pCharacter) {
    pCharacter = new Character(HString(name));
    g_db->addToScene(pCharacter, false, nullptr, false, false);
  }
  for (int i = pCharacter->getNumChildren() - 1; i >= 0; --i)
    if (pCharacter->getChild(i)->isKindOf(&ParameterizedSetup::s_classParameterizedSetup))
      g_db->removeFromScene(pCharacter->getChild(i), false, false, false);
  for (Marker* pMarker : prefixed) {
    pMarker->setName(HString(pMarker->getName().GetStr() + prefix.size()));
    pMarker->setUnlabeled(false);
    g_db->addToScene(pMarker, false, pCharacter, false, false);
  }
  for (auto& pSetup : setups)
    g_db->addToScene(pSetup.release(), false, pCharacter, false, false);
  return pCharacter;
}

} // namespace AnvilCore
