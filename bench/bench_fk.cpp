// Forward kinematics and chain Jacobians of the demo walker (20 segments) and of a random
// 60-segment subject, against a minimal hand-written Eigen loop over the same tree: the ratio is
// what the compute subject's layers (joint functionals behind an interface, views, caching)
// cost on top of the arithmetic itself.

#include "RatioReporter.h"

#include "../tests/OstraAlgo/ComputeSubjectFK/NumericRecord.h"

#include "AnvilCore/demo/DemoWalk.h"
#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"
#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"

#include <benchmark/benchmark.h>

#include <Eigen/Geometry>

#include <random>

namespace {

using namespace KinematicAlgo;
using ComputeSubject::VComputeSubject;

std::shared_ptr<VSubjectCalibrated> DemoModel() {
  std::vector<std::string> errors, notes;
  return SubjectCalibratedFromRecord(KinematicTest::Solved(AnvilCore::demoWalkRecords().subject),
                                     errors, notes);
}

// A bushy tree: each segment hangs from one of the last few, with joints of every kind.
std::shared_ptr<VSubjectCalibrated> LargeModel() {
  std::mt19937 gen(60);
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  auto model = std::make_shared<VSubjectCalibrated>();
  model->ClearSegments();
  const std::int32_t kinds[] = {1, 3, 2, 1, 4, 3, 5};
  for (int i = 0; i < 60; ++i) {
    auto segment = std::make_shared<VSegmentCalibrated>();
    segment->SetIdentifier(i);
    VPose P;
    P.m_Rotation = Exp(Eigen::Vector3d(u(gen), u(gen), u(gen)));
    P.m_Translation = Eigen::Vector3d(u(gen), u(gen), u(gen)) * 200.0;
    segment->SetPoseInParent(P);
    auto joint = std::make_shared<VJointCalibrated>();
    joint->SetType(i == 0 ? 0 : kinds[i % 7]);
    joint->SetRotation(Eigen::Vector3d(u(gen), u(gen), u(gen)));
    segment->SetJoint(joint);
    const std::int32_t size = model->Segments().Size();
    const std::int32_t parent = i == 0 ? -1 : std::max(0, size - 1 - std::int32_t(gen() % 4));
    model->Segments().Add(parent, segment);
  }
  for (int i = 0; i < 60; ++i) {
    auto target = std::make_shared<VTargetPosition>(std::uint32_t(i));
    target->SetPositionInParent(Eigen::Vector3d(10.0, 20.0, 30.0));
    model->AddTarget(target, true);
  }
  return model;
}

// Two states to alternate between, so that no evaluation is answered from the cache.
std::array<std::vector<double>, 2> States(const VComputeSubject& cs) {
  std::mt19937 gen(1);
  std::uniform_real_distribution<double> u(-0.5, 0.5);
  std::array<std::vector<double>, 2> states;
  for (auto& state : states) {
    state.resize(cs.NumParams());
    for (double& x : state)
      x = u(gen);
  }
  return states;
}

// The floor: the same tree as plain arrays, with the joint's fixed rotation folded into P and
// Q as the compute subject does, and each joint transform written out by kind.
struct BareTree {
  struct Node {
    int parent, kind, first;
    Eigen::Matrix3d PR;
    Eigen::Vector3d PT;
    Eigen::Matrix3d QiR;
    Eigen::Vector3d QiT;
  };
  std::vector<Node> nodes;
  std::vector<Eigen::Matrix3d> R;
  std::vector<Eigen::Vector3d> T;
  std::vector<Eigen::Vector3d> targets;
  std::vector<int> targetParent;
  std::vector<Eigen::Vector3d> world;

  explicit BareTree(const VComputeSubject& cs) {
    for (std::uint32_t s = 0; s < cs.NumSegments(); ++s) {
      const auto& segment = cs.Segment(s);
      const VPose Qi = segment.PoseInThis().Inverse();
      nodes.push_back({segment.ParentIndex(), segment.Segment().Joint()->Type(),
                       int(segment.FirstParam()), segment.PoseInParent().m_Rotation,
                       segment.PoseInParent().m_Translation, Qi.m_Rotation, Qi.m_Translation});
    }
    R.resize(nodes.size());
    T.resize(nodes.size());
    for (std::uint32_t t = 0; t < cs.NumTargets(); ++t) {
      targets.push_back(cs.PositionTarget(t)->PositionInParent());
      targetParent.push_back(cs.PositionTarget(t)->ParentIndex());
    }
    world.resize(targets.size());
  }

