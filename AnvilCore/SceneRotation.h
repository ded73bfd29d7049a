#pragma once
#include "plugin/host/AnvilRotation.h"
#include "plugin/host/Vec3.h"

namespace AnvilCoreImpl {
/// Applies the scene rotation now in force (`Database::rotateScene`) to a world value.
void applySceneRotation(Vec3& io_rPos);
void applySceneRotation(Vec3& io_rPos, AnvilRotation& io_rRot);
/// Rotation matrix of `i_degrees` about axis 0, 1 or 2; quarter turns have exact entries.
void axisRotationMatrix(double i_degrees, int i_axis, double o_m[9]);
} // namespace AnvilCoreImpl
