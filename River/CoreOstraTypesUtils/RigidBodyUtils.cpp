#include "River/CoreOstraTypesUtils/RigidBodyUtils.h"

#include "DebugServices/AssertFail.h"
#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"

#include <algorithm>
#include <map>
#include <set>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectApplicationData;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;

#define RIGID_LOG(level, ...) ZMT_LOG(RigidBodyUtilsChannel, level, __VA_ARGS__)
#define RIGID_ERROR(...) RIGID_LOG(ZMT::ELogError, __VA_ARGS__)

namespace {

void SetState(VSubject::VTarget& target, std::size_t i, double value) {
  target.m_State[i] = value;
}
void SetState(VSubjectParametrised::VTarget& target, std::size_t i, double value) {
  target.m_StateExpressions[i] = FormatExpressionNumber(value);
}
void ResizeState(VSubject::VTarget& target, std::size_t n) {
  target.m_State.resize(n);
}
void ResizeState(VSubjectParametrised::VTarget& target, std::size_t n) {
  target.m_StateExpressions.resize(n);
}

template <class TTarget>
bool WriteRigidBody(TTarget& io_rTarget, const RigidVector& orientation,
                    const RigidVector& position, const std::vector<RigidVector>& positions,
                    const std::vector<RigidCovariance>& covariances,
                    const std::vector<RigidVector>& viewNormals) {
  if (io_rTarget.m_Type != VTargetTypeBase::ERigidBody) {
    RIGID_ERROR("Cannot write rigid body information, this target is not a rigid body!");
    return false;
  }
  if (positions.size() != covariances.size()) {
    RIGID_ERROR("Cannot write rigid body information, different number of marker positions and "
                "covariances!");
    return false;
  }
  const std::size_t m = positions.size();
  if (m < 3) {
    RIGID_ERROR("Cannot write rigid body information, the rigid body does not define a "
                "sufficient number of markers!");
    return false;
  }
  io_rTarget.m_ViewNormals = viewNormals;
  ResizeState(io_rTarget, 3 * (m + 2));
  io_rTarget.m_Covariance.resize(9 * (m + 4));
  for (std::size_t k = 0; k < 3; ++k) {
    SetState(io_rTarget, k, orientation[k]);
    SetState(io_rTarget, 3 + k, position[k]);
  }
  for (std::size_t i = 0; i < m; ++i) {
    for (std::size_t k = 0; k < 3; ++k)
      SetState(io_rTarget, 6 + 3 * i + k, positions[i][k]);
    std::copy(covariances[i].begin(), covariances[i].end(),
              io_rTarget.m_Covariance.begin() + static_cast<std::ptrdiff_t>(36 + 9 * i));
  }
  return true;
}

/// Number of distinct markers that the targets use.
template <class TSubject> std::size_t MarkerCountOfTargets(const TSubject& subject) {
  std::set<std::uint32_t> markers;
  for (const auto& target : subject.m_Targets)
    markers.insert(target.m_MarkerIndices.begin(), target.m_MarkerIndices.end());
  return markers.size();
}

template <class TSubject> bool IsRigidBodyImpl(const TSubject& subject) {
  if (subject.m_Markers.size() < 3) {
    RIGID_ERROR("A rigid body must have at least 3 markers!");
    return false;
  }
  if (subject.m_Segments.empty()) {
    RIGID_ERROR("A rigid body must have at least 1 segment!");
    return false;
  }
  if (subject.m_Segments[0].m_Joint.m_JointType != VJointTypeBase::EFree) {
    RIGID_ERROR("A rigid body must have a free joint as root!");
    return false;
  }
  for (std::size_t i = 1; i < subject.m_Segments.size(); ++i) {
    if (subject.m_Segments[i].m_Joint.m_JointType != VJointTypeBase::EDummy) {
      RIGID_ERROR("All but the root segment must be of dummy type!");
      return false;
    }
  }
  const auto& targets = subject.m_Targets;
  const bool oneBody = targets.size() == 1 && targets[0].m_Type == VTargetTypeBase::ERigidBody;
  const bool onRoot =
      !targets.empty() && std::all_of(targets.begin(), targets.end(), [](const auto& target) {
        return target.m_Type != VTargetTypeBase::ERigidBody &&
               target.m_SegmentIndices.size() == 1 && target.m_SegmentIndices[0] == 0;
      });
  if (!oneBody && !onRoot) {
    RIGID_ERROR("In a rigid body there must be either one target of RigidBody type or several "
                "targets parented to the root segment!");
    return false;
  }
  if (onRoot && MarkerCountOfTargets(subject) < 3) {
    RIGID_ERROR("A rigid body must have at least 3 markers!");
    return false;
  }
  return true;
}

template <class TSubject>
bool AppDataMatches(const TSubject& subject, const VSubjectApplicationData& appData) {
  return appData.m_Markers.size() == subject.m_Markers.size() &&
         appData.m_Segments.size() == subject.m_Segments.size() &&
         appData.m_Targets.size() == subject.m_Targets.size();
}

template <class TSubject>
bool AddRigidBodyImpl(TSubject& io_rSubject, VSubjectApplicationData& io_rAppData,
                      const TSubject& body, const VSubjectApplicationData& bodyAppData,
                      const std::string& parentName) {
  if (!AppDataMatches(io_rSubject, io_rAppData)) {
    RIGID_ERROR("SubjectAppData does not match Subject for %1%", io_rSubject.m_Name);
    return false;
  }
  if (!AppDataMatches(body, bodyAppData)) {
    RIGID_ERROR("RigidBodyAppData does not match RigidBody for cluster %1%", body.m_Name);
    return false;
  }
  if (!IsRigidBodyImpl(body) || body.m_Targets.size() != 1) {
    RIGID_ERROR("Invalid inptut, subject %1% is not a rigid body!", body.m_Name);
    return false;
  }
  const auto& bodyTarget = body.m_Targets[0];
  if (bodyTarget.m_SegmentIndices.size() != 1 ||
      bodyTarget.m_SegmentIndices[0] >= body.m_Segments.size()) {
    RIGID_ERROR("A rigid body target must have a single parent segment!");
    return false;
  }
  const auto& bodySegment = body.m_Segments[bodyTarget.m_SegmentIndices[0]];
  ANVIL_ASSERT(bodySegment.m_Joint.m_JointType == VJointTypeBase::EFree);
  ANVIL_ASSERT(bodyTarget.m_Type == VTargetTypeBase::ERigidBody);

  const auto parent = std::find_if(io_rSubject.m_Segments.begin(), io_rSubject.m_Segments.end(),
                                   [&](const auto& s) { return s.m_Name == parentName; });
  if (parent == io_rSubject.m_Segments.end()) {
    RIGID_ERROR("Cannot attach rigid body to segment %1% the segment does not exist!", parentName);
    return false;
  }
  std::set<std::string> names;
  std::set<std::uint32_t> ids;
  for (const auto& marker : io_rSubject.m_Markers) {
    names.insert(marker.m_Name);
    ids.insert(marker.m_MarkerId);
  }
  for (auto index : bodyTarget.m_MarkerIndices) {
    const auto& marker = body.m_Markers[index];
    if (!names.insert(marker.m_Name).second) {
      RIGID_ERROR("Cannot add this marker, duplicate name: %1%", marker.m_Name);
      return false;
    }
    if (!ids.insert(CoreOstraTypes::NameHash(marker.m_Name)).second) {
      RIGID_ERROR("Cannot add this marker, hash collision for name: %1%", marker.m_Name);
      return false;
    }
  }

  // All checks passed: append segment, markers and target.
  const auto parentIndex = static_cast<std::uint32_t>(parent - io_rSubject.m_Segments.begin());
  const std::uint32_t parentDepth = parent->m_TreeDepth;
  auto segment = bodySegment;
  segment.m_SegmentIndex = static_cast<std::uint32_t>(io_rSubject.m_Segments.size());
  segment.m_ParentSegmentIndex = parentIndex;
  segment.m_TreeDepth = parentDepth + 1;
  io_rSubject.m_Segments.push_back(segment);
  io_rAppData.m_Segments.push_back(bodyAppData.m_Segments[bodyTarget.m_SegmentIndices[0]]);

  auto target = bodyTarget;
  target.m_SegmentIndices = {segment.m_SegmentIndex};
  target.m_MarkerIndices.clear();
  for (auto index : bodyTarget.m_MarkerIndices) {
    target.m_MarkerIndices.push_back(static_cast<std::uint32_t>(io_rSubject.m_Markers.size()));
    auto marker = body.m_Markers[index];
    marker.m_MarkerId = CoreOstraTypes::NameHash(marker.m_Name);
    io_rSubject.m_Markers.push_back(marker);
    io_rAppData.m_Markers.push_back(bodyAppData.m_Markers[index]);
  }
  io_rSubject.m_Targets.push_back(target);
  io_rAppData.m_Targets.push_back(bodyAppData.m_Targets[0]);
  return true;
}

template <class T> void EraseIndices(std::vector<T>& items, const std::vector<bool>& remove) {
  std::size_t out = 0;
  for (std::size_t i = 0; i < items.size(); ++i)
    if (!remove[i]) {
      if (out != i) items[out] = std::move(items[i]);
      ++out;
    }
  items.resize(out);
}

/// Old index to new index after removing the marked entries.
std::map<std::uint32_t, std::uint32_t> Renumbering(const std::vector<bool>& remove) {
  std::map<std::uint32_t, std::uint32_t> map;
  std::uint32_t next = 0;
  for (std::uint32_t i = 0; i < remove.size(); ++i)
    if (!remove[i]) map[i] = next++;
  return map;
}

template <class TSubject>
bool RemoveRigidBodyImpl(TSubject& io_rSubject, std::size_t targetIndex,
                         VSubjectApplicationData* pAppData) {
  if (targetIndex >= io_rSubject.m_Targets.size()) {
    RIGID_ERROR("Cannot remove ERigidBody target, out of range target index!");
    return false;
  }
  const auto& body = io_rSubject.m_Targets[targetIndex];
  if (body.m_Type != VTargetTypeBase::ERigidBody) {
    RIGID_ERROR("Cannot remove a non RigidBody target!");
    return false;
  }
  if (pAppData && !AppDataMatches(io_rSubject, *pAppData)) {
    RIGID_ERROR("SubjectAppData does not match Subject for %1%", io_rSubject.m_Name);
    return false;
  }
  const std::size_t segmentCount = io_rSubject.m_Segments.size();
  const std::uint32_t segment =
      body.m_SegmentIndices.empty() ? 0xFFFFFFFFu : body.m_SegmentIndices[0];
  for (const auto& other : io_rSubject.m_Segments) {
    if (other.m_ParentSegmentIndex.IsSet() && other.m_ParentSegmentIndex.Value() == segment) {
      RIGID_ERROR("No other segment should be parented to a RigidBody segment!");
      return false;
    }
  }
  std::vector<bool> removeMarker(io_rSubject.m_Markers.size(), false);
  for (auto index : body.m_MarkerIndices)
    if (index < removeMarker.size()) removeMarker[index] = true;
  bool segmentShared = false;
  for (std::size_t t = 0; t < io_rSubject.m_Targets.size(); ++t) {
    if (t == targetIndex) continue;
    const auto& other = io_rSubject.m_Targets[t];
    for (auto index : other.m_MarkerIndices) {
      if (index < removeMarker.size() && removeMarker[index]) {
        RIGID_ERROR("No other target should be associated with a target that is part of a "
                    "RigidBody!");
        return false;
      }
    }
    if (std::find(other.m_SegmentIndices.begin(), other.m_SegmentIndices.end(), segment) !=
        other.m_SegmentIndices.end())
      segmentShared = true;
  }
  std::vector<bool> removeSegment(segmentCount, false);
  if (segment < segmentCount && segment != 0 && !segmentShared &&
      io_rSubject.m_Segments[segment].m_Joint.m_JointType == VJointTypeBase::EFree)
    removeSegment[segment] = true;

  const auto markerMap = Renumbering(removeMarker);
  const auto segmentMap = Renumbering(removeSegment);
  // Every index that stays must have a place in the new numbering.
  auto renumber = [](std::vector<std::uint32_t>& indices, const auto& map) {
    for (auto& index : indices) {
      const auto it = map.find(index);
      if (it == map.end()) return false;
      index = it->second;
    }
    return true;
  };
  TSubject edited = io_rSubject;
  edited.m_Targets.erase(edited.m_Targets.begin() + static_cast<std::ptrdiff_t>(targetIndex));
  for (auto& target : edited.m_Targets) {
    if (!renumber(target.m_MarkerIndices, markerMap) ||
        !renumber(target.m_SegmentIndices, segmentMap)) {
      ANVIL_ASSERT(!"remaining index without a new number");
      return false;
    }
  }
  EraseIndices(edited.m_Markers, removeMarker);
  EraseIndices(edited.m_Segments, removeSegment);
  for (auto& s : edited.m_Segments) {
    s.m_SegmentIndex = segmentMap.at(s.m_SegmentIndex);
    if (s.m_ParentSegmentIndex.IsSet())
      s.m_ParentSegmentIndex = segmentMap.at(s.m_ParentSegmentIndex.Value());
  }
  io_rSubject = std::move(edited);
  if (pAppData) {
    pAppData->m_Targets.erase(pAppData->m_Targets.begin() +
                              static_cast<std::ptrdiff_t>(targetIndex));
    EraseIndices(pAppData->m_Markers, removeMarker);
    EraseIndices(pAppData->m_Segments, removeSegment);
    // Sticks to removed markers go; the others follow the renumbering.
    std::vector<VSubjectApplicationData::VStick> sticks;
    for (auto stick : pAppData->m_Sticks) {
      const auto a = markerMap.find(stick.m_MarkerIndexA), b = markerMap.find(stick.m_MarkerIndexB);
      if (a == markerMap.end() || b == markerMap.end()) continue;
      stick.m_MarkerIndexA = a->second;
      stick.m_MarkerIndexB = b->second;
      sticks.push_back(stick);
    }
    pAppData->m_Sticks = std::move(sticks);
  }
  return true;
}

} // namespace

