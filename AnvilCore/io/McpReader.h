#pragma once
// Reading an MCP recording (a chunked Flow file) into plain content: the trajectories with their
// keys, the subjects' records, the cameras' records, the rate and the up axis. Nothing here
// touches the scene; McpReaderScene.cpp adds the content in one step.
#include "AnvilCore/OpticalCameraFromRecords.h"
#include "AnvilCore/SubjectSetupBuilder.h"
#include "Flow2/Flow2Types/ITimecode.h"
#include "River/CoreOstraTypes/VSubjectStateData.h"
#include "Utils/UtilsFileSystem/Streams.h"
#include "plugin/host/HTime.h"
#include "plugin/host/Vec3.h"
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace AnvilCore {

/// One trajectory: its label as the file's trajectory table gives it ("Subject:Marker" or a plain
/// name) and its keys in ascending time.
struct McpTrack {
  std::uint32_t trackId = 0;
  std::string label;
  bool unlabelled = false;
  std::vector<HTime> times;
  std::vector<Vec3> positions; ///< world millimetres
};

/// The records of one camera, in the file's order.
struct McpCamera {
  CoreOstraTypes::VCameraHardware hardware;
  std::optional<CoreOstraTypes::VCameraCalibration> calibration;
  std::optional<CoreOstraTypes::VCameraCalibrationDetails> details;
  std::optional<CoreOstraTypes::VCameraMaskGrid> mask;
  CameraRecords records() const;
};

/// A subject's labeling bones frame by frame, from its local poses: one record per segment in
/// the setup's depth-first bone order.
struct McpMotion {
  std::vector<HTime> times;
  std::vector<std::vector<CoreOstraTypes::VSubjectPoseRecord>> poses;
};

struct McpContent {
  /// Ticks per frame of the recorded frames; 0 when the file holds no frame.
  std::int64_t ticksPerFrame = 0;
  /// Scene times of the first and last frame read, and the number of frames read.
  HTime firstTime = 0;
  HTime lastTime = 0;
  std::size_t frameCount = 0;
  std::vector<McpTrack> tracks; ///< by ascending track id
  /// Subjects of the labeling setup whose setups build, by ascending subject id.
  std::vector<SubjectRecords> subjects;
  std::vector<McpCamera> cameras;
  /// The timecode of the first frame that has a valid one, and the state tick it labels.
  std::optional<ZMT::ITimecode<135000000>> timecode;
  HTime timecodeTick = 0;
  /// Local poses of the subjects, by subject id.
  std::map<std::uint32_t, McpMotion> motions;
  /// The scene's up axis when the file says it.
  std::optional<bool> zUp;
  /// What was repaired, left out or found damaged, one line each.
  std::vector<std::string> warnings;
};

/// Reads a recording from a seekable stream (positioned at the file's start). False with the
/// reason in `o_rError` when the stream is not a recording this build reads, or when nothing of
/// a damaged one can be read.
bool readMcp(ZMT::IInputStreamSeekable& io_rStream, McpContent& o_rContent, std::string& o_rError);

} // namespace AnvilCore
