#include "plugin/host/AnvilToFlowConvertor.h"
#include "AnvilToFlowItems.h"
#include "Flow2/Flow2Types/FlowCatalogue.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HCameraConverter.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectManager.h"

namespace Cat = ZMT::Catalogue;

struct AnvilToFlowConvertor::Impl {
  // Camera lookups: the cameras converted, by device URN.
  std::vector<std::pair<std::string, const OpticalCamera*>> m_cameras;
};

AnvilToFlowConvertor::AnvilToFlowConvertor() : m_pImpl(new Impl) {}
AnvilToFlowConvertor::~AnvilToFlowConvertor() {
  delete m_pImpl;
}

bool AnvilToFlowConvertor::convertCameras(ZMT::IFlowStoreHandle& io_rStore,
                                          std::vector<std::string>& o_rNames, Items& o_rHardware,
                                          Items& o_rCalibrations, Items& o_rDetails,
                                          Items& o_rMasks, bool i_optical, bool i_video,
                                          bool i_calibrations) {
  m_pImpl->m_cameras.clear();
  if (!i_optical) return true;
  for (int i = 0; i < g_db->getNumOpticalCameras(); ++i) {
    const OpticalCamera* pCamera = g_db->getOpticalCamera(i);
    if (pCamera->isDV() && !i_video) continue;
    ZMT::IFlowItemHandle hardware, mask;
    auto* pHardware = ZMT::CreateFlowItem<Cat::VFlowCameraHardware>(io_rStore, hardware);
    auto* pMask = ZMT::CreateFlowItem<Cat::VFlowCameraMaskGrid>(io_rStore, mask);
    if (!pHardware || !pMask) return false;
    HCameraConverter::convertOpticalCameraToVCameraHardware(*pCamera, *pHardware);
    HCameraConverter::convertOpticalCameraToVCameraMask(*pCamera, *pMask);
    if (i_calibrations) {
      ZMT::IFlowItemHandle calibration, details;
      auto* pCalibration = ZMT::CreateFlowItem<Cat::VFlowCameraCalibration>(io_rStore, calibration);
      auto* pDetails = ZMT::CreateFlowItem<Cat::VFlowCameraCalibrationDetails>(io_rStore, details);
      if (!pCalibration || !pDetails) return false;
      // An uncalibrated camera keeps a zero focal length: the lists stay parallel.
      static_cast<CoreOstraTypes::VCameraCalibration&>(*pCalibration) = {};
      if (pCamera->isCalibrated())
        HCameraConverter::convertOpticalCameraToVCameraCalibration(*pCamera, *pCalibration);
      static_cast<CoreOstraTypes::VCameraCalibrationDetails&>(*pDetails) = {};
      HCameraConverter::convertOpticalCameraToVCameraCalibrationDetails(*pCamera, *pDetails);
      o_rCalibrations.push_back(std::move(calibration));
      o_rDetails.push_back(std::move(details));
    }
    o_rNames.push_back(pCamera->getName().GetString());
    m_pImpl->m_cameras.emplace_back(pHardware->m_DeviceURN, pCamera);
    o_rHardware.push_back(std::move(hardware));
    o_rMasks.push_back(std::move(mask));
  }
  return true;
}

void AnvilToFlowConvertor::convertVolumeProperties(ZMT::IFlowStoreHandle& io_rStore,
                                                   ZMT::IFlowItemHandle& o_rItem) {
  auto* pVolume = ZMT::CreateFlowItem<Cat::VFlowVolumeProperties>(io_rStore, o_rItem);
  if (!pVolume) return;
  const HVolumeProperties& volume = g_db->getCalibrationMgr()->getVolumeProperties();
  pVolume->m_MinX = float(volume.m_FloorMinX);
  pVolume->m_MaxX = float(volume.m_FloorMaxX);
  pVolume->m_MinY = float(volume.m_FloorMinYZ);
  pVolume->m_MaxY = float(volume.m_FloorMaxYZ);
}

