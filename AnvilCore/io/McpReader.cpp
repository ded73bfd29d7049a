#include "McpReader.h"
#include "Flow2/Flow2File/VReader.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Flow2/Flow2Types/FlowCatalogue.h"
#include "Flow2/Flow2Types/IFlowResult.h"
#include "exporters/trajectory/c3d/PrintableText.h"
#include "plugin/host/ParameterizedSetup.h"
#include <algorithm>
#include <array>
#include <cmath>
#include <map>
#include <set>
#include <tuple>

namespace AnvilCore {

namespace {

namespace Cat = ZMT::Catalogue;
using ZMT::IFlowItemHandle;
using ZMT::IResult;

// Identifies the reading store; items keep the tokens of the store that wrote them.
constexpr std::uint64_t kReadingStoreId = 0x4d4350526561640bull;
constexpr std::uint32_t kNoTrack = 0xFFFFFFFFu;
// Ticks beyond which a frame time is refused: the clock's range with a wide margin.
constexpr std::int64_t kTickLimit = std::int64_t(1) << 60;
constexpr std::int64_t kFrameLimit = 0x7FFFFFFE;
// Damage reports kept word for word; the rest are counted.
constexpr std::size_t kProblemsShown = 20;

template <class W> const W* asType(const IFlowItemHandle& i_rItem) {
  if (i_rItem.GetToken().m_TypeId != W::FlowTypeId) return nullptr;
  return i_rItem.As<ZMT::Detail::VFlowItem<W>>();
}

template <class W> std::vector<const W*> allOf(const std::vector<IFlowItemHandle>& i_rItems) {
  std::vector<const W*> found;
  for (const IFlowItemHandle& item : i_rItems)
    if (const W* p = asType<W>(item)) found.push_back(p);
  return found;
}

template <class W> const W* firstIn(const ZMT::IFlowState& i_rState) {
  for (ZMT::VRecordPosition p = i_rState.Begin(); p != i_rState.End(); ++p)
    if (const W* pItem = asType<W>(i_rState.GetRecord(p).m_Item)) return pItem;
  return nullptr;
}

bool finite(const std::array<double, 3>& i_rV) {
  return std::isfinite(i_rV[0]) && std::isfinite(i_rV[1]) && std::isfinite(i_rV[2]);
}

std::string tickText(std::int64_t i_tick) {
  return std::to_string(i_tick);
}

// Warnings that may repeat once per frame are counted and reported once.
class CountedWarnings {
public:
  void add(const std::string& i_rKey, const std::string& i_rFirst) {
    auto [it, inserted] = m_counts.try_emplace(i_rKey, Entry{i_rFirst, 0});
    ++it->second.count;
    if (inserted) m_order.push_back(i_rKey);
  }
  void flush(std::vector<std::string>& o_rWarnings) const {
    for (const std::string& key : m_order) {
      const Entry& entry = m_counts.at(key);
      o_rWarnings.push_back(entry.count == 1
                                ? entry.text
                                : entry.text + " (" + std::to_string(entry.count) + " times)");
    }
  }

private:
  struct Entry {
    std::string text;
    std::size_t count;
  };
  std::map<std::string, Entry> m_counts;
  std::vector<std::string> m_order;
};

// The scene's up axis from the turn of the scene: no turn is Z up, a quarter turn about X is Y
// up; any other turn is taken as the nearer of the two.
void readOrientation(const Cat::VFlowSceneOrientation& i_rItem, McpContent& io_rContent) {
  const auto& q = i_rItem.m_Orientation;
  const double norm = std::sqrt(q[0] * q[0] + q[1] * q[1] + q[2] * q[2] + q[3] * q[3]);
  if (!std::isfinite(norm) || norm < 1e-12) {
    io_rContent.warnings.push_back("the scene orientation is not a rotation; up axis not set");
    return;
  }
  // |cos| of half the angle between the turns, for identity and for +-90 degrees about X.
  const double identity = std::fabs(q[3]) / norm;
  const double half = std::sqrt(0.5);
  const double quarter =
      std::max(std::fabs(half * q[0] + half * q[3]), std::fabs(-half * q[0] + half * q[3])) / norm;
  const bool zUp = identity >= quarter;
  if (std::max(identity, quarter) < 1.0 - 1e-9)
    io_rContent.warnings.push_back(std::string("the scene orientation is neither Z up nor Y up; "
                                               "taken as ") +
                                   (zUp ? "Z" : "Y") + " up, the nearer");
  io_rContent.zUp = zUp;
}

// Each subject's local pose in the frame; a subject given twice keeps its first pose.
void readLocalPoses(const ZMT::IFlowState& i_rState, HTime i_time, McpContent& io_rContent) {
  ZMT::VItemHandles poses;
  i_rState.GetItems(poses, Cat::VFlowSubjectLocalPose::FlowTypeId, ZMT::EMatch::Equal,
                    i_rState.GetTime());
  for (const IFlowItemHandle& item : poses) {
    const auto* pPose = asType<Cat::VFlowSubjectLocalPose>(item);
    if (!pPose) continue;
    McpMotion& motion = io_rContent.motions[pPose->m_SubjectId];
    if (!motion.times.empty() && motion.times.back() == i_time) continue;
    motion.times.push_back(i_time);
    motion.poses.push_back(pPose->m_Segments);
  }
}

// The labeling setup's records of each subject, paired by subject id. A subject whose setups
// don't build is left out, with the reason.
void readSubjects(const std::vector<IFlowItemHandle>& i_rItems, McpContent& io_rContent) {
  std::map<std::uint32_t, const Cat::VFlowSubjectParametrised*> subjects;
  for (const auto* p : allOf<Cat::VFlowSubjectParametrised>(i_rItems))
    if (!subjects.emplace(p->m_SubjectId, p).second)
      io_rContent.warnings.push_back("subject id " + std::to_string(p->m_SubjectId) +
                                     " is given twice; the first is kept");
  std::map<std::uint32_t, const Cat::VFlowSubjectApplicationData*> applications;
  for (const auto* p : allOf<Cat::VFlowSubjectApplicationData>(i_rItems))
    applications.emplace(p->m_SubjectId, p);
  std::map<std::uint32_t, const Cat::VFlowSubjectDynamicSubspace*> subspaces;
  for (const auto* p : allOf<Cat::VFlowSubjectDynamicSubspace>(i_rItems))
    subspaces.emplace(p->m_SubjectId, p);

  std::set<std::string> names;
  for (const auto& [id, pSubject] : subjects) {
    // Made printable the same way as the track names, so that "Subject:Marker" still meets it.
    const std::string name = C3D::printableText(pSubject->m_Name);
    if (name.empty()) {
      io_rContent.warnings.push_back("subject id " + std::to_string(id) + " has no name; left out");
      continue;
    }
    if (!names.insert(name).second) {
      io_rContent.warnings.push_back("subject \"" + name + "\" is given twice; the first is kept");
      continue;
    }
    SubjectRecords records;
    records.subject = *pSubject;
    records.subject.m_Name = name;
    if (auto it = applications.find(id); it != applications.end())
      records.application = *it->second;
    else
      io_rContent.warnings.push_back("subject \"" + name +
                                     "\" has no application data; defaults used");
    if (auto it = subspaces.find(id); it != subspaces.end())
      records.subspace = *it->second;
    else
      io_rContent.warnings.push_back("subject \"" + name +
                                     "\" has no dynamic subspace; defaults used");
    std::vector<std::string> errors;
    bool builds = true;
    for (ESetupKind kind : {ESetupKind::ELabeling, ESetupKind::ESolving, ESetupKind::ERetargeting})
      builds = builds && buildSetup(kind, name, records, errors) != nullptr;
    if (!builds) {
      io_rContent.warnings.push_back("subject \"" + name + "\" left out: " +
                                     (errors.empty() ? "its setups don't build" : errors.front()));
      continue;
    }
    io_rContent.subjects.push_back(std::move(records));
  }
}

// Cameras: the hardware items in file order, with the calibrations and masks paired by order
// (the lists are parallel) and the calibration details by device URN.
void readCameras(const std::vector<IFlowItemHandle>& i_rItems, McpContent& io_rContent) {
  const auto hardware = allOf<Cat::VFlowCameraHardware>(i_rItems);
  const auto calibrations = allOf<Cat::VFlowCameraCalibration>(i_rItems);
  const auto details = allOf<Cat::VFlowCameraCalibrationDetails>(i_rItems);
  const auto masks = allOf<Cat::VFlowCameraMaskGrid>(i_rItems);
  const std::string count = std::to_string(hardware.size()) + " cameras";
  const bool pairCalibrations = calibrations.size() == hardware.size();
  if (!pairCalibrations && !calibrations.empty())
    io_rContent.warnings.push_back(std::to_string(calibrations.size()) + " calibrations for " +
                                   count + " can't be paired; cameras left uncalibrated");
  const bool pairMasks = masks.size() == hardware.size();
  if (!pairMasks && !masks.empty())
    io_rContent.warnings.push_back(std::to_string(masks.size()) + " masks for " + count +
                                   " can't be paired; cameras left unmasked");
  std::vector<bool> detailUsed(details.size(), false);
  for (std::size_t c = 0; c < hardware.size(); ++c) {
    McpCamera camera;
    camera.hardware = *hardware[c];
    if (pairCalibrations) {
      const auto& calibration = *calibrations[c];
      if (finite(calibration.m_Position) && finite(calibration.m_Orientation) &&
          std::isfinite(calibration.m_FocalLength))
        camera.calibration = calibration;
      else
        io_rContent.warnings.push_back("camera " + std::to_string(c + 1) +
                                       ": calibration has values that are not numbers; left "
                                       "uncalibrated");
    }
    if (pairMasks) camera.mask = *masks[c];
    for (std::size_t d = 0; d < details.size(); ++d)
      if (!detailUsed[d] && details[d]->m_DeviceURN == camera.hardware.m_DeviceURN) {
        detailUsed[d] = true;
        camera.details = *details[d];
        break;
      }
    io_rContent.cameras.push_back(std::move(camera));
  }
  const auto unused = std::count(detailUsed.begin(), detailUsed.end(), false);
  if (unused > 0)
    io_rContent.warnings.push_back(std::to_string(unused) +
                                   " calibration details name no camera of the file; ignored");
}

// The trajectories of the frames, gathered track by track.
class TrackGatherer {
public:
  explicit TrackGatherer(McpContent& io_rContent) : m_content(io_rContent) {}

