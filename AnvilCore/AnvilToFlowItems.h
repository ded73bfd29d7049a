#pragma once
// The host's side of turning a take into Flow items, frame by frame: what the convertor keeps for
// the whole take (the markers in scene order, the subjects' bones, the cameras, the items every
// frame shares) so that each frame only reads keys and fills pooled items.
#include "Flow2/Flow2Types/CreateFlowItem.h"
#include "Flow2/Flow2Types/IFlowHandles.h"
#include "Flow2/Flow2Types/IFlowState.h"
#include "Flow2/Flow2Types/IFlowStore.h"
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

class Marker;
class OpticalCamera;
class SubjectBone;

namespace AnvilCore::FlowItems {

/// The label a trajectory is recorded under: "Subject:Marker" for a marker of a top-level
/// character, its own name otherwise.
std::string trajectoryLabel(const Marker& i_rMarker);

struct DynamicFlags {
  bool cameras = false;
  bool subjectPoses = false;
  bool subjectLocalPoses = false;
  bool trajectories = false;
  bool forSolving = false;
  bool orientation = false;
};

class TakeConverter {
public:
  /// The converter of the take that `i_tick` continues in `io_rStore`: the current one when the
  /// store is the same and the tick comes later than the last, otherwise a fresh one built from
  /// the scene as it is now.
  static TakeConverter& forTick(ZMT::IFlowStoreHandle& io_rStore, std::int64_t i_tick);

  void convert(ZMT::IFlowState& io_rState, std::int64_t i_tick, const DynamicFlags& i_rFlags);
  /// Lets go of the store and the shared items after the play range's last frame.
  void finishIfLast(std::int64_t i_tick);

  TakeConverter() = default;
  TakeConverter(const TakeConverter&) = delete;
  TakeConverter& operator=(const TakeConverter&) = delete;

private:
  struct Subject {
    std::uint32_t id = 0;
    std::vector<const SubjectBone*> bones;
    std::vector<const Marker*> markers; ///< the labeling subject's markers; null when absent
  };
  struct Camera {
    std::string urn;
    double rotation[9] = {}; ///< camera axes to world axes, row major
    double position[3] = {};
    double focal = 0.0;
    double principal[2] = {};
    double width = 0.0, height = 0.0;
  };

  void build(ZMT::IFlowStoreHandle& io_rStore);
  void release();
  void addTrajectories(ZMT::IFlowState& io_rState, std::int64_t i_tick, bool i_forSolving);
  void addSubjectPoses(ZMT::IFlowState& io_rState, std::int64_t i_tick, bool i_world);
  void addCentroids(ZMT::IFlowState& io_rState, std::int64_t i_tick);
  void addOrientation(ZMT::IFlowState& io_rState);

  ZMT::IFlowStoreHandle m_store;
  std::int64_t m_lastTick = 0;
  std::vector<const Marker*> m_markers;
  std::vector<float> m_labelScores;
  std::vector<Subject> m_subjects;
  std::vector<Camera> m_cameras;
  ZMT::IFlowItemHandle m_table;
  ZMT::IFlowItemHandle m_orientation;
  /// Positions of the frame's keyed markers, with their track ids: filled once per frame.
  std::vector<std::array<double, 3>> m_positions;
  std::vector<std::uint32_t> m_tracks;
};

} // namespace AnvilCore::FlowItems
