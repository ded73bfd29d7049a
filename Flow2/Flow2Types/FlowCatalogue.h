#pragma once
// Every item type the system registers, each declared once below as
//   X(wrapper class, data class, type id, major, minor, patch, tags, description)
// The wrapper's type name is its class name without the leading V. The same list gives the
// wrapper classes and the factories, so the two cannot drift apart.

#include "Flow2/Flow2Types/FlowBuiltinItems.h"
#include "Flow2/Flow2Types/FlowOptionalField.h"
#include "Flow2/Flow2Types/ITimecode.h"
#include "Flow2/Flow2Types/VFlowItem.h"
#include "River/CoreOstraTypes/VCameraCalibration.h"
#include "River/CoreOstraTypes/VCameraCalibrationDetails.h"
#include "River/CoreOstraTypes/VCameraHardware.h"
#include "River/CoreOstraTypes/VCameraMaskGrid.h"
#include "River/CoreOstraTypes/VCameraStatusData.h"
#include "River/CoreOstraTypes/VCentroidData.h"
#include "River/CoreOstraTypes/VDeviceData.h"
#include "River/CoreOstraTypes/VReconstructionData.h"
#include "River/CoreOstraTypes/VSceneData.h"
#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "River/CoreOstraTypes/VSubjectStateData.h"

#include <string>

