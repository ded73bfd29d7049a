#include "McpRecording.h"
#include "Flow2/Flow2File/VWriter.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Flow2/Flow2Types/CreateFlowItem.h"
#include "Flow2/Flow2Types/FlowCatalogue.h"
#include "Utils/UtilsFileSystem/ReplacingFileStream.h"
#include "plugin/host/AnvilToFlowConvertor.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/NLEClip.h"
#include "plugin/host/OperationStack.h"
#include "plugin/host/SubjectManager.h"

namespace {
// The frame's timecode as a "FlowTimecode" item, when the active clip gives a valid one.
void addTimecode(ZMT::IFlowStoreHandle& io_rStore, ZMT::IFlowState& io_rState,
                 const HTimeManager& i_rTime, HTime i_clipTime) {
  const ZMT::ITimecode<135000000> timecode = i_rTime.getTimecode(i_clipTime);
  if (!timecode.isValid()) return;
  ZMT::IFlowItemHandle item;
  auto* pTimecode = ZMT::CreateFlowItem<ZMT::Catalogue::VFlowTimecode>(io_rStore, item);
  if (!pTimecode) return;
  static_cast<ZMT::ITimecode<135000000>&>(*pTimecode) = timecode;
  io_rState.AddItem(item, io_rState.GetTime());
}
} // namespace

bool McpRecording::write(const std::string& i_rPath) {
  const std::string path = i_rPath;
  UtilsFileSystem::VReplacingFile file;
  if (file.Open(path).IsFailure()) {
    g_db->logError("Unable to open %s for witting.", path.c_str());
    return false;
  }
  UtilsFileSystem::VReplacingFileStream stream(file);

  Flow2Store::VFlowStoreFactory& factory = Flow2Store::GetFlowStoreFactory();
  ZMT::IFlowBufferFactoryHandle buffers;
  ZMT::IFlowStoreHandle store;
  ZMT::IFlowStateFactoryHandle states;
  if (factory.CreateBufferFactory(buffers, nullptr).IsFailure() ||
      factory.CreateStore(store, ZMT::GetFlowCatalogueFactories(), 1).IsFailure() ||
      factory.CreateStateFactory(states).IsFailure()) {
    g_db->logError("Unable to write %s.", path.c_str());
    file.Abandon();
    return false;
  }
  Flow2File::VWriter writer(buffers, store);
  if (writer.Open(&stream).IsFailure()) {
    g_db->logError("Unable to write %s.", path.c_str());
    file.Abandon();
    return false;
  }

  HTimeManager& time = *g_db->getTimeManager();
  const HTimeRange range = time.getPlayRange();
  if (FileExporter::s_doProgress) g_theOperationStack.setTaskRange(1, range.getNumFrames());

  if (m_options.m_exportCameras) {
    AnvilToFlowConvertor convertor;
    convertor.convertCameras(store, m_cameraNames, m_cameras[0], m_cameras[1], m_cameras[2],
                             m_cameras[3], true, false, true);
    // Made and let go: the volume never reaches the file.
    ZMT::IFlowItemHandle volume;
    AnvilToFlowConvertor::convertVolumeProperties(store, volume);
  }
  if (m_options.m_exportSubjects) {
    Items* s = m_subjects.data();
    AnvilToFlowConvertor::convertSubjects(store, s[0], s[1], s[2], s[3], s[4], s[5], s[6], s[7],
                                          s[8], s[9], s[10], s[11]);
  }

  bool written = true;
  const bool dynamic = m_options.m_exportCameraDynamicData || m_options.m_exportSubjectDynamicData;
  if (dynamic && g_db->getSubjectManager()->subjectsHaveAnimation()) {
    const std::int64_t step = time.getTicksPerFrame();
    const NLEClip* pClip = g_db->getActiveClip();
    for (HTime tick = range.getStart(); tick <= range.getEnd() && step > 0; tick += step) {
      ZMT::IFlowStateHandle state;
      if (states->CreateState(state, {tick - step, std::uint64_t(step), 1}, {}, {}).IsFailure()) {
        written = false;
        break;
      }
      if (pClip) addTimecode(store, *state, time, tick - step + pClip->getStartOffset());
      if (m_options.m_exportCameras)
        for (Items& items : m_cameras)
          AnvilToFlowConvertor::addItmesToFlowState(items, *state);
      if (m_options.m_exportSubjects)
        for (Items& items : m_subjects)
          AnvilToFlowConvertor::addItmesToFlowState(items, *state);
      AnvilToFlowConvertor::convertDynamicData(
          store, state, tick, m_options.m_exportCameraDynamicData,
          m_options.m_exportSubjectDynamicData, m_options.m_exportSubjectDynamicData, true, false,
          true);
      // A failed state doesn't stop the take, but the file is then not kept.
      written &= !writer.WriteState(*state).IsFailure();
      if (FileExporter::s_doProgress) g_theOperationStack.stepTask();
    }
  }

  Items all;
  if (m_options.m_exportCameras)
    for (Items& items : m_cameras)
      all.insert(all.end(), items.begin(), items.end());
  if (m_options.m_exportSubjects)
    for (Items& items : m_subjects)
      all.insert(all.end(), items.begin(), items.end());
  written &= !writer.WriteItems(all, false).IsFailure();
  written &= writer.Close().IsSuccess();
  if (!written) {
    // A failed write leaves its reason on the file: committing reports it and keeps the old file.
    if (file.WriteError() != 0)
      file.Commit();
    else
      g_db->logError("Unable to write %s.", path.c_str());
    file.Abandon();
    return false;
  }
  return file.Commit().IsSuccess();
}
