#pragma once
#include "Node.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include <string>
#include <vector>

/// A target of a setup: ties markers (or rotation observations) to the bone it hangs under.
/// For a point target the node's local translation is the marker's place on the bone.
class ANVIL_HOST_API SubjectConstraint : public Node {
  H_DECLARE_RUNTIME_CLASS(SubjectConstraint)
public:
  /// The target's record: type, weight, covariances, state expressions. Its index vectors are
  /// not used: the names below and the parent bone give them. Empty state expressions of a
  /// point target are taken from the node's local translation. A new constraint is a
  /// `ELocalPointToWorldPoint` target.
  CoreOstraTypes::VSubjectParametrised::VTarget& targetRecord() { return m_target; }
  const CoreOstraTypes::VSubjectParametrised::VTarget& targetRecord() const { return m_target; }
  CoreOstraTypes::VSubjectApplicationData::VTarget& applicationRecord() { return m_application; }
  const CoreOstraTypes::VSubjectApplicationData::VTarget& applicationRecord() const {
    return m_application;
  }

  /// Markers of the target, by name; a new constraint names the marker of its own name.
  std::vector<std::string>& markerNames() { return m_markers; }
  const std::vector<std::string>& markerNames() const { return m_markers; }
  /// Rotation observations of the target, by name.
  std::vector<std::string>& rotationNames() { return m_rotations; }
  const std::vector<std::string>& rotationNames() const { return m_rotations; }
  /// Bones the target involves after its parent bone, by name.
  std::vector<std::string>& extraBoneNames() { return m_extraBones; }
  const std::vector<std::string>& extraBoneNames() const { return m_extraBones; }
  /// Place of the target in the subject's list; -1 places it after ordered ones, in tree order.
  int getOrder() const { return m_order; }
  void setOrder(int i_order) { m_order = i_order; }

protected:
  explicit SubjectConstraint(const HString& i_rName);

private:
  CoreOstraTypes::VSubjectParametrised::VTarget m_target;
  CoreOstraTypes::VSubjectApplicationData::VTarget m_application;
  std::vector<std::string> m_markers;
  std::vector<std::string> m_rotations;
  std::vector<std::string> m_extraBones;
  int m_order = -1;
};