  static Eigen::Matrix3d RotationVector(const double* r) {
    const Eigen::Vector3d v(r[0], r[1], r[2]);
    const double angle = v.norm();
    if (angle < 1e-14) return Eigen::Matrix3d::Identity();
    return Eigen::AngleAxisd(angle, v / angle).toRotationMatrix();
  }

  void Evaluate(const double* x) {
    for (size_t i = 0; i < nodes.size(); ++i) {
      const Node& n = nodes[i];
      const double* p = x + n.first;
      Eigen::Matrix3d JR = Eigen::Matrix3d::Identity();
      Eigen::Vector3d JT = Eigen::Vector3d::Zero();
      switch (n.kind) {
      case 0:
        JR = RotationVector(p);
        JT = Eigen::Vector3d(p[3], p[4], p[5]);
        break;
      case 1:
        JR = RotationVector(p);
        break;
      case 2:
        JR = (Eigen::AngleAxisd(p[0], Eigen::Vector3d::UnitZ()) *
              Eigen::AngleAxisd(p[1], Eigen::Vector3d::UnitY()))
                 .toRotationMatrix();
        break;
      case 3:
        JR = Eigen::AngleAxisd(p[0], Eigen::Vector3d::UnitZ()).toRotationMatrix();
        break;
      case 4:
        JT.z() = p[0];
        break;
      default:
        break;
      }
      const Eigen::Matrix3d PJ = n.PR * JR;
      const Eigen::Matrix3d LR = PJ * n.QiR;
      const Eigen::Vector3d LT = PJ * n.QiT + n.PR * JT + n.PT;
      if (n.parent < 0) {
        R[i] = LR;
        T[i] = LT;
      } else {
        R[i] = R[size_t(n.parent)] * LR;
        T[i] = R[size_t(n.parent)] * LT + T[size_t(n.parent)];
      }
    }
    for (size_t t = 0; t < targets.size(); ++t)
      world[t] = R[size_t(targetParent[t])] * targets[t] + T[size_t(targetParent[t])];
  }
};

std::shared_ptr<VSubjectCalibrated> Model(int which) {
  return which == 0 ? DemoModel() : LargeModel();
}

void BM_ForwardKinematics(benchmark::State& state) {
  VComputeSubject cs(Model(int(state.range(0))));
  const auto states = States(cs);
  std::size_t k = 0;
  for (auto _ : state) {
    const auto& x = states[k++ & 1];
    cs.Update({x.data(), x.size()});
    benchmark::DoNotOptimize(cs.PositionTarget(0)->WorldPosition().data());
  }
  state.SetItemsProcessed(state.iterations());
  state.counters["segments"] = cs.NumSegments();
}

void BM_BareEigenLoop(benchmark::State& state) {
  VComputeSubject cs(Model(int(state.range(0))));
  BareTree bare(cs);
  const auto states = States(cs);
  std::size_t k = 0;
  for (auto _ : state) {
    bare.Evaluate(states[k++ & 1].data());
    benchmark::DoNotOptimize(bare.world[0].data());
  }
  state.SetItemsProcessed(state.iterations());
  state.counters["segments"] = double(bare.nodes.size());
}

void BM_ChainJacobian(benchmark::State& state) {
  VComputeSubject cs(Model(int(state.range(0))));
  const auto states = States(cs);
  std::size_t k = 0;
  for (auto _ : state) {
    const auto& x = states[k++ & 1];
    cs.UpdateSegments({x.data(), x.size()}, ComputeSubject::EChain);
    benchmark::DoNotOptimize(cs.Segment(cs.NumSegments() - 1).JacobianBlocks()[0].m_dR[0].data());
  }
  state.SetItemsProcessed(state.iterations());
  state.counters["segments"] = cs.NumSegments();
}

} // namespace

BENCHMARK(BM_ForwardKinematics)->Arg(0)->Arg(1);
BENCHMARK(BM_BareEigenLoop)->Arg(0)->Arg(1);
BENCHMARK(BM_ChainJacobian)->Arg(0)->Arg(1);

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("forward kinematics / bare Eigen loop", "BM_ForwardKinematics/0",
                      "BM_BareEigenLoop/0");
  reporter.printRatio("forward kinematics 60 segments / bare Eigen loop 60 segments",
                      "BM_ForwardKinematics/1", "BM_BareEigenLoop/1");
  reporter.printRatio("chain Jacobian / forward kinematics", "BM_ChainJacobian/0",
                      "BM_ForwardKinematics/0");
  reporter.printRatio("chain Jacobian 60 segments / forward kinematics 60 segments",
                      "BM_ChainJacobian/1", "BM_ForwardKinematics/1");
  benchmark::Shutdown();
  return 0;
}