  void frame(const ZMT::IFlowState& i_rState, HTime i_time) {
    for (ZMT::VRecordPosition p = i_rState.Begin(); p != i_rState.End(); ++p)
      if (const auto* pTable = asType<Cat::VFlowParametersItem>(i_rState.GetRecord(p).m_Item)) {
        table(*pTable, i_rState.GetRecord(p).m_Token);
        break;
      }
    const auto* pSet = firstIn<Cat::VFlowReconstructionSet>(i_rState);
    if (!pSet) return;
    const auto& points = pSet->m_Reconstructions;
    const auto* pTracks = firstIn<Cat::VFlowReconstructionTrackSet>(i_rState);
    const auto* pLabels = firstIn<Cat::VFlowReconstructionLabelSet>(i_rState);
    const bool tracked = pTracks && pTracks->m_ReconstructionTracks.size() == points.size();
    if (!tracked)
      m_warnings.add("untracked", pTracks ? "a track set doesn't match its points; points "
                                            "taken as tracks by position"
                                          : "points without a track set taken as tracks by "
                                            "position");
    const bool labelled = pLabels && pLabels->m_ReconstructionLabels.size() == points.size();
    if (pLabels && !labelled)
      m_warnings.add("labels", "a label set doesn't match its points; labels ignored");
    for (std::size_t i = 0; i < points.size(); ++i) {
      const std::uint32_t id =
          tracked ? pTracks->m_ReconstructionTracks[i].m_TrackId : std::uint32_t(i);
      if (id == kNoTrack) {
        m_warnings.add("notrack", "a point without a track was left out");
        continue;
      }
      if (!finite(points[i].m_Position)) {
        m_warnings.add("nan", "a point whose position is not a number was left out");
        continue;
      }
      Track& track = m_tracks[id];
      if (!track.times.empty() && track.times.back() == i_time) {
        m_warnings.add("twice", "a track with two points in one frame kept the first (track " +
                                    std::to_string(id) + ", tick " + tickText(i_time) + ")");
        continue;
      }
      const auto& p = points[i].m_Position;
      track.times.push_back(i_time);
      track.positions.emplace_back(p[0], p[1], p[2]);
      if (labelled && !track.flagged) {
        track.flagged = true;
        track.unlabelled = !(pLabels->m_ReconstructionLabels[i].m_Score > 0.0f);
      }
    }
  }

