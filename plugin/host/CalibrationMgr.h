#pragma once
#include "HostExport.h"
#include <cstdint>

/// The capture volume as calibrated: the floor's extents along X and along the horizontal axis
/// that is not X (Y in a Z-up scene, Z in a Y-up one), whole millimetres.
struct HVolumeProperties {
  std::int32_t m_FloorMinX = 0;
  std::int32_t m_FloorMaxX = 0;
  std::int32_t m_FloorMinYZ = 0;
  std::int32_t m_FloorMaxYZ = 0;
  bool operator==(const HVolumeProperties&) const = default;
};

/// The scene's calibration state that belongs to no single camera.
class ANVIL_HOST_API CalibrationMgr {
public:
  const HVolumeProperties& getVolumeProperties() const { return m_volume; }
  void setVolumeProperties(const HVolumeProperties& i_rVolume) { m_volume = i_rVolume; }

private:
  HVolumeProperties m_volume;
};
