// Write and Read of the calibrated model classes (the text form of CalibratedText.h).

#include "OstraAlgo/KinematicAlgo/CalibratedText.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

#include <algorithm>
#include <istream>
#include <iterator>
#include <ostream>

namespace KinematicAlgo {

namespace {
// A joint has at most six parameters; static parameters are held to the same bound.
constexpr std::uint32_t MaxJointParams = 6;

void WriteVector(std::ostream& o, std::string_view label, const Eigen::VectorXd& v) {
  Text::Numbers(o, label, v.data(), size_t(v.size()));
  o << '\n';
}
// Row by row.
void WriteMatrix(std::ostream& o, std::string_view label, const Eigen::MatrixXd& m) {
  const Eigen::Matrix<double, Eigen::Dynamic, Eigen::Dynamic, Eigen::RowMajor> rows = m;
  Text::Numbers(o, label, rows.data(), size_t(rows.size()));
  o << '\n';
}
bool ReadVector(VTextReader& r, std::string_view label, Eigen::Index n, Eigen::VectorXd& v) {
  v.resize(n);
  return r.Label(label) && r.Numbers(v.data(), size_t(n));
}
bool ReadMatrix(VTextReader& r, std::string_view label, Eigen::Index rows, Eigen::Index cols,
                Eigen::MatrixXd& m) {
  Eigen::Matrix<double, Eigen::Dynamic, Eigen::Dynamic, Eigen::RowMajor> values(rows, cols);
  if (!r.Label(label) || !r.Numbers(values.data(), size_t(values.size()))) return false;
  m = values;
  return true;
}
} // namespace

// --- Joint --------------------------------------------------------------------------------

void VJointCalibrated::Write(std::ostream& o) const {
  Text::String(o, "Segment: ", m_Name);
  o << " Type: " << m_Type << '\n';
  o << "NumDynamicParams: " << m_NumDynamic << " NumStaticParams: " << m_NumStatic << '\n';
  Text::Numbers(o, "Rotation: ", m_Rotation.data(), 3);
  o << '\n';
  if (m_NumDynamic) WriteVector(o, "MeanDynamic: ", m_MeanDynamic);
  if (m_NumStatic) WriteVector(o, "MeanStatic: ", m_MeanStatic);
  if (m_NumDynamic) WriteVector(o, "CentreDynamic: ", m_CentreDynamic);
  if (m_NumDynamic) WriteMatrix(o, "CovDynamic: ", m_CovDynamic);
  if (m_NumStatic) WriteMatrix(o, "CovStatic: ", m_CovStatic);
  if (m_NumDynamic) WriteMatrix(o, "RangeDynamic: ", m_RangeDynamic);
}

bool VJointCalibrated::Read(VTextReader& r) {
  std::string name;
  std::int32_t type = 0;
  std::uint32_t dynamic = 0, statics = 0;
  if (!r.String("Segment: ", name) || !r.Label(" Type: ") || !r.Int(type) ||
      !r.Label("NumDynamicParams: ") || !r.UInt(dynamic) || !r.Label(" NumStaticParams: ") ||
      !r.Count(statics, MaxJointParams, "NumStaticParams"))
    return false;
  SetType(type);
  if (dynamic != m_NumDynamic)
    return r.Fail("joint type " + std::to_string(type) + " has " + std::to_string(m_NumDynamic) +
                  " parameters, not " + std::to_string(dynamic));
  m_Name = name;
  m_NumStatic = statics;
  const Eigen::Index n = dynamic, s = statics;
  if (!r.Label("Rotation: ") || !r.Numbers(m_Rotation.data(), 3)) return false;
  if (n && !ReadVector(r, "MeanDynamic: ", n, m_MeanDynamic)) return false;
  if (s && !ReadVector(r, "MeanStatic: ", s, m_MeanStatic)) return false;
  if (n && !ReadVector(r, "CentreDynamic: ", n, m_CentreDynamic)) return false;
  if (n && !ReadMatrix(r, "CovDynamic: ", n, n, m_CovDynamic)) return false;
  if (s && !ReadMatrix(r, "CovStatic: ", s, s, m_CovStatic)) return false;
  if (n && !ReadMatrix(r, "RangeDynamic: ", n, n, m_RangeDynamic)) return false;
  return true;
}

// --- Segment ------------------------------------------------------------------------------

void VSegmentCalibrated::Write(std::ostream& o) const {
  Text::String(o, "Segment: ", m_Name);
  o << " ID: " << m_Identifier << '\n';
  Text::Pose(o, "PoseInParent: ", m_PoseInParent);
  o << '\n';
  Text::Pose(o, "PoseInThis: ", m_PoseInThis);
  o << '\n';
  Text::Numbers(o, "boundingBox: ", m_Box.data(), 6);
  o << '\n';
  if (m_pJoint)
    m_pJoint->Write(o);
  else
    VJointCalibrated().Write(o); // a segment always reads back with a joint
}

bool VSegmentCalibrated::Read(VTextReader& r) {
  auto joint = std::make_shared<VJointCalibrated>();
  if (!r.String("Segment: ", m_Name) || !r.Label(" ID: ") || !r.Int(m_Identifier) ||
      !r.Pose("PoseInParent: ", m_PoseInParent) || !r.Pose("PoseInThis: ", m_PoseInThis) ||
      !r.Label("boundingBox: ") || !r.Numbers(m_Box.data(), 6) || !joint->Read(r))
    return false;
  m_pJoint = joint;
  return true;
}

// --- Targets ------------------------------------------------------------------------------

void VTargetPosition::Write(std::ostream& o) const {
  Text::String(o, "Target: ", m_Name);
  o << " ID: " << m_Identifier << '\n' << "ParentID: " << m_Parent;
  Text::Numbers(o, " PosInParent: ", m_Position.data(), 3);
  o << '\n';
}

bool VTargetPosition::Read(VTextReader& r) {
  return r.String("Target: ", m_Name) && r.Label(" ID: ") && r.Int(m_Identifier) &&
         r.Label("ParentID: ") && r.UInt(m_Parent) && r.Label(" PosInParent: ") &&
         r.Numbers(m_Position.data(), 3);
}

void VTargetPositionWithCovariance::Write(std::ostream& o) const {
  VTargetPosition::Write(o);
  WriteMatrix(o, "Cov: ", m_Covariance);
}

bool VTargetPositionWithCovariance::Read(VTextReader& r) {
  Eigen::MatrixXd c;
  if (!VTargetPosition::Read(r) || !ReadMatrix(r, "Cov: ", 3, 3, c)) return false;
  m_Covariance = c;
  return true;
}

void VTargetPointDirection::Write(std::ostream& o) const {
  VTargetPosition::Write(o);
  Text::Numbers(o, DirectionLabel(), m_Direction.data(), 3);
  o << '\n'
    << "ResidualCov: " << m_ResidualCovariance.rows() << ' ' << m_ResidualCovariance.cols() << '\n';
  if (m_ResidualCovariance.size()) WriteMatrix(o, "Values: ", m_ResidualCovariance);
}

bool VTargetPointDirection::Read(VTextReader& r) {
  std::uint32_t rows = 0, cols = 0;
  if (!VTargetPosition::Read(r) || !r.Label(DirectionLabel()) ||
      !r.Numbers(m_Direction.data(), 3) || !r.Label("ResidualCov: ") ||
      !r.Count(rows, 3, "ResidualCov rows") || !r.Count(cols, 3, "ResidualCov columns"))
    return false;
  m_ResidualCovariance.resize(rows, cols);
  return rows == 0 || cols == 0 || ReadMatrix(r, "Values: ", rows, cols, m_ResidualCovariance);
}

void VTargetOrientation::Write(std::ostream& o) const {
  VTargetPosition::Write(o);
  WriteMatrix(o, " OrientInParent: ", m_Orientation);
}

bool VTargetOrientation::Read(VTextReader& r) {
  Eigen::MatrixXd m;
  if (!VTargetPosition::Read(r) || !ReadMatrix(r, " OrientInParent: ", 3, 3, m)) return false;
  m_Orientation = m;
  return true;
}

void VTargetRigidBody::Write(std::ostream& o) const {
  Text::String(o, "TargetGroup: ", Name());
  o << " ID: " << Identifier() << '\n' << "ParentID: " << ParentIdentifier();
  Text::Pose(o, " PosInParent: ", m_Body);
  o << '\n' << "NumMarkers: " << m_Members.size() << '\n';
  for (const auto& member : m_Members)
    member->Write(o);
}

bool VTargetRigidBody::Read(VTextReader& r) {
  std::string name;
  std::int32_t id = -1;
  std::uint32_t parent = 0, count = 0;
  VPose body;
  if (!r.String("TargetGroup: ", name) || !r.Label(" ID: ") || !r.Int(id) ||
      !r.Label("ParentID: ") || !r.UInt(parent) || !r.Pose(" PosInParent: ", body) ||
      !r.Label("NumMarkers: ") ||
      !r.Count(count, std::uint32_t(std::min<size_t>(r.Remaining(), UINT32_MAX)), "NumMarkers"))
    return false;
  SetName(name);
  SetIdentifier(id);
  SetParentIdentifier(parent);
  SetBodyPoseInParent(body);
  m_Members.clear();
  for (std::uint32_t i = 0; i < count; ++i) {
    auto member = std::make_shared<VTargetPosition>();
    if (!member->Read(r)) return false;
    m_Members.push_back(member);
  }
  return true;
}

void VTargetPlane::Write(std::ostream& o) const {
  VTargetPosition::Write(o);
  const double plane[] = {m_Normal[0], m_Normal[1], m_Normal[2], m_Offset};
  Text::Numbers(o, "WorldPlane: ", plane, 4);
  o << '\n';
}

bool VTargetPlane::Read(VTextReader& r) {
  double plane[4];
  if (!VTargetPosition::Read(r) || !r.Label("WorldPlane: ") || !r.Numbers(plane, 4)) return false;
  m_Normal = Eigen::Vector3d(plane[0], plane[1], plane[2]);
  m_Offset = plane[3];
  return true;
}

void VTargetBetweenSegments::Write(std::ostream& o) const {
  Text::String(o, "Target: ", m_Name);
  o << " ID: " << m_Identifier << '\n'
    << "ParentID1: " << m_Parents[0] << " ParentID2: " << m_Parents[1] << '\n';
  Text::Numbers(o, " PosInParent1: ", m_Positions[0].data(), 3);
  Text::Numbers(o, " PosInParent2: ", m_Positions[1].data(), 3);
  o << '\n';
}

bool VTargetBetweenSegments::Read(VTextReader& r) {
  return r.String("Target: ", m_Name) && r.Label(" ID: ") && r.Int(m_Identifier) &&
         r.Label("ParentID1: ") && r.UInt(m_Parents[0]) && r.Label(" ParentID2: ") &&
         r.UInt(m_Parents[1]) && r.Label(" PosInParent1: ") &&
         r.Numbers(m_Positions[0].data(), 3) && r.Label(" PosInParent2: ") &&
         r.Numbers(m_Positions[1].data(), 3);
}

// --- Subject ------------------------------------------------------------------------------

namespace {
void WriteTyped(std::ostream& o, const ITargetCalibrated& target) {
  Text::String(o, "TypeName: ", target.Key());
  o << '\n';
  target.Write(o);
}

std::shared_ptr<ITargetCalibrated> ReadTyped(VTextReader& r) {
  std::string key;
  if (!r.String("TypeName: ", key)) return nullptr;
  auto target = VTargetFactory::Factory().Create(key);
  if (!target) {
    r.Fail("unknown target type '" + key.substr(0, 60) + "'");
    return nullptr;
  }
  return target->Read(r) ? target : nullptr;
}
} // namespace

void VSubjectCalibrated::Write(std::ostream& o) const {
  Text::String(o, "Subject: ", m_Name);
  o << " ID: " << m_Identifier << '\n' << "NumSegments: " << m_Tree.Size() << '\n';
  for (std::int32_t i = 0; i < m_Tree.Size(); ++i) {
    m_Tree[i].m_Value->Write(o);
    if (m_Tree[i].m_Parent >= 0) o << "ParentSegment: " << m_Tree[i].m_Parent << '\n';
  }
  o << "NumMarkers: " << m_Markers.size() << '\n';
  for (const auto& marker : m_Markers)
    WriteTyped(o, *marker);
  o << "NumTargets: " << m_Targets.size() << '\n';
  for (const auto& target : m_Targets) {
    const auto same = std::find(m_Markers.begin(), m_Markers.end(), target);
    if (same != m_Markers.end()) {
      o << "IsMarker: 1 Reference: " << (same - m_Markers.begin()) << '\n';
    } else {
      o << "IsMarker: 0\n";
      WriteTyped(o, *target);
    }
  }
  o << "NumSticks: " << m_Sticks.size() << '\n';
  for (const VStick& stick : m_Sticks)
    o << stick.m_Marker1 << ' ' << stick.m_Marker2 << ' ' << int(stick.m_Colour[0]) << ' '
      << int(stick.m_Colour[1]) << ' ' << int(stick.m_Colour[2]) << '\n';
}

bool VSubjectCalibrated::Read(std::istream& io_rStream, std::string* o_pError) {
  const std::string text{std::istreambuf_iterator<char>(io_rStream),
                         std::istreambuf_iterator<char>()};
  if (io_rStream.bad()) {
    if (o_pError) *o_pError = "the stream failed while reading";
    return false;
  }
  return ReadText(text, o_pError);
}

bool VSubjectCalibrated::ReadText(std::string_view text, std::string* o_pError) {
  VTextReader r(text);
  if (ReadFrom(r) && (r.AtEnd() || r.Fail("unexpected text after the subject"))) return true;
  if (o_pError) *o_pError = r.Error();
  return false;
}

bool VSubjectCalibrated::ReadFrom(VTextReader& r) {
  // Everything is read into a new subject first; this one changes only on success.
  VSubjectCalibrated read;
  read.ClearSegments();
  const auto fail = [] { return false; };
  // Counts are bounded by the text left: every item takes a few bytes at least.
  const auto bound = [&] { return std::uint32_t(std::min<size_t>(r.Remaining(), UINT32_MAX)); };
  std::uint32_t count = 0;
  if (!r.String("Subject: ", read.m_Name) || !r.Label(" ID: ") || !r.Int(read.m_Identifier) ||
      !r.Label("NumSegments: ") || !r.Count(count, bound(), "NumSegments"))
    return fail();
  for (std::uint32_t i = 0; i < count; ++i) {
    auto segment = std::make_shared<VSegmentCalibrated>();
    if (!segment->Read(r)) return fail();
    std::int32_t parent = SegmentTree::NoParent;
    if (i && (!r.Label("ParentSegment: ") || !r.Int(parent))) return fail();
    if (i && (parent < 0 || std::uint32_t(parent) >= i))
      return r.Fail("segment " + std::to_string(i) + " has parent " + std::to_string(parent) +
                    ", which does not come before it"),
             fail();
    // Positions are those of a pre-order walk; a parent list that isn't one would move nodes.
    if (read.m_Tree.Add(parent, segment) != std::int32_t(i))
      return r.Fail("segment " + std::to_string(i) + " breaks the tree's pre-order"), fail();
  }
  if (!r.Label("NumMarkers: ") || !r.Count(count, bound(), "NumMarkers")) return fail();
  for (std::uint32_t m = 0; m < count; ++m) {
    auto marker = ReadTyped(r);
    if (!marker) return fail();
    read.m_Markers.push_back(marker);
  }
  if (!r.Label("NumTargets: ") || !r.Count(count, bound(), "NumTargets")) return fail();
  for (std::uint32_t t = 0; t < count; ++t) {
    std::uint32_t isMarker = 0, reference = 0;
    if (!r.Label("IsMarker: ") || !r.Count(isMarker, 1, "IsMarker")) return fail();
    if (isMarker) {
      if (!r.Label(" Reference: ") || !r.UInt(reference)) return fail();
      if (reference >= read.m_Markers.size())
        return r.Fail("target " + std::to_string(t) + " refers to marker " +
                      std::to_string(reference) + " of " + std::to_string(read.m_Markers.size())),
               fail();
      read.m_Targets.push_back(read.m_Markers[reference]);
      continue;
    }
    auto target = ReadTyped(r);
    if (!target) return fail();
    read.m_Targets.push_back(target);
  }
  if (!r.Label("NumSticks: ") || !r.Count(count, bound(), "NumSticks")) return fail();
  for (std::uint32_t s = 0; s < count; ++s) {
    VStick stick;
    std::uint32_t colour[3];
    if (!r.UInt(stick.m_Marker1) || !r.UInt(stick.m_Marker2) ||
        !r.Count(colour[0], 255, "colour") || !r.Count(colour[1], 255, "colour") ||
        !r.Count(colour[2], 255, "colour"))
      return fail();
    if (stick.m_Marker1 >= read.m_Markers.size() || stick.m_Marker2 >= read.m_Markers.size())
      return r.Fail("stick " + std::to_string(s) + " joins a marker that does not exist"), fail();
    for (int c = 0; c < 3; ++c)
      stick.m_Colour[size_t(c)] = std::uint8_t(colour[c]);
    read.m_Sticks.push_back(stick);
  }
  m_Tree = std::move(read.m_Tree);
  m_Targets = std::move(read.m_Targets);
  m_Markers = std::move(read.m_Markers);
  m_Sticks = std::move(read.m_Sticks);
  m_Name = std::move(read.m_Name);
  m_Identifier = read.m_Identifier;
  return true;
}

} // namespace KinematicAlgo