namespace {
struct SetupLists {
  AnvilToFlowConvertor::Items& parametrised;
  AnvilToFlowConvertor::Items& subjects;
  AnvilToFlowConvertor::Items& application;
  AnvilToFlowConvertor::Items& subspaces;
};

template <class TParametrised, class TSubject, class TApplication, class TSubspace>
bool convertSetup(ZMT::IFlowStoreHandle& io_rStore, Character& i_rCharacter, int i_mode,
                  const ParameterizedSetup& i_rSetup, std::uint32_t i_subjectId,
                  SetupLists& o_rLists) {
  AnvilSubjectCoreTypesConversion conversion(i_mode);
  if (!conversion.characterToVSubject2(&i_rCharacter, false)) return false;
  ZMT::IFlowItemHandle parametrised, subject, application, subspace;
  auto* pParametrised = ZMT::CreateFlowItem<TParametrised>(io_rStore, parametrised);
  auto* pSubject = ZMT::CreateFlowItem<TSubject>(io_rStore, subject);
  auto* pApplication = ZMT::CreateFlowItem<TApplication>(io_rStore, application);
  auto* pSubspace = ZMT::CreateFlowItem<TSubspace>(io_rStore, subspace);
  if (!pParametrised || !pSubject || !pApplication || !pSubspace) return false;
  static_cast<CoreOstraTypes::VSubjectParametrised&>(*pParametrised) =
      conversion.getSubjectParametrised();
  pParametrised->m_SubjectId = i_subjectId;
  static_cast<CoreOstraTypes::VSubjectApplicationData&>(*pApplication) =
      conversion.getSubjectApplicationData();
  pApplication->m_SubjectId = i_subjectId;
  static_cast<CoreOstraTypes::VSubjectDynamicSubspace&>(*pSubspace) = i_rSetup.getSubspace();
  pSubspace->m_SubjectId = i_subjectId;
  static_cast<CoreOstraTypes::VSubject&>(*pSubject) = {};
  if (!CoreOstraTypesUtils::SubjectFromParametrised(*pParametrised, *pSubject)) {
    g_db->logError("%s: the subject does not evaluate at its own parameters.",
                   i_rCharacter.getName().GetStr());
    return false;
  }
  pSubject->m_SubjectId = i_subjectId;
  o_rLists.parametrised.push_back(std::move(parametrised));
  o_rLists.subjects.push_back(std::move(subject));
  o_rLists.application.push_back(std::move(application));
  o_rLists.subspaces.push_back(std::move(subspace));
  return true;
}
} // namespace

bool AnvilToFlowConvertor::convertSubjects(
    ZMT::IFlowStoreHandle& io_rStore, Items& o_rParametrised, Items& o_rSubjects,
    Items& o_rApplication, Items& o_rSubspaces, Items& o_rParametrisedForSolving,
    Items& o_rSubjectsForSolving, Items& o_rApplicationForSolving, Items& o_rSubspacesForSolving,
    Items& o_rParametrisedForRetargeting, Items& o_rSubjectsForRetargeting,
    Items& o_rApplicationForRetargeting, Items& o_rSubspacesForRetargeting) {
  SetupLists labeling{o_rParametrised, o_rSubjects, o_rApplication, o_rSubspaces};
  SetupLists solving{o_rParametrisedForSolving, o_rSubjectsForSolving, o_rApplicationForSolving,
                     o_rSubspacesForSolving};
  SetupLists retargeting{o_rParametrisedForRetargeting, o_rSubjectsForRetargeting,
                         o_rApplicationForRetargeting, o_rSubspacesForRetargeting};
  bool ok = true;
  SubjectManager* pSubjects = g_db->getSubjectManager();
  for (int i = 0; i < pSubjects->getNumSubjects(); ++i) {
    Character& character = *pSubjects->getSubject(i);
    const auto id = std::uint32_t(i + 1);
    if (const ParameterizedSetup* pSetup = character.getLabelingSetup(false))
      ok &= convertSetup<Cat::VFlowSubjectParametrised, Cat::VFlowSubject,
                         Cat::VFlowSubjectApplicationData, Cat::VFlowSubjectDynamicSubspace>(
          io_rStore, character, AnvilSubjectCoreTypesConversion::ELabeling, *pSetup, id, labeling);
    if (const ParameterizedSetup* pSetup = character.getSolvingSetup(false))
      ok &= convertSetup<Cat::VFlowSubjectParametrisedForSolving, Cat::VFlowSubjectForSolving,
                         Cat::VFlowSubjectApplicationDataForSolving,
                         Cat::VFlowSubjectDynamicSubspaceForSolving>(
          io_rStore, character, AnvilSubjectCoreTypesConversion::ESolving, *pSetup, id, solving);
    if (const ParameterizedSetup* pSetup = character.getRetargetingSetup(false))
      ok &=
          convertSetup<Cat::VFlowSubjectParametrisedForRetargeting, Cat::VFlowSubjectForRetargeting,
                       Cat::VFlowSubjectApplicationDataForRetargeting,
                       Cat::VFlowSubjectDynamicSubspaceForRetargeting>(
              io_rStore, character, AnvilSubjectCoreTypesConversion::ERetargeting, *pSetup, id,
              retargeting);
  }
  return ok;
}

void AnvilToFlowConvertor::addItmesToFlowState(Items& i_rItems, ZMT::IFlowState& io_rState) {
  for (const ZMT::IFlowItemHandle& item : i_rItems)
    io_rState.AddItem(item, io_rState.GetTime());
}

void AnvilToFlowConvertor::convertDynamicData(ZMT::IFlowStoreHandle& io_rStore,
                                              ZMT::IFlowStateHandle& io_rState, std::int64_t i_tick,
                                              bool i_cameras, bool i_subjectPoses,
                                              bool i_subjectLocalPoses, bool i_trajectories,
                                              bool i_forSolving, bool i_orientation) {
  AnvilCore::FlowItems::TakeConverter& take =
      AnvilCore::FlowItems::TakeConverter::forTick(io_rStore, i_tick);
  take.convert(*io_rState, i_tick,
               {i_cameras, i_subjectPoses, i_subjectLocalPoses, i_trajectories, i_forSolving,
                i_orientation});
  take.finishIfLast(i_tick);
}
