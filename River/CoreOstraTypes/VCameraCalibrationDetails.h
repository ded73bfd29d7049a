#pragma once
// How and when a camera's calibration was made: one record for the whole calibration and one for
// its intrinsics.

#include <array>
#include <cstdint>
#include <cstdio>
#include <limits>
#include <string>

namespace CoreOstraTypes {

/// How a calibration was produced. Values are stored in files; never renumber.
enum class ECameraCalibrationType : std::uint8_t {
  NotSet = 0,
  Legacy = 1,
  WandWave = 2,
  SessionBasedAutoHeal = 3,
  AutoBumpHeal = 4,
  ManualBumpHeal = 5,
};

/// Name of a type as files spell it; "Unspecified" for a value outside the enumeration.
inline const char* CameraCalibrationTypeName(ECameraCalibrationType i_type) {
  switch (i_type) {
  case ECameraCalibrationType::NotSet:
    return "NotSet";
  case ECameraCalibrationType::Legacy:
    return "Legacy";
  case ECameraCalibrationType::WandWave:
    return "WandWave";
  case ECameraCalibrationType::SessionBasedAutoHeal:
    return "SessionBasedAutoHeal";
  case ECameraCalibrationType::AutoBumpHeal:
    return "AutoBumpHeal";
  case ECameraCalibrationType::ManualBumpHeal:
    return "ManualBumpHeal";
  }
  return "Unspecified";
}

/// The documentation line of a type; empty for `NotSet` and for values outside the enumeration.
inline const char* CameraCalibrationTypeDescription(ECameraCalibrationType i_type) {
  switch (i_type) {
  case ECameraCalibrationType::Legacy:
    return "Support legacy calibration data.";
  case ECameraCalibrationType::WandWave:
    return "Generated using standard wand wave";
  case ECameraCalibrationType::SessionBasedAutoHeal:
    return "Generated using session-based auto heal method";
  case ECameraCalibrationType::AutoBumpHeal:
    return "Generated using automatically started and terminated";
  case ECameraCalibrationType::ManualBumpHeal:
    return "Centroid was generated using the FitSlow algorithm in software.";
  default:
    return "";
  }
}

/// A 16-byte identifier of one calibration run; all zeros means none.
using VCameraCalibrationId = std::array<std::uint8_t, 16>;

/// Text form of an identifier: 32 lower-case hex digits grouped 8-4-4-4-12.
inline std::string CameraCalibrationIdText(const VCameraCalibrationId& i_rId) {
  char text[37];
  char* p = text;
  for (size_t i = 0; i < i_rId.size(); ++i) {
    if (i == 4 || i == 6 || i == 8 || i == 10) *p++ = '-';
    std::snprintf(p, 3, "%02x", unsigned(i_rId[i]));
    p += 2;
  }
  return std::string(text, p);
}

/// Reads the text form (either case); false, leaving `o_rId` alone, for any other text.
inline bool CameraCalibrationIdFromText(const std::string& i_rText, VCameraCalibrationId& o_rId) {
  if (i_rText.size() != 36) return false;
  VCameraCalibrationId id{};
  size_t byte = 0;
  for (size_t i = 0; i < 36;) {
    if (i == 8 || i == 13 || i == 18 || i == 23) {
      if (i_rText[i++] != '-') return false;
      continue;
    }
    int value = 0;
    for (int k = 0; k < 2; ++k, ++i) {
      const char c = i_rText[i];
      const int digit = (c >= '0' && c <= '9')   ? c - '0'
                        : (c >= 'a' && c <= 'f') ? c - 'a' + 10
                        : (c >= 'A' && c <= 'F') ? c - 'A' + 10
                                                 : -1;
      if (digit < 0) return false;
      value = value * 16 + digit;
    }
    id[byte++] = static_cast<std::uint8_t>(value);
  }
  o_rId = id;
  return true;
}

/// One calibration run.
class VCameraCalibrationDetail {
public:
  static constexpr std::int32_t UnsetTemperature = -1;
  static constexpr std::uint64_t UnsetTime = std::numeric_limits<std::uint64_t>::max();

  ECameraCalibrationType m_Type = ECameraCalibrationType::NotSet;
  std::int32_t m_StartTemperature = UnsetTemperature; ///< degrees Celsius
  std::int32_t m_EndTemperature = UnsetTemperature;
  std::uint64_t m_StartTime = UnsetTime; ///< milliseconds since 1970-01-01 UTC
  std::uint64_t m_EndTime = UnsetTime;
  VCameraCalibrationId m_Id{};

  bool hasTemperature() const {
    return m_StartTemperature != UnsetTemperature || m_EndTemperature != UnsetTemperature;
  }
  bool hasTime() const { return m_StartTime != UnsetTime || m_EndTime != UnsetTime; }
  bool operator==(const VCameraCalibrationDetail&) const = default;
  static constexpr const char* FlowClassName = "CameraCalibrationDetail";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Type", "", s.m_Type);
    v("StartTemperature", "", s.m_StartTemperature);
    v("EndTemperature", "", s.m_EndTemperature);
    v("StartTime", "", s.m_StartTime);
    v("EndTime", "", s.m_EndTime);
    v("Id", "", s.m_Id);
  }
};

class VCameraCalibrationDetails {
public:
  std::string m_DeviceURN;
  /// The whole calibration (pose and lens).
  VCameraCalibrationDetail m_Calibration;
  /// The last calibration of the lens alone.
  VCameraCalibrationDetail m_IntrinsicsCalibration;

  bool operator==(const VCameraCalibrationDetails&) const = default;
  static constexpr const char* FlowClassName = "CameraCalibrationDetails";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "", s.m_DeviceURN);
    v("Calibration", "", s.m_Calibration);
    v("IntrinsicsCalibration", "", s.m_IntrinsicsCalibration);
  }
};

} // namespace CoreOstraTypes
