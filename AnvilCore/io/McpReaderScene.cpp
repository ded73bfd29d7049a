// The MCP input reader: a recording's trajectories, subjects and cameras back into the scene.
#include "AnvilCore/TimecodeModes.h"
#include "ISceneReader.h"
#include "McpReader.h"
#include "TrajectoryScene.h"
#include "Utils/UtilsFileSystem/MemoryMappedInputStream.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/Marker.h"
#include "plugin/host/NLEClip.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/SubjectBone.h"
#include <cerrno>
#include <cstring>
#include <filesystem>

namespace AnvilCore {

namespace {

// Keys the labeling bones from the recorded local poses; poses that don't fit the setup's bones
// leave the subject standing still.
void animate(Character& io_rCharacter, const McpMotion& i_rMotion, const std::string& i_path) {
  LabelingSetup* pSetup = io_rCharacter.getLabelingSetup(false);
  if (!pSetup) return;
  std::vector<SubjectBone*> bones;
  pSetup->collectBones(bones);
  for (const auto& pose : i_rMotion.poses)
    if (pose.size() != bones.size()) {
      g_db->logWarning("%s: the poses of subject \"%s\" don't match its %zu segments; it is left "
                       "standing still",
                       i_path.c_str(), io_rCharacter.getName().GetStr(), bones.size());
      return;
    }
  for (size_t b = 0; b < bones.size(); ++b) {
    SubjectBone& bone = *bones[b];
    bone.m_positionTrack.clear();
    bone.m_rotationTrack.clear();
    bone.m_positionTrack.reserve(i_rMotion.times.size());
    bone.m_rotationTrack.reserve(i_rMotion.times.size());
    for (size_t f = 0; f < i_rMotion.times.size(); ++f) {
      const CoreOstraTypes::VSubjectPoseRecord& pose = i_rMotion.poses[f][b];
      const auto& q = pose.m_Rotation;
      const auto& t = pose.m_Translation;
      bone.m_positionTrack.setKey(i_rMotion.times[f], Vec3(t[0], t[1], t[2]));
      bone.m_rotationTrack.setKey(i_rMotion.times[f], AnvilRotation(q[0], q[1], q[2], q[3], false));
    }
  }
}

// The recorded timecode becomes the scene's timecode mode and an active clip over the recorded
// frames whose start offset gives each frame the timecode it was recorded with.
void addClip(const McpContent& i_rContent, const std::string& i_path) {
  if (!i_rContent.timecode || i_rContent.frameCount == 0) return;
  const ZMT::ITimecode<135000000>& timecode = *i_rContent.timecode;
  const int mode = timecodeModeOfStandard(timecode.m_standard);
  if (mode < 0) return;
  HTimeManager& time = *g_db->getTimeManager();
  time.setTimecodeMode(mode);
  const HTime label = time.timecodeToTime(timecode.m_hours, timecode.m_minutes, timecode.m_seconds,
                                          timecode.m_frames);
  if (label < 0) return;
  const std::string name = std::filesystem::path(i_path).stem().string();
  auto* pClip = new NLEClip(HString(name.empty() ? "Take" : name),
                            HTimeRange(i_rContent.firstTime, i_rContent.lastTime),
                            label + HTime(timecode.m_subframes) - i_rContent.timecodeTick);
  g_db->addClip(pClip);
  g_db->setActiveClip(pClip, false, false, false);
}

// Everything is built apart from the scene before the first change to it, so a file that fails
// leaves the scene as it was.
void addToScene(McpContent& io_rContent, const std::string& i_path) {
  // Trajectories come only with frames; a file of cameras and subjects leaves the clock alone.
  if (io_rContent.frameCount > 0) {
    std::vector<std::string> labels;
    labels.reserve(io_rContent.tracks.size());
    for (const McpTrack& track : io_rContent.tracks)
      labels.push_back(track.label);
    const double rate = double(kTicksPerSecond) / double(io_rContent.ticksPerFrame);
    TrajectorySceneBuilder builder(rate, labels);
    for (size_t m = 0; m < io_rContent.tracks.size(); ++m) {
      McpTrack& track = io_rContent.tracks[m];
      Marker& marker = builder.marker(int(m));
      marker.setUnlabeled(track.unlabelled);
      marker.m_track.appendKeys(track.times.data(), track.positions.data(), track.times.size());
      // The keys now live in the track; let the copy go before the next one is made.
      std::vector<HTime>().swap(track.times);
      std::vector<Vec3>().swap(track.positions);
    }
    builder.commit(HTimeRange(io_rContent.firstTime, io_rContent.lastTime));
  }
  // Subjects join the characters their markers made; their setups were checked to build.
  for (const SubjectRecords& records : io_rContent.subjects) {
    std::vector<std::string> errors;
    Character* pCharacter = addSubjectToScene(records, errors);
    if (!pCharacter) {
      g_db->logWarning("%s: subject \"%s\" left out: %s", i_path.c_str(),
                       records.subject.m_Name.c_str(),
                       errors.empty() ? "unknown reason" : errors.front().c_str());
      continue;
    }
    if (auto it = io_rContent.motions.find(records.subject.m_SubjectId);
        it != io_rContent.motions.end())
      animate(*pCharacter, it->second, i_path);
  }
  // The file doesn't carry the cameras' scene names: they are numbered in the file's order.
  for (size_t c = 0; c < io_rContent.cameras.size(); ++c) {
    const int number = int(c) + 1;
    auto pCamera = opticalCameraFromRecords("Camera " + std::to_string(number), number,
                                            io_rContent.cameras[c].records());
    g_db->addToScene(pCamera.release(), false, nullptr, false, false);
  }
  if (io_rContent.zUp) g_db->setZUp(*io_rContent.zUp);
  addClip(io_rContent, i_path);
}

class McpSceneReader : public ISceneReader {
public:
  std::vector<std::string> extensions() const override { return {"mcp"}; }
  std::string description() const override {
    return "MCP recording: trajectories, subjects and cameras";
  }

  bool read(const std::string& i_path, std::string& o_rError) override {
    std::error_code code;
    if (!std::filesystem::is_regular_file(i_path, code)) {
      o_rError =
          i_path + ": cannot open: " +
          (std::filesystem::exists(i_path, code) ? "not a regular file" : std::strerror(ENOENT));
      return false;
    }
    errno = 0;
    auto [pStream, result] = UtilsFileSystem::OpenInputStream(i_path);
    if (!pStream) {
      o_rError = i_path + ": cannot open: " + std::strerror(errno ? errno : EIO);
      return false;
    }
    McpContent content;
    std::string error;
    if (!readMcp(*pStream, content, error)) {
      o_rError = i_path + ": " + error;
      return false;
    }
    pStream.reset();
    logReaderWarnings(i_path, content.warnings);
    const size_t markers = content.tracks.size();
    const size_t frames = content.frameCount;
    const size_t subjects = content.subjects.size();
    const size_t cameras = content.cameras.size();
    const double rate =
        content.ticksPerFrame > 0 ? double(kTicksPerSecond) / double(content.ticksPerFrame) : 0.0;
    addToScene(content, i_path);
    g_db->logInfo("%s: %zu markers, %zu frames at %g Hz, %zu subjects, %zu cameras", i_path.c_str(),
                  markers, frames, rate, subjects, cameras);
    return true;
  }
};

} // namespace

} // namespace AnvilCore

using AnvilCore::McpSceneReader;
ANVIL_REGISTER_SCENE_READER(McpSceneReader)
