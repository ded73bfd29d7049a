// The subject's setups, bones and constraints, and the character's access to its setups.
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingConstraint.h"
#include "plugin/host/SolvingSetup.h"

H_IMPLEMENT_RUNTIME_CLASS(ParameterizedSetup, Node)
H_IMPLEMENT_RUNTIME_CLASS(LabelingSetup, ParameterizedSetup)
H_IMPLEMENT_RUNTIME_CLASS(SolvingSetup, ParameterizedSetup)
H_IMPLEMENT_RUNTIME_CLASS(RetargetingSetup, ParameterizedSetup)
H_IMPLEMENT_RUNTIME_CLASS(SubjectBone, Node)
H_IMPLEMENT_RUNTIME_CLASS(LabelingBone, SubjectBone)
H_IMPLEMENT_RUNTIME_CLASS(SolvingBone, SubjectBone)
H_IMPLEMENT_RUNTIME_CLASS(RetargetingBone, SubjectBone)
H_IMPLEMENT_RUNTIME_CLASS(SubjectConstraint, Node)
H_IMPLEMENT_RUNTIME_CLASS(LabelingConstraint, SubjectConstraint)
H_IMPLEMENT_RUNTIME_CLASS(SolvingConstraint, SubjectConstraint)
H_IMPLEMENT_RUNTIME_CLASS(LabelingCluster, SubjectConstraint)

ParameterizedSetup::ParameterizedSetup(const HString& i_rName) : Node(i_rName) {}

SubjectBone* ParameterizedSetup::getRootBone(bool i_single) const {
  const HRuntimeClass* pClass = getBoneClass();
  if (i_single && getNumChildrenOfType(pClass) != 1) return nullptr;
  for (int i = 0; i < getNumChildren(); ++i)
    if (getChild(i)->isKindOf(pClass)) return static_cast<SubjectBone*>(getChild(i));
  return nullptr;
}

namespace {
void collectFrom(SubjectBone* i_pBone, std::vector<SubjectBone*>& o_rBones) {
  o_rBones.push_back(i_pBone);
  std::vector<SubjectBone*> children;
  i_pBone->getChildBones(children);
  for (SubjectBone* pChild : children)
    collectFrom(pChild, o_rBones);
}
} // namespace

void ParameterizedSetup::collectBones(std::vector<SubjectBone*>& o_rBones) const {
  if (SubjectBone* pRoot = getRootBone(false)) collectFrom(pRoot, o_rBones);
}

#define ANVIL_SETUP_BODY(Setup, Bone)                                                              \
  Setup::Setup(const HString& i_rName) : ParameterizedSetup(i_rName) {}                            \
  Bone* Setup::getRootBone() const {                                                               \
    return static_cast<Bone*>(getRootBone(false));                                                 \
  }                                                                                                \
  const HRuntimeClass* Setup::getBoneClass() const {                                               \
    return &Bone::s_class##Bone;                                                                   \
  }

ANVIL_SETUP_BODY(LabelingSetup, LabelingBone)
ANVIL_SETUP_BODY(SolvingSetup, SolvingBone)
ANVIL_SETUP_BODY(RetargetingSetup, RetargetingBone)

void LabelingSetup::getBones(TSimpleArray<LabelingBone*>& o_rBones) const {
  collectSetupBones(*this, o_rBones);
}
void SolvingSetup::getBones(TSimpleArray<SolvingBone*>& o_rBones) const {
  collectSetupBones(*this, o_rBones);
}
void RetargetingSetup::getBones(TSimpleArray<RetargetingBone*>& o_rBones,
                                bool i_includeRoot) const {
  TSimpleArray<RetargetingBone*> all;
  collectSetupBones(*this, all);
  for (int i = i_includeRoot ? 0 : 1; i < all.getCount(); ++i)
    o_rBones.add(all[i]);
}

SubjectBone::SubjectBone(const HString& i_rName) : Node(i_rName) {}

void SubjectBone::setJoint(CoreOstraTypes::VJointTypeBase::EJointType i_type,
                           const std::array<double, 3>& i_rOrientation) {
  m_segment.m_Joint.m_JointType = i_type;
  m_segment.m_Joint.m_JointOrientation = i_rOrientation;
}

void SubjectBone::getChildBones(std::vector<SubjectBone*>& o_rBones) const {
  const HRuntimeClass* pClass = getRuntimeClass();
  for (int i = 0; i < getNumChildren(); ++i)
    if (getChild(i)->isKindOf(pClass)) o_rBones.push_back(static_cast<SubjectBone*>(getChild(i)));
}

LabelingBone::LabelingBone(const HString& i_rName) : SubjectBone(i_rName) {}
SolvingBone::SolvingBone(const HString& i_rName) : SubjectBone(i_rName) {}
RetargetingBone::RetargetingBone(const HString& i_rName) : SubjectBone(i_rName) {}

SubjectConstraint::SubjectConstraint(const HString& i_rName)
    : Node(i_rName), m_markers{std::string(i_rName.GetStr())} {
  m_target.m_Type = CoreOstraTypes::VTargetTypeBase::ELocalPointToWorldPoint;
  m_application.m_Name = i_rName.GetStr();
}

LabelingConstraint::LabelingConstraint(const HString& i_rName) : SubjectConstraint(i_rName) {}
SolvingConstraint::SolvingConstraint(const HString& i_rName) : SubjectConstraint(i_rName) {}
LabelingCluster::LabelingCluster(const HString& i_rName) : SubjectConstraint(i_rName) {
  markerNames().clear();
  targetRecord().m_Type = CoreOstraTypes::VTargetTypeBase::ERigidBody;
}

namespace {
template <typename TSetup>
TSetup* setupOf(Character& io_rCharacter, const HRuntimeClass* i_pClass, bool i_create) {
  for (int i = 0; i < io_rCharacter.getNumChildren(); ++i)
    if (io_rCharacter.getChild(i)->isKindOf(i_pClass))
      return static_cast<TSetup*>(io_rCharacter.getChild(i));
  if (!i_create) return nullptr;
  auto* pSetup = new TSetup(io_rCharacter.getName());
  g_db->addChild(&io_rCharacter, pSetup);
  return pSetup;
}
} // namespace

LabelingSetup* Character::getLabelingSetup(bool i_create) {
  return setupOf<LabelingSetup>(*this, &LabelingSetup::s_classLabelingSetup, i_create);
}
SolvingSetup* Character::getSolvingSetup(bool i_create) {
  return setupOf<SolvingSetup>(*this, &SolvingSetup::s_classSolvingSetup, i_create);
}
RetargetingSetup* Character::getRetargetingSetup(bool i_create) {
  return setupOf<RetargetingSetup>(*this, &RetargetingSetup::s_classRetargetingSetup, i_create);
}
