#include "McpTestFile.h"
#include "Flow2/Flow2File/VWriter.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Flow2/Flow2Types/FlowCatalogue.h"
#include "Utils/UtilsFileSystem/MemoryStreams.h"
#include <stdexcept>

namespace {
namespace Cat = ZMT::Catalogue;

// The writer refusing a file of the test's own making is a fault of the test: stop loudly.
void check(bool i_ok, const char* i_pWhat) {
  if (!i_ok) throw std::runtime_error(std::string("McpTestFile: ") + i_pWhat);
}

struct Writing {
  Writing() {
    auto& factory = Flow2Store::GetFlowStoreFactory();
    check(factory.CreateStore(store, ZMT::GetFlowCatalogueFactories(), 1).IsSuccess(), "store");
    check(factory.CreateBufferFactory(buffers, nullptr).IsSuccess(), "buffers");
    check(factory.CreateStateFactory(states).IsSuccess(), "states");
  }
  template <class W> W* make(std::vector<ZMT::IFlowItemHandle>& io_rList) {
    ZMT::IFlowItemHandle item;
    check(store->CreateItem(ZMT::Detail::FlowTypeStatics<W>().m_TypeInfo, item).IsSuccess(),
          "item");
    io_rList.push_back(item);
    return item.As<ZMT::Detail::VFlowItem<W>>();
  }
  ZMT::IFlowStoreHandle store;
  ZMT::IFlowBufferFactoryHandle buffers;
  ZMT::IFlowStateFactoryHandle states;
};
} // namespace

McpTestFile::Camera mcpTestCamera(int i_number, bool i_calibrated) {
  McpTestFile::Camera camera;
  camera.hardware.m_DeviceURN = "cam:" + std::to_string(500 + i_number);
  camera.hardware.m_DeviceName = "rev " + std::to_string(i_number);
  camera.hardware.m_Type = "T2";
  camera.hardware.m_DisplayType = "Test 2MP";
  camera.hardware.m_SensorWidth = 2048;
  camera.hardware.m_SensorHeight = 1088;
  camera.hardware.m_PixelAspectRatio = 1.0 + 0.01 * i_number;
  if (i_calibrated) {
    camera.calibration.m_Name = "wand";
    camera.calibration.m_Position = {1000.0 * i_number, -2000.0, 2500.0};
    camera.calibration.m_Orientation = {0.1 * i_number, 0.2, -0.3};
    camera.calibration.m_PrincipalPoint = {1020.5, 540.25};
    camera.calibration.m_FocalLength = 1700.0 + i_number;
    camera.calibration.m_ImageError = 0.05;
  }
  camera.details.m_DeviceURN = camera.hardware.m_DeviceURN;
  camera.details.m_Calibration.m_Type = CoreOstraTypes::ECameraCalibrationType::WandWave;
  camera.details.m_Calibration.m_StartTemperature = 20 + i_number;
  camera.mask.m_Data = "3,1,4";
  camera.mask.m_GridWidth = 8;
  camera.mask.m_GridHeight = 4;
  camera.mask.m_TileWidth = 256;
  camera.mask.m_TileHeight = 272;
  return camera;
}

std::vector<std::uint8_t> McpTestFile::build() const {
  Writing w;
  std::vector<ZMT::IFlowItemHandle> scene;
  for (const Camera& camera : cameras)
    static_cast<CoreOstraTypes::VCameraHardware&>(*w.make<Cat::VFlowCameraHardware>(scene)) =
        camera.hardware;
  for (const Camera& camera : cameras)
    static_cast<CoreOstraTypes::VCameraCalibration&>(*w.make<Cat::VFlowCameraCalibration>(scene)) =
        camera.calibration;
  for (const Camera& camera : cameras)
    static_cast<CoreOstraTypes::VCameraCalibrationDetails&>(
        *w.make<Cat::VFlowCameraCalibrationDetails>(scene)) = camera.details;
  for (const Camera& camera : cameras)
    static_cast<CoreOstraTypes::VCameraMaskGrid&>(*w.make<Cat::VFlowCameraMaskGrid>(scene)) =
        camera.mask;
  for (size_t s = 0; s < subjects.size(); ++s) {
    const std::uint32_t id = std::uint32_t(s + 1);
    auto* pSubject = w.make<Cat::VFlowSubjectParametrised>(scene);
    static_cast<CoreOstraTypes::VSubjectParametrised&>(*pSubject) = subjects[s].subject;
    pSubject->m_SubjectId = id;
    auto* pApplication = w.make<Cat::VFlowSubjectApplicationData>(scene);
    static_cast<CoreOstraTypes::VSubjectApplicationData&>(*pApplication) = subjects[s].application;
    pApplication->m_SubjectId = id;
    auto* pSubspace = w.make<Cat::VFlowSubjectDynamicSubspace>(scene);
    static_cast<CoreOstraTypes::VSubjectDynamicSubspace&>(*pSubspace) = subjects[s].subspace;
    pSubspace->m_SubjectId = id;
  }

  std::vector<ZMT::IFlowItemHandle> shared;
  if (withTable) w.make<Cat::VFlowParametersItem>(shared)->m_Tags = table;
  if (orientation) w.make<Cat::VFlowSceneOrientation>(shared)->m_Orientation = *orientation;

  UtilsFileSystem::VMemoryOutputStream out;
  Flow2File::VWriter writer(w.buffers, w.store);
  check(writer.Open(&out).IsSuccess(), "open");
  for (size_t f = 0; f < frames.size(); ++f) {
    const std::int64_t time = (firstFrame + std::int64_t(f)) * ticksPerFrame;
    ZMT::IFlowStateHandle state;
    check(w.states
              ->CreateState(state, {time - ticksPerFrame, std::uint64_t(ticksPerFrame), 1}, {}, {})
              .IsSuccess(),
          "new state");
    std::vector<ZMT::IFlowItemHandle> items = scene;
    items.insert(items.end(), shared.begin(), shared.end());
    auto* pSet = w.make<Cat::VFlowReconstructionSet>(items);
    Cat::VFlowReconstructionTrackSet* pTracks =
        withTrackSet ? w.make<Cat::VFlowReconstructionTrackSet>(items) : nullptr;
    Cat::VFlowReconstructionLabelSet* pLabels =
        withLabelSet ? w.make<Cat::VFlowReconstructionLabelSet>(items) : nullptr;
    for (const Point& point : frames[f]) {
      pSet->m_Reconstructions.push_back({point.position});
      if (pTracks) pTracks->m_ReconstructionTracks.push_back({point.track, 1.0f, 0});
      if (pLabels) pLabels->m_ReconstructionLabels.push_back({point.score, 0});
    }
    for (const ZMT::IFlowItemHandle& item : items)
      state->AddItem(item);
    check(writer.WriteState(*state).IsSuccess(), "state");
  }
  if (withStaticItems) check(writer.WriteItems(scene, false).IsSuccess(), "static items");
  check(writer.Close().IsSuccess(), "close");
  return out.Bytes();
}
