#pragma once
// Turns the scene into Flow items: the static items of cameras and subjects, and the items of one
// frame (trajectories, subject poses, camera observations, scene orientation).
//
// What each list holds, in the order the host fills it:
//   cameras   four lists parallel to the names, one entry per camera converted, in the
//             database's order: a "FlowCameraHardware", b "FlowCameraCalibration" (focal
//             length 0 for a camera that is not calibrated), c "FlowCameraCalibrationDetails",
//             d "FlowCameraMaskGrid". Without calibrations, lists b and c stay empty.
//   subjects  for the labeling, solving and retargeting setups in that order, four lists each:
//             the parametrised subject, the subject evaluated at its own parameters, the
//             application data, the dynamic subspace ("FlowSubjectParametrised",
//             "FlowSubject", "FlowSubjectApplicationData", "FlowSubjectDynamicSubspace", then
//             the "ForSolving" and "ForRetargeting" types). One item per subject that has the
//             setup, in subject order; subject ids are 1-based subject indices.
#include "Flow2/Flow2Types/IFlowHandles.h"
#include "Flow2/Flow2Types/IFlowState.h"
#include "HostExport.h"
#include <cstdint>
#include <string>
#include <vector>

class ANVIL_HOST_API AnvilToFlowConvertor {
public:
  using Items = std::vector<ZMT::IFlowItemHandle>;

  AnvilToFlowConvertor();
  ~AnvilToFlowConvertor();
  AnvilToFlowConvertor(const AnvilToFlowConvertor&) = delete;
  AnvilToFlowConvertor& operator=(const AnvilToFlowConvertor&) = delete;

  /// The static items of the scene's optical cameras into the four lists (see above).
  /// `i_optical`: convert them at all; `i_video`: also those flagged as video (DV) cameras;
  /// `i_calibrations`: fill lists b and c. False when an item can't be made.
  bool convertCameras(ZMT::IFlowStoreHandle& io_rStore, std::vector<std::string>& o_rNames,
                      Items& o_rHardware, Items& o_rCalibrations, Items& o_rDetails,
                      Items& o_rMasks, bool i_optical, bool i_video, bool i_calibrations);
  /// The floor area of the capture volume as a "FlowVolumeProperties" item.
  static void convertVolumeProperties(ZMT::IFlowStoreHandle& io_rStore,
                                      ZMT::IFlowItemHandle& o_rItem);
  /// The static items of all subjects, twelve lists as described above. A subject whose setup
  /// can't be converted is left out of that setup's lists, with the reason logged; false then.
  static bool convertSubjects(ZMT::IFlowStoreHandle& io_rStore, Items& o_rParametrised,
                              Items& o_rSubjects, Items& o_rApplication, Items& o_rSubspaces,
                              Items& o_rParametrisedForSolving, Items& o_rSubjectsForSolving,
                              Items& o_rApplicationForSolving, Items& o_rSubspacesForSolving,
                              Items& o_rParametrisedForRetargeting,
                              Items& o_rSubjectsForRetargeting, Items& o_rApplicationForRetargeting,
                              Items& o_rSubspacesForRetargeting);
  /// Adds every handle of the list to the state at the state's time.
  static void addItmesToFlowState(Items& i_rItems, ZMT::IFlowState& io_rState);
  /// The items of the frame at `i_tick`, added to the state:
  ///  - `i_cameras`: one "FlowCentroidSet" per calibrated optical camera, the frame's markers
  ///    as that camera images them;
  ///  - `i_subjectPoses`: one "FlowSubjectWorldPose" per animated subject (labeling setup);
  ///  - `i_subjectLocalPoses`: one "FlowSubjectLocalPose" per animated subject;
  ///  - `i_trajectories`: "FlowReconstructionSet", "FlowReconstructionTrackSet" and
  ///    "FlowReconstructionLabelSet" of the markers keyed at the tick, and the trajectory table
  ///    (a "FlowParametersItem" whose tags name each track), shared by every frame of a take;
  ///  - `i_forSolving`: the three trajectory sets again under their "ForSolving" types;
  ///  - `i_orientation`: a "FlowSceneOrientation" of the scene's up axis.
  static void convertDynamicData(ZMT::IFlowStoreHandle& io_rStore, ZMT::IFlowStateHandle& io_rState,
                                 std::int64_t i_tick, bool i_cameras, bool i_subjectPoses,
                                 bool i_subjectLocalPoses, bool i_trajectories, bool i_forSolving,
                                 bool i_orientation);

private:
  struct Impl;
  Impl* m_pImpl;
};