bool ReadRigidBodyInformation(const VSubject::VTarget& target, RigidVector& o_rOrientation,
                              RigidVector& o_rPosition,
                              std::vector<RigidVector>& o_rMarkerPositions,
                              std::vector<RigidCovariance>& o_rMarkerCovariances) {
  if (target.m_Type != VTargetTypeBase::ERigidBody) {
    RIGID_ERROR("Cannot read rigid body information, this target is not a rigid body!");
    return false;
  }
  const std::size_t m = target.m_MarkerIndices.size();
  if (m < 3) {
    RIGID_ERROR("Cannot read rigid body information, the rigid body does not define a sufficient "
                "number of markers!");
    return false;
  }
  if (target.m_State.size() != 3 * (m + 2)) {
    RIGID_ERROR("Cannot read rigid body information, Incorrect state size!");
    return false;
  }
  if (!target.m_Covariance.empty() && target.m_Covariance.size() != 9 * (m + 4)) {
    RIGID_ERROR("Cannot read rigid body information, Incorrect covariance size!");
    return false;
  }
  const auto& state = target.m_State;
  std::copy_n(state.begin(), 3, o_rOrientation.begin());
  std::copy_n(state.begin() + 3, 3, o_rPosition.begin());
  o_rMarkerPositions.resize(m);
  o_rMarkerCovariances.assign(m, RigidCovariance{});
  for (std::size_t i = 0; i < m; ++i) {
    std::copy_n(state.begin() + static_cast<std::ptrdiff_t>(6 + 3 * i), 3,
                o_rMarkerPositions[i].begin());
    if (!target.m_Covariance.empty()) {
      std::copy_n(target.m_Covariance.begin() + static_cast<std::ptrdiff_t>(36 + 9 * i), 9,
                  o_rMarkerCovariances[i].begin());
    }
    auto& covariance = o_rMarkerCovariances[i];
    if (std::all_of(covariance.begin(), covariance.end(), [](double v) { return v == 0.0; })) {
      RIGID_LOG(ZMT::ELogWarning, "Zero covariance on rigid body marker, filling up with default!");
      covariance[0] = covariance[4] = covariance[8] = DefaultRigidBodyMarkerVariance;
    }
  }
  return true;
}

