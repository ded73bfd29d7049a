#pragma once
#include "SubjectConstraint.h"

/// A rigid cluster of markers on a `LabelingBone`: one `ERigidBody` target. Its node transform is
/// the body's fixed offset on the bone (the state's orientation and position triples); its
/// `LabelingConstraint` children are the markers, their local translations the markers' places in
/// the body. Its marker names are those children's names.
class ANVIL_HOST_API LabelingCluster : public SubjectConstraint {
  H_DECLARE_RUNTIME_CLASS(LabelingCluster)
public:
  explicit LabelingCluster(const HString& i_rName = HString());
};