namespace ZMT::Catalogue {

/// Which of the shared tag forms a type answers.
enum ETags : unsigned {
  ENoTags = 0,
  EName = 1,       ///< tag 2: the name member
  ESubject = 2,    ///< tag 3: the subject id in decimal
  EDevice = 4,     ///< tag 4: the device id; tag 5: the device name
  EDeviceName = 8, ///< tag 5 alone: the device's URN or name
  EOwnTags = 16,   ///< the data class answers its own tags
};

template <unsigned Tags, class D> bool AnswerTag(const D& d, TagId tagId, std::string& o_rValue) {
  if constexpr ((Tags & EOwnTags) != 0) return d.FlowTag(tagId, o_rValue);
  if constexpr ((Tags & EName) != 0)
    if (FlowTags::TagText(tagId, FlowTags::Name, d.m_Name, o_rValue)) return true;
  if constexpr ((Tags & ESubject) != 0)
    if (FlowTags::TagNumber(tagId, FlowTags::SubjectId, d.m_SubjectId, o_rValue)) return true;
  if constexpr ((Tags & EDevice) != 0) {
    if (FlowTags::TagNumber(tagId, FlowTags::DeviceId, d.m_SourceId, o_rValue)) return true;
    if (FlowTags::TagText(tagId, FlowTags::DeviceName, d.m_Name, o_rValue)) return true;
  }
  if constexpr ((Tags & EDeviceName) != 0) {
    if constexpr (requires { d.m_DeviceName; })
      return FlowTags::TagText(tagId, FlowTags::DeviceName, d.m_DeviceName, o_rValue);
    else
      return FlowTags::TagText(tagId, FlowTags::DeviceName, d.m_DeviceURN, o_rValue);
  }
  return false;
}

namespace C = CoreOstraTypes;
using VTimecode135 = ITimecode<135000000>;

// clang-format off
#define ANVIL_FLOW_CATALOGUE(X) \
  X(VFlowParametersItem, VFlowParametersData, 1, 1, 0, 0, EOwnTags, "Tags given to other items") \
  X(VFlowEventItem, VFlowEventData, 2, 1, 0, 0, ENoTags, "An event of the recording") \
  X(VFlowEventTraceItem, VFlowEventTraceData, 3, 1, 0, 0, ENoTags, "The events behind an item") \
  X(VFlowCameraHardware, C::VCameraHardware, 4096, 1, 0, 1, ENoTags, "A camera's identity and sensor") \
  X(VFlowCameraSettings, C::VCameraSettings, 4097, 1, 0, 0, ENoTags, "A camera's settings") \
  X(VFlowCameraMaskGrid, C::VCameraMaskGrid, 4098, 1, 0, 0, ENoTags, "A camera's threshold mask") \
  X(VFlowCentroidSet, C::VCentroidSet, 4099, 2, 0, 0, ENoTags, "Centroids one camera saw in a frame") \
  X(VFlowCentroidTrackSet, C::VCentroidTrackSet, 4100, 1, 0, 0, ENoTags, "Tracks of a camera's centroids") \
  X(VFlowGreyscaleBlobSet, C::VGreyscaleBlobSet, 4101, 1, 0, 3, ENoTags, "Greyscale blobs one camera saw") \
  X(VFlowEdgePairSet, C::VEdgePairSet, 4102, 1, 0, 0, ENoTags, "Edge pairs one camera saw") \
  X(VFlowVideoFrame, C::VVideoFrame, 4103, 2, 0, 1, ENoTags, "One image of a video camera") \
  X(VFlowAnalogueBlock, C::VAnalogueBlock, 4104, 2, 0, 0, ENoTags, "Raw samples of an analogue board") \
  X(VFlowCameraCalibration, C::VCameraCalibration, 4106, 1, 0, 1, ENoTags, "Where a camera stands and how it images") \
  X(VFlowCameraCalibrationHealth, C::VCameraCalibrationHealth, 4107, 2, 0, 1, EName, "How well a calibration fits") \
  X(VFlowCentroidAssignmentSet, C::VCentroidAssignmentSet, 4108, 1, 0, 0, ENoTags, "Reconstruction of each centroid") \
  X(VFlowReconstructionSet, C::VReconstructionSet, 4109, 1, 0, 0, ENoTags, "3D points of a frame") \
  X(VFlowReconstructionTrackSet, C::VReconstructionTrackSet, 4110, 1, 0, 0, ENoTags, "Tracks of a frame's points") \
  X(VFlowReconstructionLabelSet, C::VReconstructionLabelSet, 4111, 1, 0, 0, ENoTags, "Labels of a frame's points") \
  X(VFlowSubjectDynamicParameters, C::VSubjectDynamicParameters, 4113, 1, 0, 0, ESubject, "A subject's dynamic parameter values") \
  X(VFlowSubject, C::VSubject, 4114, 1, 0, 2, ESubject, "A solved subject") \
  X(VFlowSubjectApplicationData, C::VSubjectApplicationData, 4115, 1, 0, 4, ESubject, "A subject's display state") \
  X(VFlowSubjectHealth, C::VSubjectHealth, 4116, 1, 0, 0, ESubject, "How well a subject fits its markers") \
  X(VFlowCameraWand2d, C::VCameraWand2d, 4117, 2, 0, 1, ENoTags, "The wand as one camera saw it") \
  X(VFlowCameraWand3d, C::VCameraWand3d, 4118, 2, 0, 0, ENoTags, "The wand in the world") \
  X(VFlowCentroidAssignmentPredictionSet, C::VCentroidAssignmentPredictionSet, 4119, 1, 0, 0, ENoTags, "Where a camera should see the points") \
  X(VFlowGeometrySet, C::VGeometrySet, 4120, 2, 0, 0, EName, "Geometry drawn for the user") \
  X(VFlowSubjectParametrised, C::VSubjectParametrised, 4122, 1, 0, 1, ESubject, "A subject as its file describes it") \
  X(VFlowSubjectForSolving, C::VSubject, 4123, 1, 0, 2, ESubject, "A solved subject, for solving") \
  X(VFlowSubjectApplicationDataForSolving, C::VSubjectApplicationData, 4124, 1, 0, 4, ESubject, "A subject's display state, for solving") \
  X(VFlowSubjectDynamicParametersForSolving, C::VSubjectDynamicParameters, 4125, 1, 0, 0, ESubject, "Dynamic parameter values, for solving") \
  X(VFlowReconstructionSetForSolving, C::VReconstructionSet, 4126, 1, 0, 0, ENoTags, "3D points of a frame, for solving") \
  X(VFlowReconstructionLabelSetForSolving, C::VReconstructionLabelSet, 4127, 1, 0, 0, ENoTags, "Labels of a frame's points, for solving") \
  X(VFlowReconstructionTrackSetForSolving, C::VReconstructionTrackSet, 4128, 1, 0, 0, ENoTags, "Tracks of a frame's points, for solving") \
  X(VFlowTimecode, VTimecode135, 4129, 1, 0, 0, ENoTags, "The timecode of a frame") \
  X(VFlowCentroidLabelSet, C::VCentroidLabelSet, 4130, 1, 0, 0, ENoTags, "Labels of a camera's centroids") \
  X(VFlowDevice, C::VDevice, 4131, 2, 0, 0, EDevice, "A device and its outputs") \
  X(VFlowDeviceApplicationData, C::VDeviceApplicationData, 4132, 2, 0, 0, EDeviceName, "A device's settings") \
  X(VFlowDeviceSamples, C::VDeviceSamples, 4133, 2, 0, 0, EDeviceName, "A device's samples of a frame") \
  X(VFlowAudioFrame, C::VAudioFrame, 4134, 1, 0, 2, ENoTags, "Audio of a frame") \
  X(VFlowSubjectSettings, C::VSubjectSettings, 4135, 1, 0, 4, ESubject, "A subject's processing settings") \
  X(VFlowCentroidWeightSet, C::VCentroidWeightSet, 4136, 1, 0, 0, ENoTags, "Weights of a camera's centroids") \
  X(VFlowSceneOrientation, C::VSceneOrientation, 4137, 1, 0, 0, ENoTags, "The turn of the scene") \
  X(VFlowSubjectTemplate, C::VSubjectTemplate, 4138, 1, 0, 1, ESubject, "The template a subject was made from") \
  X(VFlowLabellingCluster, C::VLabellingCluster, 4139, 1, 0, 1, ESubject, "Markers labelled as one group") \
  X(VFlowSubjectParametrisedForSolving, C::VSubjectParametrised, 4140, 1, 0, 1, ESubject, "A subject as its file describes it, for solving") \
  X(VFlowCameraPhysicalStatus, C::VCameraPhysicalStatus, 4141, 1, 0, 1, ENoTags, "When a camera was knocked") \
  X(VFlowCameraPhysicalSensorData, C::VCameraPhysicalSensorData, 4142, 2, 0, 1, ENoTags, "A camera's gravity sensor") \
  X(VFlowCameraCalibrationDetails, C::VCameraCalibrationDetails, 4143, 1, 0, 1, ENoTags, "How and when a camera was calibrated") \
  X(VFlowSubjectTemplateForSolving, C::VSubjectTemplate, 4144, 1, 0, 1, ESubject, "A subject's template, for solving") \
  X(VFlowVolumeProperties, C::VVolumeProperties, 4145, 1, 0, 0, ENoTags, "The floor area of the capture volume") \
  X(VFlowCameraCalibrationHealthAdvanced, C::VCameraCalibrationHealthAdvanced, 4146, 1, 0, 0, EName, "Calibration fit by image region") \
  X(VFlowLabelledRotationSet, C::VLabelledRotationSet, 4147, 1, 0, 0, ENoTags, "Rotations measured by devices") \
  X(VFlowRigidObjectDynamicParameters, C::VSubjectDynamicParameters, 4148, 1, 0, 0, ESubject, "A rigid object's dynamic parameter values") \
  X(VFlowRigidObject, C::VSubject, 4149, 1, 0, 2, ESubject, "A solved rigid object") \
  X(VFlowRigidObjectApplicationData, C::VSubjectApplicationData, 4150, 1, 0, 3, ESubject, "A rigid object's display state") \
  X(VFlowCameraWarnings, C::VCameraWarnings, 4151, 1, 0, 0, EName, "Warnings of a camera") \
  X(VFlowSubjectForRetargeting, C::VSubject, 4152, 1, 0, 2, ESubject, "A solved subject, for retargeting") \
  X(VFlowSubjectApplicationDataForRetargeting, C::VSubjectApplicationData, 4153, 1, 0, 3, ESubject, "A subject's display state, for retargeting") \
  X(VFlowSubjectDynamicParametersForRetargeting, C::VSubjectDynamicParameters, 4154, 1, 0, 0, ESubject, "Dynamic parameter values, for retargeting") \
  X(VFlowSubjectParametrisedForRetargeting, C::VSubjectParametrised, 4155, 1, 0, 1, ESubject, "A subject as its file describes it, for retargeting") \
  X(VFlowSubjectTemplateForRetargeting, C::VSubjectTemplate, 4156, 1, 0, 1, ESubject, "A subject's template, for retargeting") \
  X(VFlowReconstructionSetForRetargeting, C::VReconstructionSet, 4157, 1, 0, 0, ENoTags, "3D points of a frame, for retargeting") \
  X(VFlowReconstructionLabelSetForRetargeting, C::VReconstructionLabelSet, 4158, 1, 0, 0, ENoTags, "Labels of a frame's points, for retargeting") \
  X(VFlowReconstructionTrackSetForRetargeting, C::VReconstructionTrackSet, 4159, 1, 0, 0, ENoTags, "Tracks of a frame's points, for retargeting") \
  X(VFlowLabelledRotationSetForSolving, C::VLabelledRotationSet, 4160, 1, 0, 0, ENoTags, "Rotations measured by devices, for solving") \
  X(VFlowLabelledRotationSetForRetargeting, C::VLabelledRotationSet, 4161, 1, 0, 0, ENoTags, "Rotations measured by devices, for retargeting") \
  X(VFlowSubjectDynamicSubspaceForSolving, C::VSubjectDynamicSubspace, 4162, 1, 0, 1, ESubject, "A subject's joint subspace, for solving") \
  X(VFlowSystemPerformanceMetrics, C::VSystemPerformanceMetrics, 4163, 1, 0, 0, ENoTags, "Processing time and load") \
  X(VFlowSmartObject, C::VSmartObject, 4164, 1, 0, 2, ESubject, "An object with clustered active markers") \
  X(VFlowDeviceWarnings, C::VDeviceWarnings, 4165, 1, 0, 0, EDeviceName, "Warnings of a device") \
  X(VFlowSubjectDynamicSubspaceForRetargeting, C::VSubjectDynamicSubspace, 4166, 1, 0, 0, ESubject, "A subject's joint subspace, for retargeting") \
  X(VFlowSubjectAssociation, C::VSubjectAssociation, 4167, 1, 0, 0, ESubject, "A link between two subjects") \
  X(VFlowObjectPreset, C::VObjectPreset, 4168, 1, 0, 0, ESubject, "Preset values of an object") \
  X(VFlowObjectQuality, C::VObjectQuality, 32768, 1, 0, 0, ESubject, "How well an object is tracked") \
  X(VFlowSubjectWorldPose, C::VSubjectWorldPose, 36866, 2, 0, 0, ESubject, "A subject's world pose in a frame") \
  X(VFlowSubjectWorldPoseForSolving, C::VSubjectWorldPose, 36867, 2, 0, 0, ESubject, "A subject's world pose, for solving") \
  X(VFlowSubjectLocalPose, C::VSubjectLocalPose, 36868, 1, 0, 0, ESubject, "A subject's local pose in a frame") \
  X(VFlowSubjectLocalPoseForSolving, C::VSubjectLocalPose, 36869, 1, 0, 0, ESubject, "A subject's local pose, for solving") \
  X(VFlowSelectionSet, C::VSelectionSet, 36874, 1, 0, 0, ENoTags, "What the user selected") \
  X(VFlowSubjectDynamicSubspace, C::VSubjectDynamicSubspace, 36878, 1, 0, 1, ESubject, "A subject's joint parameters as principal components")
// clang-format on

#define ANVIL_FLOW_DECLARE_TYPE(Wrapper, Data, Id, Major, Minor, Patch, Tags, Description)         \
  struct Wrapper : Data {                                                                          \
    static constexpr const char* FlowTypeName = &#Wrapper[1];                                      \
    static constexpr std::uint32_t FlowTypeId = Id;                                                \
    static constexpr IFlowItemVersion FlowVersion{Major, Minor, Patch};                            \
    static constexpr const char* FlowDescription = Description;                                    \
    bool FlowTag(TagId tagId, std::string& o_rValue) const {                                       \
      return AnswerTag<Tags>(static_cast<const Data&>(*this), tagId, o_rValue);                    \
    }                                                                                              \
  };
ANVIL_FLOW_CATALOGUE(ANVIL_FLOW_DECLARE_TYPE)
#undef ANVIL_FLOW_DECLARE_TYPE

} // namespace ZMT::Catalogue

namespace ZMT {
/// The factories of every catalogued type, in the order of the list.
IFlowItemFactories GetFlowCatalogueFactories();
} // namespace ZMT