  void finish() {
    for (const auto& [id, label] : m_labels)
      m_tracks.try_emplace(id);
    std::size_t unnamed = 0, unprintable = 0;
    m_content.tracks.reserve(m_tracks.size());
    for (auto& [id, gathered] : m_tracks) {
      McpTrack track;
      track.trackId = id;
      const auto label = m_labels.find(id);
      if (label != m_labels.end() && !label->second.empty()) {
        track.label = C3D::printableText(label->second);
        if (track.label != label->second) ++unprintable;
      } else {
        track.label = "Track" + std::to_string(id);
        ++unnamed;
      }
      track.unlabelled =
          gathered.flagged ? gathered.unlabelled : !track.label.empty() && track.label[0] == '*';
      track.times = std::move(gathered.times);
      track.positions = std::move(gathered.positions);
      m_content.tracks.push_back(std::move(track));
    }
    m_tracks.clear();
    if (!m_sawTable && !m_content.tracks.empty())
      m_content.warnings.push_back("no trajectory table: tracks named Track<id>");
    else if (unnamed > 0)
      m_content.warnings.push_back(std::to_string(unnamed) +
                                   " tracks have no name in the trajectory table: named "
                                   "Track<id>");
    if (unprintable > 0)
      m_content.warnings.push_back(std::to_string(unprintable) +
                                   " track names had characters that can't be printed, replaced "
                                   "by \"?\"");
    m_warnings.flush(m_content.warnings);
  }

private:
  struct Track {
    std::vector<HTime> times;
    std::vector<Vec3> positions;
    bool flagged = false;
    bool unlabelled = false;
  };

