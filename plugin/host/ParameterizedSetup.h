#pragma once
#include "Node.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "TSimpleArray.h"
#include <vector>

class SubjectBone;

/// A subject's model for one task (labeling, solving, retargeting): a tree of bones under one
/// root bone, the constraints that tie markers to them, and the subject-wide records the bones
/// and constraints do not hold.
class ANVIL_HOST_API ParameterizedSetup : public Node {
  H_DECLARE_RUNTIME_CLASS(ParameterizedSetup)
public:
  /// The first bone child; with `i_single`, null unless there is exactly one.
  SubjectBone* getRootBone(bool i_single) const;
  /// The setup's model of joint parameters as principal components (empty when none).
  const CoreOstraTypes::VSubjectDynamicSubspace& getSubspace() const { return m_subspace; }
  void setSubspace(const CoreOstraTypes::VSubjectDynamicSubspace& i_r) { m_subspace = i_r; }

  /// Subject-wide parts: model names, static and dynamic parameters, T-pose constraints, marker
  /// records (in the subject's order) and rotation observations. Its segments and targets are
  /// unused: bones and constraints hold those.
  CoreOstraTypes::VSubjectParametrised& subjectRecord() { return m_subject; }
  const CoreOstraTypes::VSubjectParametrised& subjectRecord() const { return m_subject; }
  /// Colours, skin, retarget source, one marker entry per marker record, and sticks whose
  /// indices point into the marker records. Its segments and targets are unused.
  CoreOstraTypes::VSubjectApplicationData& applicationRecord() { return m_application; }
  const CoreOstraTypes::VSubjectApplicationData& applicationRecord() const { return m_application; }

  /// Every bone of the tree below the root bone, depth first, the root first.
  void collectBones(std::vector<SubjectBone*>& o_rBones) const;
  /// The class of this setup's bones.
  virtual const HRuntimeClass* getBoneClass() const = 0;
  /// Whether this setup's bones carry constraints (labeling and solving setups do).
  virtual bool hasConstraints() const = 0;

protected:
  explicit ParameterizedSetup(const HString& i_rName);

private:
  CoreOstraTypes::VSubjectParametrised m_subject;
  CoreOstraTypes::VSubjectApplicationData m_application;
  CoreOstraTypes::VSubjectDynamicSubspace m_subspace;
};

/// Fills `o_rBones` with the setup's bones of class `T`, depth first.
template <typename T>
void collectSetupBones(const ParameterizedSetup& i_rSetup, TSimpleArray<T*>& o_rBones) {
  std::vector<SubjectBone*> bones;
  i_rSetup.collectBones(bones);
  for (SubjectBone* p : bones)
    o_rBones.add(static_cast<T*>(p));
}