bool WriteRigidBodyInformation(VSubject::VTarget& io_rTarget, const RigidVector& orientation,
                               const RigidVector& position,
                               const std::vector<RigidVector>& markerPositions,
                               const std::vector<RigidCovariance>& markerCovariances,
                               const std::vector<RigidVector>& viewNormals) {
  return WriteRigidBody(io_rTarget, orientation, position, markerPositions, markerCovariances,
                        viewNormals);
}

bool WriteRigidBodyInformation(VSubjectParametrised::VTarget& io_rTarget,
                               const RigidVector& orientation, const RigidVector& position,
                               const std::vector<RigidVector>& markerPositions,
                               const std::vector<RigidCovariance>& markerCovariances,
                               const std::vector<RigidVector>& viewNormals) {
  return WriteRigidBody(io_rTarget, orientation, position, markerPositions, markerCovariances,
                        viewNormals);
}

bool WriteRigidBodyMarkers(VSubject::VTarget& io_rTarget,
                           const std::vector<RigidVector>& markerPositions,
                           const std::vector<RigidCovariance>& markerCovariances) {
  const std::size_t m = io_rTarget.m_MarkerIndices.size();
  if (io_rTarget.m_Type != VTargetTypeBase::ERigidBody || m < 3 || markerPositions.size() != m ||
      markerCovariances.size() != m || io_rTarget.m_State.size() != 3 * (m + 2)) {
    RIGID_ERROR("Cannot write marker position and covariances to the rigid body target!");
    return false;
  }
  const RigidVector orientation{io_rTarget.m_State[0], io_rTarget.m_State[1],
                                io_rTarget.m_State[2]};
  const RigidVector position{io_rTarget.m_State[3], io_rTarget.m_State[4], io_rTarget.m_State[5]};
  const auto normals = io_rTarget.m_ViewNormals;
  return WriteRigidBody(io_rTarget, orientation, position, markerPositions, markerCovariances,
                        normals);
}