  // The table is the same item in every frame; a later one only adds names.
  void table(const Cat::VFlowParametersItem& i_rTable, const ZMT::IFlowItemToken& i_rToken) {
    if (m_sawTable && i_rToken == m_lastTable) return;
    m_sawTable = true;
    m_lastTable = i_rToken;
    for (const auto& [key, label] : i_rTable.m_Tags) {
      const auto [it, inserted] = m_labels.try_emplace(std::uint32_t(key), label);
      if (!inserted && it->second != label)
        m_warnings.add("renamed", "track " + std::to_string(std::uint32_t(key)) +
                                      " is named both \"" + it->second + "\" and \"" + label +
                                      "\"; the first name is kept");
    }
  }

  McpContent& m_content;
  std::map<std::uint32_t, Track> m_tracks;
  std::map<std::uint32_t, std::string> m_labels;
  ZMT::IFlowItemToken m_lastTable;
  bool m_sawTable = false;
  CountedWarnings m_warnings;
};

std::string openFailure(IResult i_result) {
  if (i_result == IResult(IResult::InvalidFormat)) return "not an MCP file (no Flow file header)";
  if (i_result == IResult(IResult::InvalidVersion))
    return "an MCP file of another format version (this build reads version 1)";
  return std::string("cannot be read: ") + ZMT::GetResultText(i_result);
}

void addUnique(const std::vector<IFlowItemHandle>& i_rFrom, std::vector<IFlowItemHandle>& io_rTo,
               std::set<std::tuple<std::uint32_t, std::uint32_t, std::uint64_t>>& io_rSeen) {
  for (const IFlowItemHandle& item : i_rFrom) {
    const ZMT::IFlowItemToken token = item.GetToken();
    if (io_rSeen.emplace(token.m_ItemId, token.m_TypeId, token.m_FlowStoreId).second)
      io_rTo.push_back(item);
  }
}

} // namespace

CameraRecords McpCamera::records() const {
  CameraRecords out;
  out.hardware = hardware;
  out.pCalibration = calibration ? &*calibration : nullptr;
  out.pDetails = details ? &*details : nullptr;
  out.pMask = mask ? &*mask : nullptr;
  return out;
}

bool readMcp(ZMT::IInputStreamSeekable& io_rStream, McpContent& o_rContent, std::string& o_rError) {
  o_rContent = McpContent();
  auto& factory = Flow2Store::GetFlowStoreFactory();
  ZMT::IFlowStoreHandle store;
  ZMT::IFlowBufferFactoryHandle buffers;
  ZMT::IFlowStateFactoryHandle states;
  IResult result = factory.CreateStore(store, ZMT::GetFlowCatalogueFactories(), kReadingStoreId);
  if (result.IsSuccess()) result = factory.CreateBufferFactory(buffers, nullptr);
  if (result.IsSuccess()) result = factory.CreateStateFactory(states);
  if (result.IsFailure()) {
    o_rError = std::string("cannot set up the item store: ") + ZMT::GetResultText(result);
    return false;
  }

  Flow2File::VReader reader(store, buffers, states);
  result = reader.Open(&io_rStream);
  if (result.IsFailure()) {
    o_rError = openFailure(result);
    return false;
  }
  std::vector<std::string>& warnings = o_rContent.warnings;

  std::vector<IFlowItemHandle> statics, sceneItems;
  std::set<std::tuple<std::uint32_t, std::uint32_t, std::uint64_t>> seen;
  reader.ReadStaticItems(statics);
  addUnique(statics, sceneItems, seen);

  // Frames: the first frame's session and rate; states of another session or rate are left out.
  const auto& index = reader.GetIndex();
  TrackGatherer gatherer(o_rContent);
  CountedWarnings frameWarnings;
  std::size_t damaged = 0;
  bool sawFirst = false;
  std::uint32_t session = 0;
  std::uint64_t period = 0;
  for (std::size_t i = 0; i < index.size(); ++i) {
    const Flow2File::VReader::VStateEntry& entry = index[i];
    if (entry.m_Period == 0 || entry.m_Period > std::uint64_t(kTickLimit)) {
      frameWarnings.add("rate", "frames without a usable rate were left out");
      continue;
    }
    if (!sawFirst) {
      sawFirst = true;
      session = entry.m_Session;
      period = entry.m_Period;
    }
    if (entry.m_Session != session || entry.m_Period != period) {
      frameWarnings.add("session", "frames of a later session or another rate were left out");
      continue;
    }
    if (entry.m_Tick <= -kTickLimit || entry.m_Tick >= kTickLimit) {
      frameWarnings.add("range", "frames outside the clock's range were left out");
      continue;
    }
    const HTime time = entry.m_Tick + std::int64_t(period);
    // Frame numbers are ints in the host's clock.
    if (time / std::int64_t(period) > kFrameLimit || time / std::int64_t(period) < -kFrameLimit) {
      frameWarnings.add("range", "frames outside the clock's range were left out");
      continue;
    }
    if (o_rContent.frameCount > 0 && time <= o_rContent.lastTime) {
      frameWarnings.add("order", "frames out of time order were left out");
      continue;
    }
    ZMT::IFlowStateHandle state;
    result = reader.ReadState(i, state);
    if (result.IsFailure() || !state) {
      ++damaged;
      continue;
    }
    if (result == IResult(IResult::OkButPartial))
      frameWarnings.add("partial", "frames with items that could not be read");
    if (o_rContent.frameCount == 0) {
      // The frames repeat the scene's items; a file without an item table still has them here.
      std::vector<IFlowItemHandle> items;
      for (ZMT::VRecordPosition p = state->Begin(); p != state->End(); ++p)
        items.push_back(state->GetRecord(p).m_Item);
      addUnique(items, sceneItems, seen);
      o_rContent.firstTime = time;
    }
    if (!o_rContent.zUp)
      if (const auto* pOrientation = firstIn<Cat::VFlowSceneOrientation>(*state))
        readOrientation(*pOrientation, o_rContent);
    gatherer.frame(*state, time);
    readLocalPoses(*state, time, o_rContent);
    if (!o_rContent.timecode)
      if (const auto* pTimecode = firstIn<Cat::VFlowTimecode>(*state);
          pTimecode && pTimecode->isValid()) {
        o_rContent.timecode = static_cast<const ZMT::ITimecode<135000000>&>(*pTimecode);
        o_rContent.timecodeTick = entry.m_Tick;
      }
    o_rContent.lastTime = time;
    ++o_rContent.frameCount;
  }
  if (!index.empty() && o_rContent.frameCount == 0 && sceneItems.empty()) {
    o_rError = "damaged: none of its " + std::to_string(index.size()) + " frames can be read";
    if (!reader.GetProblems().empty())
      o_rError += " (" + C3D::printableText(reader.GetProblems().front()) + ")";
    return false;
  }
  if (o_rContent.frameCount > 0) o_rContent.ticksPerFrame = std::int64_t(period);
  if (damaged > 0) warnings.push_back(std::to_string(damaged) + " damaged frames were left out");
  frameWarnings.flush(warnings);

  readSubjects(sceneItems, o_rContent);
  readCameras(sceneItems, o_rContent);
  gatherer.finish();

  const auto& problems = reader.GetProblems();
  for (std::size_t i = 0; i < problems.size() && i < kProblemsShown; ++i)
    warnings.push_back("damaged: " + problems[i]);
  if (problems.size() > kProblemsShown)
    warnings.push_back("damaged: " + std::to_string(problems.size() - kProblemsShown) +
                       " more problems");
  if (index.empty() && sceneItems.empty())
    warnings.push_back("the file holds no frames, cameras or subjects");
  for (std::string& warning : warnings)
    warning = C3D::printableText(warning);
  return true;
}

} // namespace AnvilCore
