#include "OstraAlgo/ComputeSubjectFK/VComputeSegment.h"

#include "OstraAlgo/KinematicAlgo/VJointFunctionalFree.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalRotator.h"

namespace ComputeSubject {

using namespace KinematicAlgo;

namespace {
JointGaussian Prior(const Eigen::VectorXd& mean, const Eigen::MatrixXd& covariance,
                    std::uint32_t n) {
  const Eigen::VectorXd m = mean.size() == n ? mean : Eigen::VectorXd::Zero(n);
  const Eigen::MatrixXd c =
      (covariance.rows() == n && covariance.cols() == n) ? covariance : Eigen::MatrixXd::Zero(n, n);
  return JointGaussian(m, c, 1e-8);
}
} // namespace

VComputeSegment::VComputeSegment(const ISegmentCalibrated& segment, bool useRotator,
                                 bool freeSegment)
    : m_pSegment(&segment), m_UsesRotator(useRotator), m_FreeSegment(freeSegment) {
  ReadModel();
}

void VComputeSegment::ReadModel() {
  const auto joint = m_pSegment->Joint();
  m_JointType = joint ? joint->Type() : -1;
  std::unique_ptr<VJointFunctional> functional =
      joint ? MakeJointFunctional(joint->Type()) : nullptr;
  m_A = joint ? Exp(joint->Rotation()) : Matrix3r::Identity();
  m_P = m_pSegment->PoseInParent();
  m_Q = m_pSegment->PoseInThis();
  if (m_UsesRotator && functional) {
    functional = std::make_unique<VJointFunctionalRotator>(std::move(functional), m_A);
  } else {
    m_P.m_Rotation = m_P.m_Rotation * m_A;
    m_Q.m_Rotation = m_Q.m_Rotation * m_A;
  }
  m_QInverse = m_Q.Inverse();
  m_ModelP = m_P;
  VJointFunctionalFree().ComputeParams(View(m_FreeParams), View(), m_P, 1e10);
  if (m_FreeSegment) {
    // P becomes the free joint's transform; the model's joint takes no part.
    functional = std::make_unique<VJointFunctionalFree>();
    m_P = VPose();
  }
  m_pJoint = std::move(functional);
  m_NumParams = m_pJoint ? m_pJoint->NumDynamicParams() : 0;
  if (joint && !m_FreeSegment) {
    m_DynamicPrior = Prior(joint->MeanDynamic(), joint->CovDynamic(), m_NumParams);
    m_RangePrior = Prior(joint->CentreDynamic(), joint->RangeDynamic(), m_NumParams);
  } else {
    m_DynamicPrior = m_RangePrior = Prior({}, {}, 0);
  }
  m_CurrentPrior = m_DynamicPrior;
  m_Own = JointJacobian(m_NumParams);
  m_Own.m_FirstParam = m_FirstParam;
}

bool VComputeSegment::Reload() {
  const auto joint = m_pSegment->Joint();
  if ((joint ? joint->Type() : -1) != m_JointType) return false;
  ReadModel();
  return true;
}

VComputeSegment::VComputeSegment(const VComputeSegment& other)
    : m_pJoint(other.m_pJoint ? std::shared_ptr<VJointFunctional>(other.m_pJoint->Clone())
                              : nullptr),
      m_pSegment(other.m_pSegment), m_Index(other.m_Index), m_Parent(other.m_Parent),
      m_NumParams(other.m_NumParams), m_FirstParam(other.m_FirstParam),
      m_JointType(other.m_JointType), m_UsesRotator(other.m_UsesRotator), m_A(other.m_A),
      m_P(other.m_P), m_Q(other.m_Q), m_QInverse(other.m_QInverse), m_Joint(other.m_Joint),
      m_Local(other.m_Local), m_World(other.m_World), m_JointFrame(other.m_JointFrame),
      m_DynamicPrior(other.m_DynamicPrior), m_CurrentPrior(other.m_CurrentPrior),
      m_RangePrior(other.m_RangePrior), m_Own(other.m_Own), m_Blocks(other.m_Blocks),
      m_NumBlocks(other.m_NumBlocks), m_FreeSegment(other.m_FreeSegment), m_ModelP(other.m_ModelP),
      m_FreeParams(other.m_FreeParams), m_FreeJacobian(other.m_FreeJacobian) {}

void VComputeSegment::Place(std::int32_t index, std::int32_t parent) {
  m_Index = index;
  m_Parent = parent;
  m_FreeJacobian.m_FirstParam = 6 * std::uint32_t(index);
}

void VComputeSegment::SetUp(std::uint32_t firstParam, std::uint32_t numBlocks) {
  m_FirstParam = firstParam;
  m_Own.m_FirstParam = firstParam;
  m_Blocks.assign(numBlocks, JointJacobian());
}

void VComputeSegment::UpdatePose(const double* params, const VComputeSegment* parent) {
  if (m_pJoint) m_pJoint->ComputePose(ConstView(params, m_NumParams), ConstView(), m_Joint);
  // L = P J Q⁻¹, W = parent W L.
  const Matrix3r PJ = m_P.m_Rotation * m_Joint.m_Rotation;
  m_Local.m_Rotation.noalias() = PJ * m_QInverse.m_Rotation;
  m_Local.m_Translation.noalias() =
      PJ * m_QInverse.m_Translation + m_P.m_Rotation * m_Joint.m_Translation + m_P.m_Translation;
  if (parent) {
    const VPose& W = parent->m_World;
    m_World.m_Rotation.noalias() = W.m_Rotation * m_Local.m_Rotation;
    m_World.m_Translation.noalias() = W.m_Rotation * m_Local.m_Translation + W.m_Translation;
  } else {
    m_World = m_Local;
  }
}

void VComputeSegment::UpdateJacobian(const double* params, const VComputeSegment* parent,
                                     std::uint32_t type) {
  const bool chain = type == EChain || type == EChainOnly;
  const bool joint = type == EJoint || type == EJointOnly;
  m_NumBlocks = 0;
  if (type == EFree || type == EFreeOnly) {
    UpdateFreeJacobian(params, parent);
    return;
  }
  if (!chain && !joint) return;
  if (m_pJoint) m_pJoint->ComputeJacobian(ConstView(params, m_NumParams), ConstView(), m_Own);
  // The own block: P ∂J Q⁻¹, then into world axes by the parent's rotation.
  JointJacobian& own = m_Blocks[0];
  own.m_NumParams = m_NumParams;
  own.m_FirstParam = m_FirstParam;
  for (std::uint32_t i = 0; i < m_NumParams; ++i) {
    const Matrix3r dR = m_P.m_Rotation * m_Own.m_dR[i];
    Eigen::Vector3d dT = dR * m_QInverse.m_Translation + m_P.m_Rotation * m_Own.m_dT[i];
    Matrix3r dRLocal = dR * m_QInverse.m_Rotation;
    if (parent) {
      own.m_dR[i].noalias() = parent->m_World.m_Rotation * dRLocal;
      own.m_dT[i].noalias() = parent->m_World.m_Rotation * dT;
    } else {
      own.m_dR[i] = dRLocal;
      own.m_dT[i] = dT;
    }
  }
  m_NumBlocks = 1;
  if (!chain || !parent) return;
  // Every ancestor's block carried through this segment's local pose.
  for (std::uint32_t b = 0; b < parent->m_NumBlocks; ++b) {
    const JointJacobian& from = parent->m_Blocks[b];
    JointJacobian& to = m_Blocks[b + 1];
    to.m_NumParams = from.m_NumParams;
    to.m_FirstParam = from.m_FirstParam;
    for (std::uint32_t i = 0; i < from.m_NumParams; ++i) {
      to.m_dR[i].noalias() = from.m_dR[i] * m_Local.m_Rotation;
      to.m_dT[i].noalias() = from.m_dR[i] * m_Local.m_Translation;
      to.m_dT[i] += from.m_dT[i];
    }
  }
  m_NumBlocks = parent->m_NumBlocks + 1;
}

void VComputeSegment::UpdateFreeJacobian(const double* params, const VComputeSegment* parent) {
  // W = parent W ∘ F ∘ K with K = J Q⁻¹ (in free mode F is the joint and K = Q⁻¹).
  VPose K = m_QInverse;
  if (!m_FreeSegment) {
    VJointFunctionalFree().ComputeJacobian(ConstView(m_FreeParams), ConstView(), m_FreeJacobian);
    K = m_Joint * m_QInverse;
  } else {
    m_pJoint->ComputeJacobian(ConstView(params, 6), ConstView(), m_FreeJacobian);
  }
  JointJacobian& block = m_Blocks[0];
  block.m_NumParams = 6;
  block.m_FirstParam = 6 * std::uint32_t(m_Index);
  for (std::uint32_t k = 0; k < 6; ++k) {
    const Matrix3r& dR = m_FreeJacobian.m_dR[k];
    const Matrix3r dRLocal = dR * K.m_Rotation;
    const Eigen::Vector3d dTLocal = dR * K.m_Translation + m_FreeJacobian.m_dT[k];
    if (parent) {
      block.m_dR[k].noalias() = parent->m_World.m_Rotation * dRLocal;
      block.m_dT[k].noalias() = parent->m_World.m_Rotation * dTLocal;
    } else {
      block.m_dR[k] = dRLocal;
      block.m_dT[k] = dTLocal;
    }
  }
  m_NumBlocks = 1;
}

} // namespace ComputeSubject
