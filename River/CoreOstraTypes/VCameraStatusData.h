#pragma once
// A camera's state beside its calibration: settings, calibration health, wand observations,
// physical status and warnings.

#include <array>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace CoreOstraTypes {

struct VCameraSettings {
  static constexpr const char* FlowClassName = "CameraSettings";
  std::map<std::string, std::string> m_Parameters; ///< setting name to value, as text
  std::string m_DeviceURN;
  bool operator==(const VCameraSettings&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Parameters", "Settings by name", s.m_Parameters);
    v("DeviceURN", "Camera", s.m_DeviceURN);
  }
};

struct VCameraCalibrationHealth {
  static constexpr const char* FlowClassName = "CameraCalibrationHealth";
  double m_AverageReprojectionError = 0.0; ///< pixels
  std::uint64_t m_CameraCalibrationHash = 0;
  std::string m_Name; ///< the camera's name
  bool operator==(const VCameraCalibrationHealth&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("AverageReprojectionError", "Mean reprojection error in pixels",
      s.m_AverageReprojectionError);
    v("CameraCalibrationHash", "Hash of the calibration judged", s.m_CameraCalibrationHash);
    v("Name", "Camera name", s.m_Name);
  }
};

struct VCameraCalibrationHealthAdvanced {
  static constexpr const char* FlowClassName = "CameraCalibrationHealthAdvanced";
  std::string m_Name;
  std::vector<double> m_ReprojectionErrors; ///< pixels, per image region
  std::uint32_t m_SampleCount = 0;
  bool operator==(const VCameraCalibrationHealthAdvanced&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Name", "Camera name", s.m_Name);
    v("ReprojectionErrors", "Mean error per image region in pixels", s.m_ReprojectionErrors);
    v("SampleCount", "Observations judged", s.m_SampleCount);
  }
};

/// The calibration wand as one camera saw it.
struct VCameraWand2d {
  static constexpr const char* FlowClassName = "CameraWand2d";
  std::string m_DeviceURN;
  std::vector<std::array<double, 2>> m_WandPoints; ///< pixels, in the wand's marker order
  bool m_Moving = false;
  std::uint32_t m_LabelStatus = 0; ///< 0 unlabelled, 1 labelled, 2 ambiguous
  bool operator==(const VCameraWand2d&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("WandPoints", "Wand markers in pixels", s.m_WandPoints);
    v("Moving", "The wand moved in this frame", s.m_Moving);
    v("LabelStatus", "How the wand markers were labelled", s.m_LabelStatus);
  }
};

struct VCameraWand3d {
  static constexpr const char* FlowClassName = "CameraWand3d";
  std::vector<std::array<double, 3>> m_WandPoints; ///< world millimetres
  bool m_Moving = false;
  bool operator==(const VCameraWand3d&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("WandPoints", "Wand markers in millimetres", s.m_WandPoints);
    v("Moving", "The wand moved in this frame", s.m_Moving);
  }
};

struct VCameraPhysicalStatus {
  static constexpr const char* FlowClassName = "CameraPhysicalStatus";
  std::int64_t m_BumpTimeStamp = -1; ///< ticks of the last knock, -1 for none
  std::string m_DeviceURN;
  bool operator==(const VCameraPhysicalStatus&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("BumpTimeStamp", "Time of the last knock", s.m_BumpTimeStamp);
    v("DeviceURN", "Camera", s.m_DeviceURN);
  }
};

struct VCameraPhysicalSensorData {
  static constexpr const char* FlowClassName = "CameraPhysicalSensorData";
  std::array<double, 3> m_GravityVector{}; ///< camera axes, metres per second squared
  std::string m_DeviceURN;
  bool operator==(const VCameraPhysicalSensorData&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("GravityVector", "Gravity in the camera's axes", s.m_GravityVector);
    v("DeviceURN", "Camera", s.m_DeviceURN);
  }
};

struct VCameraWarnings {
  static constexpr const char* FlowClassName = "CameraWarnings";
  std::string m_Name; ///< the camera's name
  std::vector<std::string> m_Warnings;
  bool operator==(const VCameraWarnings&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Name", "Camera name", s.m_Name);
    v("Warnings", "Warnings raised by the camera", s.m_Warnings);
  }
};

} // namespace CoreOstraTypes
