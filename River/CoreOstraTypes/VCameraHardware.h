#pragma once
// What a camera is, independent of where it stands: its identity and its sensor.

#include <cstdint>
#include <string>

namespace CoreOstraTypes {

class VCameraHardware {
public:
  /// Unique device name, "<kind>:<serial>"; the number behind the first ":" is the device id.
  std::string m_DeviceURN;
  /// Free text of the device (firmware, model line); carried along, not written to XCP.
  std::string m_DeviceName;
  std::string m_Type;
  /// The type as shown to users.
  std::string m_DisplayType;
  std::int32_t m_SensorWidth = 0;  ///< pixels
  std::int32_t m_SensorHeight = 0; ///< pixels
  double m_PixelAspectRatio = 1.0; ///< pixel width over pixel height

  bool operator==(const VCameraHardware&) const = default;
};

} // namespace CoreOstraTypes
