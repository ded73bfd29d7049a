#pragma once
// Small MCP recordings written in the test through the Flow file writer and catalogue items, in
// the layout the exporter gives: static camera and subject items, one state per frame with the
// reconstructions, their tracks and labels, and the trajectory table shared by every frame.
#include "AnvilCore/SubjectSetupBuilder.h"
#include "River/CoreOstraTypes/VCameraCalibration.h"
#include "River/CoreOstraTypes/VCameraCalibrationDetails.h"
#include "River/CoreOstraTypes/VCameraHardware.h"
#include "River/CoreOstraTypes/VCameraMaskGrid.h"
#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

struct McpTestFile {
  struct Point {
    std::uint32_t track = 0;
    std::array<double, 3> position{};
    float score = 1.0f; ///< 0 for a marker flagged unlabelled
  };
  struct Camera {
    CoreOstraTypes::VCameraHardware hardware;
    CoreOstraTypes::VCameraCalibration calibration; ///< focal length 0: not calibrated
    CoreOstraTypes::VCameraCalibrationDetails details;
    CoreOstraTypes::VCameraMaskGrid mask;
  };

  std::int64_t ticksPerFrame = 1125000; ///< 120 Hz
  std::int64_t firstFrame = 0;          ///< scene frame of frames[0]
  std::vector<std::vector<Point>> frames;
  std::map<std::int32_t, std::string> table; ///< track id -> label
  bool withTable = true;
  bool withTrackSet = true;
  bool withLabelSet = true;
  bool withStaticItems = true; ///< the closing item table of static items
  std::optional<std::array<double, 4>> orientation;
  std::vector<AnvilCore::SubjectRecords> subjects; ///< subject ids 1, 2, ... in this order
  std::vector<Camera> cameras;

  std::vector<std::uint8_t> build() const;
};

/// A camera with every record filled, numbered `i_number`; calibrated unless `i_calibrated` is
/// false.
McpTestFile::Camera mcpTestCamera(int i_number, bool i_calibrated = true);
