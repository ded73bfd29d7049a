// The item catalogue against the published table of types, and every type's serialisation.

#include "FlowTestTypes.h"

#include "Flow2/Flow2Types/FlowCatalogue.h"
#include "Flow2/Flow2Types/FlowCompile.h"

#include <gtest/gtest.h>

#include <map>
#include <set>
#include <string>
#include <tuple>
#include <vector>

namespace {

using namespace FlowTest;

struct VExpected {
  const char* m_Name;
  std::uint32_t m_Id;
  ZMT::IFlowItemVersion m_Version;
};

// The table of types as published to readers of recordings: name, id and version.
const std::vector<VExpected> kTable = {
    {"FlowParametersItem", 1, {1, 0, 0}},
    {"FlowEventItem", 2, {1, 0, 0}},
    {"FlowEventTraceItem", 3, {1, 0, 0}},
    {"FlowCameraHardware", 4096, {1, 0, 1}},
    {"FlowCameraSettings", 4097, {1, 0, 0}},
    {"FlowCameraMaskGrid", 4098, {1, 0, 0}},
    {"FlowCentroidSet", 4099, {2, 0, 0}},
    {"FlowCentroidTrackSet", 4100, {1, 0, 0}},
    {"FlowGreyscaleBlobSet", 4101, {1, 0, 3}},
    {"FlowEdgePairSet", 4102, {1, 0, 0}},
    {"FlowVideoFrame", 4103, {2, 0, 1}},
    {"FlowAnalogueBlock", 4104, {2, 0, 0}},
    {"FlowCameraCalibration", 4106, {1, 0, 1}},
    {"FlowCameraCalibrationHealth", 4107, {2, 0, 1}},
    {"FlowCentroidAssignmentSet", 4108, {1, 0, 0}},
    {"FlowReconstructionSet", 4109, {1, 0, 0}},
    {"FlowReconstructionTrackSet", 4110, {1, 0, 0}},
    {"FlowReconstructionLabelSet", 4111, {1, 0, 0}},
    {"FlowSubjectDynamicParameters", 4113, {1, 0, 0}},
    {"FlowSubject", 4114, {1, 0, 2}},
    {"FlowSubjectApplicationData", 4115, {1, 0, 4}},
    {"FlowSubjectHealth", 4116, {1, 0, 0}},
    {"FlowCameraWand2d", 4117, {2, 0, 1}},
    {"FlowCameraWand3d", 4118, {2, 0, 0}},
    {"FlowCentroidAssignmentPredictionSet", 4119, {1, 0, 0}},
    {"FlowGeometrySet", 4120, {2, 0, 0}},
    {"FlowSubjectParametrised", 4122, {1, 0, 1}},
    {"FlowSubjectForSolving", 4123, {1, 0, 2}},
    {"FlowSubjectApplicationDataForSolving", 4124, {1, 0, 4}},
    {"FlowSubjectDynamicParametersForSolving", 4125, {1, 0, 0}},
    {"FlowReconstructionSetForSolving", 4126, {1, 0, 0}},
    {"FlowReconstructionLabelSetForSolving", 4127, {1, 0, 0}},
    {"FlowReconstructionTrackSetForSolving", 4128, {1, 0, 0}},
    {"FlowTimecode", 4129, {1, 0, 0}},
    {"FlowCentroidLabelSet", 4130, {1, 0, 0}},
    {"FlowDevice", 4131, {2, 0, 0}},
    {"FlowDeviceApplicationData", 4132, {2, 0, 0}},
    {"FlowDeviceSamples", 4133, {2, 0, 0}},
    {"FlowAudioFrame", 4134, {1, 0, 2}},
    {"FlowSubjectSettings", 4135, {1, 0, 4}},
    {"FlowCentroidWeightSet", 4136, {1, 0, 0}},
    {"FlowSceneOrientation", 4137, {1, 0, 0}},
    {"FlowSubjectTemplate", 4138, {1, 0, 1}},
    {"FlowLabellingCluster", 4139, {1, 0, 1}},
    {"FlowSubjectParametrisedForSolving", 4140, {1, 0, 1}},
    {"FlowCameraPhysicalStatus", 4141, {1, 0, 1}},
    {"FlowCameraPhysicalSensorData", 4142, {2, 0, 1}},
    {"FlowCameraCalibrationDetails", 4143, {1, 0, 1}},
    {"FlowSubjectTemplateForSolving", 4144, {1, 0, 1}},
    {"FlowVolumeProperties", 4145, {1, 0, 0}},
    {"FlowCameraCalibrationHealthAdvanced", 4146, {1, 0, 0}},
    {"FlowLabelledRotationSet", 4147, {1, 0, 0}},
    {"FlowRigidObjectDynamicParameters", 4148, {1, 0, 0}},
    {"FlowRigidObject", 4149, {1, 0, 2}},
    {"FlowRigidObjectApplicationData", 4150, {1, 0, 3}},
    {"FlowCameraWarnings", 4151, {1, 0, 0}},
    {"FlowSubjectForRetargeting", 4152, {1, 0, 2}},
    {"FlowSubjectApplicationDataForRetargeting", 4153, {1, 0, 3}},
    {"FlowSubjectDynamicParametersForRetargeting", 4154, {1, 0, 0}},
    {"FlowSubjectParametrisedForRetargeting", 4155, {1, 0, 1}},
    {"FlowSubjectTemplateForRetargeting", 4156, {1, 0, 1}},
    {"FlowReconstructionSetForRetargeting", 4157, {1, 0, 0}},
    {"FlowReconstructionLabelSetForRetargeting", 4158, {1, 0, 0}},
    {"FlowReconstructionTrackSetForRetargeting", 4159, {1, 0, 0}},
    {"FlowLabelledRotationSetForSolving", 4160, {1, 0, 0}},
    {"FlowLabelledRotationSetForRetargeting", 4161, {1, 0, 0}},
    {"FlowSubjectDynamicSubspaceForSolving", 4162, {1, 0, 1}},
    {"FlowSystemPerformanceMetrics", 4163, {1, 0, 0}},
    {"FlowSmartObject", 4164, {1, 0, 2}},
    {"FlowDeviceWarnings", 4165, {1, 0, 0}},
    {"FlowSubjectDynamicSubspaceForRetargeting", 4166, {1, 0, 0}},
    {"FlowSubjectAssociation", 4167, {1, 0, 0}},
    {"FlowObjectPreset", 4168, {1, 0, 0}},
    {"FlowObjectQuality", 32768, {1, 0, 0}},
    {"FlowSubjectWorldPose", 36866, {2, 0, 0}},
    {"FlowSubjectWorldPoseForSolving", 36867, {2, 0, 0}},
    {"FlowSubjectLocalPose", 36868, {1, 0, 0}},
    {"FlowSubjectLocalPoseForSolving", 36869, {1, 0, 0}},
    {"FlowSelectionSet", 36874, {1, 0, 0}},
    {"FlowSubjectDynamicSubspace", 36878, {1, 0, 1}},
};

// Published member lists: a class's serialised members begin with these, in this order.
const std::map<std::string, std::vector<std::string>> kMembers = {
    {"AnalogueBlock", {"DeviceURN", "ChannelIndices", "SampleFormat", "DataBuffer"}},
    {"AudioFrame", {"DeviceURN", "AudioFrameInfo", "DataBuffers"}},
    {"CameraCalibration", {"PrincipalPoint", "LensDistortionCalibration"}},
    {"CameraCalibrationDetails", {"DeviceURN"}},
    {"CameraCalibrationHealth", {"AverageReprojectionError", "CameraCalibrationHash"}},
    {"CameraMaskGrid", {"RunLengths"}},
    {"CameraPhysicalSensorData", {"GravityVector"}},
    {"CameraPhysicalStatus", {"BumpTimeStamp"}},
    {"CameraSettings", {"Parameters"}},
    {"CameraWand2d", {"DeviceURN", "WandPoints", "Moving", "LabelStatus"}},
    {"CameraWand3d", {"WandPoints", "Moving"}},
    {"Centroid", {"Position", "Radius", "Score", "PixelCount", "Threshold", "GeneratorId"}},
    {"CentroidAssignmentPredictionSet", {"DeviceURN", "Predictions"}},
    {"CentroidAssignmentSet", {"DeviceURN", "ReconstructionIndices"}},
    {"CentroidLabelSet", {"DeviceURN", "CentroidLabels"}},
    {"CentroidSet", {"DeviceURN", "GeneratorId", "CircularityThreshold", "Centroids"}},
    {"CentroidTrackSet", {"DeviceURN", "GeneratorId", "CentroidTracks"}},
    {"CentroidWeightSet", {"DeviceURN", "CentroidWeights"}},
    {"Device", {"SourceId", "Outputs"}},
    {"DeviceApplicationData", {"DeviceURN", "DeviceData", "OutputData"}},
    {"DeviceSamples", {"DeviceURN", "SampleCount", "OutputIndices", "DataBuffer"}},
    {"DeviceWarnings", {"Warnings"}},
    {"EdgePair", {"Position", "Length"}},
    {"EdgePairSet", {"DeviceURN", "EdgePairs"}},
    {"FlowEventItem", {"TimeInSeconds"}},
    {"FlowEventTraceItem", {"EventTokens"}},
    {"FlowItemToken", {"ItemId", "TypeId", "FlowStoreId"}},
    {"FlowObjectQuality", {"SubjectId", "Quality"}},
    {"FlowParametersItem", {"Targets", "Tags"}},
    {"Geometry", {"Type", "CoordSys", "Coords", "Color", "Text", "TextSize"}},
    {"GeometrySet", {"Geometry", "DeviceURN"}},
    {"GreyscaleBlob", {"FirstLineIndex"}},
    {"GreyscaleBlobSet", {"DeviceURN", "GreyscaleBlobs", "GreyscaleLines", "GreyscalePixels"}},
    {"GreyscaleLine", {"Position", "FirstPixelIndex", "Length", "Padding"}},
    {"Label", {"Score", "Padding"}},
    {"LabelledRotation", {"Rotation"}},
    {"LabelledRotationSet", {"GeneratorId", "LabelledRotations"}},
    {"LensDistortionCalibration", {"RadialParameters", "RadialDistortionCentre"}},
    {"ObjectPreset", {"Parameters"}},
    {"Reconstruction", {"Position"}},
    {"ReconstructionLabelSet", {"GeneratorId", "ReconstructionLabels"}},
    {"ReconstructionSet", {"GeneratorId", "Reconstructions"}},
    {"ReconstructionTrackSet", {"GeneratorId", "ReconstructionTracks"}},
    {"SceneOrientation", {"Orientation"}},
    {"SelectionSet", {"Selections"}},
    {"SmartObject",
     {"SubjectId", "ColourRGBA", "SmartClusters", "AdditionalMarkerPositions",
      "MarkersOnWhileCharging"}},
    {"Subject", {"Name", "SubjectId", "Segments", "Markers", "Rotations", "Targets"}},
    {"SubjectApplicationData", {"SubjectId", "Markers", "Segments", "Sticks", "Targets"}},
    {"SubjectDynamicParameters", {"SubjectDynamicParameters"}},
    {"SubjectDynamicSubspace", {"PcaControlledParams"}},
    {"SubjectHealth", {"SubjectId", "ReconErrorsSquared"}},
    {"SubjectLocalPose", {"Segments"}},
    {"SubjectParametrised",
     {"SubjectId", "StaticParameters", "DynamicParameters", "Segments", "Markers", "Rotations",
      "Targets", "TPoseConstraints"}},
    {"SubjectWorldPose", {"Segments", "Markers"}},
    {"SystemPerformanceMetrics", {"WindowLength", "PipelineExecution", "CpuUsage"}},
    {"Track", {"TrackId", "Score", "Padding"}},
    {"VideoFrame", {"DeviceURN", "VideoFrameInfo", "DataBuffer"}},
    {"VideoFrameInfo", {"Inverted", "PixelAspectRatio", "InterlacedFormat"}},
};

// Walks a schema tree, checking every named class against the published member lists, and
// collecting the class names met.
void CheckClasses(const ZMT::ISchema& i_rSchema, std::set<std::string>& io_rSeen) {
  if (i_rSchema.m_Type == ZMT::ISchema::NamedTuple) {
    io_rSeen.insert(i_rSchema.m_Name);
    const auto found = kMembers.find(i_rSchema.m_Name);
    if (found != kMembers.end()) {
      ASSERT_GE(i_rSchema.m_Members.size(), found->second.size()) << i_rSchema.m_Name;
      for (size_t i = 0; i < found->second.size(); ++i)
        EXPECT_EQ(i_rSchema.m_Members[i].m_Name, found->second[i]) << i_rSchema.m_Name;
    }
  }
  for (const auto& member : i_rSchema.m_Members)
    CheckClasses(member.m_Schema, io_rSeen);
}

TEST(FlowCatalogue, EveryTypeOfThePublishedTableWithItsIdNameAndVersion) {
  const ZMT::IFlowItemFactories factories = ZMT::GetFlowCatalogueFactories();
  ASSERT_EQ(factories.size(), kTable.size());
  ASSERT_EQ(kTable.size(), 80u);
  for (size_t i = 0; i < kTable.size(); ++i) {
    const ZMT::IFlowItemTypeInfo& info = factories[i]->GetInfo().m_TypeInfo;
    EXPECT_EQ(info.m_Name, kTable[i].m_Name);
    EXPECT_EQ(info.m_TypeId, kTable[i].m_Id) << kTable[i].m_Name;
    EXPECT_EQ(info.m_Version, kTable[i].m_Version) << kTable[i].m_Name;
    EXPECT_FALSE(info.m_Description.empty()) << kTable[i].m_Name;
  }
}

TEST(FlowCatalogue, ClassesBeginWithTheirPublishedMembers) {
  std::set<std::string> seen;
  for (const auto& factory : ZMT::GetFlowCatalogueFactories())
    CheckClasses(factory->GetInfo().m_Schema, seen);
  // Every published class is reached from some type.
  for (const auto& [name, members] : kMembers)
    EXPECT_TRUE(seen.count(name)) << name << " is used by no type";
}

// Fills every field of a record with values that differ from the defaults and from each other.
struct VFiller {
  int m_Next = 1;
  template <class T> void operator()(T& io_rValue) {
    if constexpr (std::is_same_v<T, bool>)
      io_rValue = (m_Next++ % 2) == 1;
    else if constexpr (std::is_enum_v<T>)
      io_rValue = static_cast<T>(1 + (m_Next++ % 2));
    else if constexpr (std::is_arithmetic_v<T>)
      io_rValue = static_cast<T>(m_Next++ % 120 + 1);
    else if constexpr (std::is_same_v<T, std::string>)
      io_rValue = "text " + std::to_string(m_Next++);
    else if constexpr (requires { io_rValue.Raw(); })
      (*this)(io_rValue.Raw());
    else if constexpr (requires {
                         T::FlowFields(io_rValue, [](const char*, const char*, auto&) {});
                       })
      T::FlowFields(io_rValue, [&](const char*, const char*, auto& field) { (*this)(field); });
    else if constexpr (requires {
                         io_rValue.insert_or_assign(typename T::key_type{},
                                                    typename T::mapped_type{});
                       }) {
      for (int i = 0; i < 2; ++i) {
        typename T::key_type key{};
        typename T::mapped_type value{};
        (*this)(key);
        (*this)(value);
        io_rValue.insert_or_assign(key, value);
      }
    } else if constexpr (requires { io_rValue.resize(2); }) {
      io_rValue.resize(2);
      for (auto& element : io_rValue)
        (*this)(element);
    } else {
      for (auto& element : io_rValue)
        (*this)(element);
    }
  }
};

template <class T> void CheckRoundTrip(const char* i_name) {
  SCOPED_TRACE(i_name);
  ZMT::Detail::VFlowItem<T> item;
  VFiller filler;
  filler(static_cast<T&>(item));
  const std::vector<std::uint8_t> bytes = Serialise(item);
  EXPECT_EQ(item.GetSize(), bytes.size());

  // Read through the factory's native reader into a fresh item of the same type.
  ZMT::Detail::VFlowItemFactory<T> factory;
  std::unique_ptr<ZMT::IFlowItem> back(factory.Create());
  VBytesIn in(bytes);
  ASSERT_TRUE(factory.GetReader(nullptr)(in, *back));
  EXPECT_EQ(in.m_Offset, bytes.size());
  EXPECT_TRUE(static_cast<const T&>(*static_cast<ZMT::Detail::VFlowItem<T>*>(back.get())) ==
              static_cast<const T&>(item));
  // The reader compiled from the type's own schema (the road of files written by another build)
  // reads the same bytes to the same value.
  const ZMT::ISchema& schema = ZMT::Detail::FlowTypeStatics<T>().m_Schema;
  const ZMT::IReaderPtr pCompiled = ZMT::CompileReader<T>(schema, schema);
  ASSERT_TRUE(pCompiled);
  ZMT::Detail::VFlowItem<T> compiled;
  VBytesIn compiledIn(bytes);
  ASSERT_TRUE(pCompiled->Read(compiledIn, static_cast<T*>(&compiled)).IsSuccess());
  EXPECT_EQ(compiledIn.m_Offset, bytes.size());
  EXPECT_TRUE(static_cast<const T&>(compiled) == static_cast<const T&>(item));
  // A default item differs: the filler reached the fields.
  EXPECT_FALSE(T{} == static_cast<const T&>(item));

  // Every truncation fails cleanly.
  for (size_t cut = 0; cut < bytes.size(); cut += std::max<size_t>(1, bytes.size() / 17)) {
    const std::vector<std::uint8_t> part(bytes.begin(), bytes.begin() + std::ptrdiff_t(cut));
    ZMT::Detail::VFlowItem<T> partial;
    VBytesIn cutIn(part);
    EXPECT_FALSE(partial.Read(cutIn)) << "cut at " << cut;
  }
}

TEST(FlowCatalogue, EveryTypeSerialisesAndReadsBackEqual) {
#define ANVIL_CHECK_TYPE(Wrapper, ...) CheckRoundTrip<ZMT::Catalogue::Wrapper>(#Wrapper);
  ANVIL_FLOW_CATALOGUE(ANVIL_CHECK_TYPE)
#undef ANVIL_CHECK_TYPE
}

TEST(FlowCatalogue, FixedSizeTypesHaveTheirPublishedSizes) {
  EXPECT_EQ(ZMT::Detail::VFlowItem<ZMT::Catalogue::VFlowObjectQuality>().GetSize(), 12u);
  EXPECT_EQ(ZMT::Detail::VFlowItem<ZMT::Catalogue::VFlowSubjectAssociation>().GetSize(), 12u);
  EXPECT_EQ(ZMT::Detail::VFlowItem<ZMT::Catalogue::VFlowVolumeProperties>().GetSize(), 16u);
  ZMT::Detail::VFlowItem<ZMT::Catalogue::VFlowEventItem> event;
  event.m_Name = "Foot Strike";
  event.m_Context = "Left";
  EXPECT_EQ(event.GetSize(), 16u + 11 + 4);
}

TEST(FlowCatalogue, TagsAnswerTheSharedForms) {
  using namespace ZMT::Catalogue;
  const auto tag = [](const ZMT::IFlowItem& item, int id) {
    std::string value;
    return item.GetTag(ZMT::TagId(id), value) ? value : std::string("<none>");
  };
  ZMT::Detail::VFlowItem<VFlowDevice> device;
  device.m_SourceId = 2107;
  device.m_Name = "Plate 1";
  EXPECT_EQ(tag(device, ZMT::FlowTags::DeviceId), "2107");
  EXPECT_EQ(tag(device, ZMT::FlowTags::DeviceName), "Plate 1");
  EXPECT_EQ(tag(device, ZMT::FlowTags::Name), "<none>");

  ZMT::Detail::VFlowItem<VFlowSubjectForSolving> subject;
  subject.m_SubjectId = 4000000000u;
  EXPECT_EQ(tag(subject, ZMT::FlowTags::SubjectId), "4000000000");

  ZMT::Detail::VFlowItem<VFlowCameraWarnings> warnings;
  warnings.m_Name = "Camera 3";
  EXPECT_EQ(tag(warnings, ZMT::FlowTags::Name), "Camera 3");
  EXPECT_EQ(tag(warnings, ZMT::FlowTags::SubjectId), "<none>");

  ZMT::Detail::VFlowItem<VFlowDeviceSamples> samples;
  samples.m_DeviceURN = "Analog:7";
  EXPECT_EQ(tag(samples, ZMT::FlowTags::DeviceName), "Analog:7");

  ZMT::Detail::VFlowItem<VFlowParametersItem> parameters;
  parameters.m_Tags = {{9, "nine"}};
  EXPECT_EQ(tag(parameters, 9), "nine");
  EXPECT_EQ(tag(parameters, 0), "<none>");
  EXPECT_EQ(tag(parameters, 2), "<none>");

  ZMT::Detail::VFlowItem<VFlowReconstructionSet> points;
  for (int id = 0; id < 8; ++id)
    EXPECT_EQ(tag(points, id), "<none>");
}

TEST(FlowCatalogue, VariantsShareTheDataClassButNotTheType) {
  using namespace ZMT::Catalogue;
  const auto& plain = ZMT::Detail::FlowTypeStatics<VFlowSubject>();
  const auto& solving = ZMT::Detail::FlowTypeStatics<VFlowSubjectForSolving>();
  EXPECT_NE(plain.m_TypeInfo.m_TypeId, solving.m_TypeInfo.m_TypeId);
  EXPECT_TRUE(plain.m_Schema == solving.m_Schema);
}

} // namespace
