#pragma once
#include <array>
#include <string>

namespace AnvilCore {

/// Reads a camera calibration document (VERSION "1.0" or "2.0") into the scene: one optical
/// camera per `Camera` element, the floor's extents and the up axis. On failure returns false
/// with a message naming the element and attribute at fault, and the scene is unchanged.
/// `i_source` names the document in messages.
bool readXcpDocument(const std::string& i_text, const std::string& i_source, std::string& o_rError);

/// The rotation vector whose quaternion (as the document writer computes it) is `i_rQ` (x, y, z,
/// w), bit for bit where such a vector exists near the exact inverse; otherwise the nearest one
/// found. A quaternion need not be of unit length.
std::array<double, 3> rotationVectorOfQuaternion(const std::array<double, 4>& i_rQ);

} // namespace AnvilCore
