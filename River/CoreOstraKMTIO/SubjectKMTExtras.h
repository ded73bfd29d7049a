#pragma once
// Values the subject file language needs that the subject records don't hold.

#include <array>
#include <map>
#include <string>
#include <vector>

namespace CoreOstraKMTIO {

struct VSubjectKMTExtras {
  struct VSegment {
    std::array<double, 3> m_PreRotation{};    ///< evaluated PreRotation (radians)
    std::array<double, 3> m_PreTranslation{}; ///< evaluated PreTranslation
    /// POST-ORIENTATION and POST-POSITION of files before 3.2, as expressions.
    std::array<std::string, 3> m_PostRotation;
    std::array<std::string, 3> m_PostTranslation;
    bool m_HasPost = false;
    /// The joint's AXIS (3 numbers) or AXIS-PAIR (6); empty when the file had none.
    std::vector<double> m_Axes;
    bool m_HasAxes = false;
    /// The joint's T values as read, unset entries included; joined into TPoseConstraints.
    std::vector<double> m_TPose;
    bool m_HasTPose = false;
    /// Retired attributes kept as text, by attribute name.
    std::map<std::string, std::string> m_SegmentStrings; ///< COVARIANCE, SIZE
    std::map<std::string, std::string> m_JointStrings;   ///< EDIT_POSE_MEAN, T-POSE, BOUNDS
  };
  /// Retired attributes of a marker or target (DESCRIPTOR, PLACEMENT-COVARIANCE), by name.
  struct VItem {
    std::map<std::string, std::string> m_Strings;
  };

  std::vector<VSegment> m_Segments;
  std::vector<VItem> m_Markers;
  std::vector<VItem> m_Targets;
  std::string m_SkeletonName; ///< Skeleton NAME
};

} // namespace CoreOstraKMTIO