bool ConvertToRigidBodyTarget(VSubject& io_rSubject) {
  if (!IsRigidBodyImpl(io_rSubject)) {
    RIGID_ERROR("Invalid input, subject %1% is not a rigid body!", io_rSubject.m_Name);
    return false;
  }
  auto& targets = io_rSubject.m_Targets;
  if (targets.size() == 1 && targets[0].m_Type == VTargetTypeBase::ERigidBody) {
    RIGID_LOG(ZMT::ELogInfo, "No conversion needed for subject %1%!", io_rSubject.m_Name);
    return true;
  }
  const bool points = std::all_of(targets.begin(), targets.end(), [](const auto& t) {
    return (t.m_Type == VTargetTypeBase::ELocalPointToWorldPoint ||
            t.m_Type == VTargetTypeBase::ELocalPointToWorldPointGaussian) &&
           t.m_MarkerIndices.size() == 1 && t.m_State.size() == 3;
  });
  if (targets.size() < 3 || !points) {
    RIGID_ERROR("Invalid number of targets for subject %1%", io_rSubject.m_Name);
    return false;
  }
  VSubject::VTarget body;
  body.m_Type = VTargetTypeBase::ERigidBody;
  body.m_SegmentIndices = {0};
  body.m_Weight = targets[0].m_Weight;
  std::vector<RigidVector> positions;
  std::vector<RigidCovariance> covariances;
  std::vector<RigidVector> normals;
  bool anyNormal = false;
  for (const auto& t : targets) {
    body.m_MarkerIndices.push_back(t.m_MarkerIndices[0]);
    positions.push_back({t.m_State[0], t.m_State[1], t.m_State[2]});
    RigidCovariance covariance{};
    if (t.m_Covariance.size() == 9) std::copy_n(t.m_Covariance.begin(), 9, covariance.begin());
    covariances.push_back(covariance);
    normals.push_back(t.m_ViewNormals.empty() ? RigidVector{} : t.m_ViewNormals[0]);
    anyNormal = anyNormal || !t.m_ViewNormals.empty();
  }
  if (!anyNormal) normals.clear();
  if (!WriteRigidBody(body, {0, 0, 0}, {0, 0, 0}, positions, covariances, normals)) return false;
  targets = {body};
  return true;
}

