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
  static constexpr const char* FlowClassName = "CameraHardware";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "", s.m_DeviceURN);
    v("DeviceName", "", s.m_DeviceName);
    v("Type", "", s.m_Type);
    v("DisplayType", "", s.m_DisplayType);
    v("SensorWidth", "", s.m_SensorWidth);
    v("SensorHeight", "", s.m_SensorHeight);
    v("PixelAspectRatio", "", s.m_PixelAspectRatio);
  }
};

} // namespace CoreOstraTypes
