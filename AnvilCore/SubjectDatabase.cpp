// The database's scene-wide lists of labeling bones, constraints and clusters.
#include "plugin/host/Database.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"

namespace {
int countOf(const Database& i_rDb, const HRuntimeClass* i_pClass) {
  int count = 0;
  for (Module* p : i_rDb.getModules())
    if (p->isKindOf(i_pClass)) ++count;
  return count;
}

template <typename T> T* nthOf(const Database& i_rDb, const HRuntimeClass* i_pClass, int i_index) {
  if (i_index < 0) return nullptr;
  for (Module* p : i_rDb.getModules())
    if (p->isKindOf(i_pClass) && i_index-- == 0) return static_cast<T*>(p);
  return nullptr;
}
} // namespace

int Database::getNumLabelingBones() const {
  return countOf(*this, &LabelingBone::s_classLabelingBone);
}
LabelingBone* Database::getLabelingBone(int i_index) const {
  return nthOf<LabelingBone>(*this, &LabelingBone::s_classLabelingBone, i_index);
}
int Database::getNumLabelingConstraints() const {
  return countOf(*this, &LabelingConstraint::s_classLabelingConstraint);
}
LabelingConstraint* Database::getLabelingConstraint(int i_index) const {
  return nthOf<LabelingConstraint>(*this, &LabelingConstraint::s_classLabelingConstraint, i_index);
}
int Database::getNumLabelingClusters() const {
  return countOf(*this, &LabelingCluster::s_classLabelingCluster);
}
LabelingCluster* Database::getLabelingCluster(int i_index) const {
  return nthOf<LabelingCluster>(*this, &LabelingCluster::s_classLabelingCluster, i_index);
}