bool ConvertToPointTargets(VSubject& io_rSubject) {
  if (!IsRigidBodyImpl(io_rSubject)) {
    RIGID_ERROR("Invalid input, subject %1% is not a rigid body!", io_rSubject.m_Name);
    return false;
  }
  auto& targets = io_rSubject.m_Targets;
  if (targets[0].m_Type != VTargetTypeBase::ERigidBody) {
    RIGID_LOG(ZMT::ELogInfo, "No conversion needed for subject %1%!", io_rSubject.m_Name);
    return true;
  }
  if (targets.size() != 1) {
    RIGID_ERROR("Invalid number of targets for subject %1%", io_rSubject.m_Name);
    return false;
  }
  const auto& body = targets[0];
  RigidVector orientation{}, position{};
  std::vector<RigidVector> positions;
  std::vector<RigidCovariance> covariances;
  if (!ReadRigidBodyInformation(body, orientation, position, positions, covariances)) return false;
  const VPose offset = PoseFromAngleAxis(orientation, position);
  std::vector<VSubject::VTarget> points;
  for (std::size_t i = 0; i < positions.size(); ++i) {
    VSubject::VTarget point;
    point.m_Type = VTargetTypeBase::ELocalPointToWorldPointGaussian;
    point.m_Weight = body.m_Weight;
    point.m_MarkerIndices = {body.m_MarkerIndices[i]};
    point.m_SegmentIndices = body.m_SegmentIndices;
    const Eigen::Vector3d local =
        offset.m_Rotation * Eigen::Vector3d(positions[i][0], positions[i][1], positions[i][2]) +
        offset.m_Translation;
    point.m_State = {local.x(), local.y(), local.z()};
    const Eigen::Matrix<double, 3, 3, Eigen::RowMajor> c(covariances[i].data());
    const Eigen::Matrix<double, 3, 3, Eigen::RowMajor> rotated =
        offset.m_Rotation * c * offset.m_Rotation.transpose();
    point.m_Covariance.assign(rotated.data(), rotated.data() + 9);
    if (i < body.m_ViewNormals.size()) {
      const auto& n = body.m_ViewNormals[i];
      const Eigen::Vector3d normal = offset.m_Rotation * Eigen::Vector3d(n[0], n[1], n[2]);
      point.m_ViewNormals = {{normal.x(), normal.y(), normal.z()}};
    }
    points.push_back(std::move(point));
  }
  targets = std::move(points);
  return true;
}

