// The model target classes the factory knows, in the order that gives each its Type().

#include "OstraAlgo/KinematicAlgo/VCalibratedPositionTargets.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedRelativeTargets.h"

namespace KinematicAlgo {

namespace {
template <class T> VTargetFactory::Creator Make() {
  return [] { return std::make_shared<T>(); };
}
} // namespace

void RegisterModelTargets(VTargetFactory& f) {
  const char* const experimental = "This is an experimental target.  Do not use.";
  f.Register("TargetPosition", Make<VTargetPosition>(), "Position",
             "This target fits a model marker to an observed 3D reconstruction (trajectory)");
  f.Register("TargetCentreOfMass", Make<VTargetCentreOfMass>(), "Center of mass",
             "This target calculates the center of mass of a number of model markers, and fits "
             "this to an observed reconstruction.");
  f.Register("TargetPlane", Make<VTargetPlane>(), "Plane",
             "This target fits a model marker to a plane in the world, such as a floor or wall.  "
             "The marker is free to slide along the plane. ");
  f.Register("TargetOrientation", Make<VTargetOrientation>(), "Orientation",
             "This target can be used to constrain a segment (bone) to be orientated relative to "
             "the world.");
  f.Register("TargetPositionWithRange", Make<VTargetPositionWithRange>(),
             "Position in segment with range", experimental);
  f.Register("TargetPositionWithCovariance", Make<VTargetPositionWithCovariance>(),
             "Position in segment with covariance",
             "This target fits a model marker to an observed 3D reconstruction (trajectory) "
             "weighted according to the calibrated covariances");
  f.Register("TargetPositionCovarianceRange", Make<VTargetPositionCovarianceRange>(),
             "Position in segment with covariance and range",
             "This target represents the trajectory as a range ellipse and a centre.  It is "
             "intended for labelling.");
  f.Register("TargetPositionCovarianceRangeNormal", Make<VTargetPositionCovarianceRangeNormal>(),
             "Position in segment with covariance, range and normals",
             "This target represents the trajectory as a range ellipse and a centre, along with "
             "the view normal.  It is intended for labelling.");
  f.Register("TargetPositionCovarianceDescriptor", Make<VTargetPositionCovarianceDescriptor>(),
             "Position in segment with covariance and descriptor", experimental);
  f.Register("TargetSegmentRay", Make<VTargetSegmentRay>(), "Ray in segment",
             "This target defines a ray relative to a segment (bone), and ensures that the 3D "
             "reconstruction lies along the ray.  This can be used to make a character 'look-at' "
             "a specific point in the world.");
  f.Register("TargetSegmentPlane", Make<VTargetSegmentPlane>(), "Plane in segment",
             "This target defines a plane relative to a segment (bone), and ensures that the 3D "
             "reconstruction lies on the bone.  Also known as a twist constraint.");
  f.Register("TargetRelativePosition", Make<VTargetRelativePosition>(), "Relative position",
             "This target minimises the difference between two markers on the same subject.  "
             "This can be used to fix the two hands a certain distance apart.");
  f.Register("TargetRelativeOrientation", Make<VTargetRelativeOrientation>(),
             "Relative orientation",
             "This target minimises the difference between the orientation of two segments.");
  f.Register("TargetRelativeRay", Make<VTargetRelativeRay>(), "Relative ray",
             "This target defines a ray from one segment to a marker on another segment.   This "
             "can be used to make a subject look at his big toe.");
  f.Register("TargetRigidBody", Make<VTargetRigidBody>(), "Rigid body",
             "This target fits a group of model markers that keep their places relative to each "
             "other to their observed 3D reconstructions.");
  // Not a class of the user's list: made from direction records only.
  f.Register("TargetDirection", Make<VTargetDirection>(), "Direction",
             "This target fits a direction fixed in a segment (bone) to an observed direction in "
             "the world.");
}

} // namespace KinematicAlgo
