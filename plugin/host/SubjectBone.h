#pragma once
#include "Node.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

/// One segment of a setup's skeleton. Its node transform is the segment's pose in its parent:
/// pre-translation and pre-rotation are the segment's pre transform, the animated translation
/// and rotation are the joint's motion, and the post-rotation is the inverse post rotation.
/// Child bones are segments below it.
class ANVIL_HOST_API SubjectBone : public Node {
  H_DECLARE_RUNTIME_CLASS(SubjectBone)
public:
  /// The segment's record: joint, expressions, mass, bounds. Its name and indices are not used
  /// (the bone's name and place in the tree give them). Pre-transform expressions left empty
  /// are taken from the node's pre-translation and pre-rotation.
  CoreOstraTypes::VSubjectParametrised::VSegment& segmentRecord() { return m_segment; }
  const CoreOstraTypes::VSubjectParametrised::VSegment& segmentRecord() const { return m_segment; }
  CoreOstraTypes::VSubjectApplicationData::VSegment& applicationRecord() { return m_application; }
  const CoreOstraTypes::VSubjectApplicationData::VSegment& applicationRecord() const {
    return m_application;
  }
  CoreOstraTypes::VJointTypeBase::EJointType getJointType() const {
    return m_segment.m_Joint.m_JointType;
  }
  /// Sets the joint type and its orientation (angle-axis, radians; see JointAxes.h).
  void setJoint(CoreOstraTypes::VJointTypeBase::EJointType i_type,
                const std::array<double, 3>& i_rOrientation = {});

  /// Child bones of the same class, in child order.
  void getChildBones(std::vector<SubjectBone*>& o_rBones) const;

protected:
  explicit SubjectBone(const HString& i_rName);

private:
  CoreOstraTypes::VSubjectParametrised::VSegment m_segment;
  CoreOstraTypes::VSubjectApplicationData::VSegment m_application;
};