bool IsRigidBody(const VSubject& subject) {
  return IsRigidBodyImpl(subject);
}
bool IsRigidBody(const VSubjectParametrised& subject) {
  return IsRigidBodyImpl(subject);
}

bool AddRigidBody(VSubject& io_rSubject, VSubjectApplicationData& io_rAppData, const VSubject& body,
                  const VSubjectApplicationData& bodyAppData, const std::string& parentName) {
  return AddRigidBodyImpl(io_rSubject, io_rAppData, body, bodyAppData, parentName);
}
bool AddRigidBody(VSubjectParametrised& io_rSubject, VSubjectApplicationData& io_rAppData,
                  const VSubjectParametrised& body, const VSubjectApplicationData& bodyAppData,
                  const std::string& parentName) {
  return AddRigidBodyImpl(io_rSubject, io_rAppData, body, bodyAppData, parentName);
}

bool RemoveRigidBody(VSubject& io_rSubject, std::size_t targetIndex,
                     VSubjectApplicationData* pAppData) {
  return RemoveRigidBodyImpl(io_rSubject, targetIndex, pAppData);
}
bool RemoveRigidBody(VSubjectParametrised& io_rSubject, std::size_t targetIndex,
                     VSubjectApplicationData* pAppData) {
  return RemoveRigidBodyImpl(io_rSubject, targetIndex, pAppData);
}

} // namespace CoreOstraTypesUtils
