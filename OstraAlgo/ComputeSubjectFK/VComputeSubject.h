#pragma once
// The evaluable form of a calibrated subject: one run-time segment per model segment in tree
// pre-order, one run-time target per model target it knows, and one flat state vector: the
// joints' parameters in pre-order, each contiguous, then the parameters of targets that have
// their own. Update evaluates forward kinematics and, if asked, Jacobian blocks for any state.
//
// The model is shared and must not change while a compute subject uses it. One thread at a time
// per compute subject; a copy shares nothing that evaluation writes, so copies may run on other
// threads.

#include "OstraAlgo/ComputeSubjectFK/VComputeMultiParentTargets.h"
#include "OstraAlgo/ComputeSubjectFK/VComputeSegment.h"
#include "OstraAlgo/ComputeSubjectFK/VComputeTarget.h"

#include <map>
#include <memory>
#include <random>
#include <span>
#include <utility>
#include <vector>

namespace ComputeSubject {

class IComputeSubject {
public:
  /// Builds the run-time segment of one model segment; `freeSegments` for the free-segment mode.
  class ISegmentFactory {
  public:
    virtual ~ISegmentFactory() = default;
    virtual VComputeSegment Create(const KinematicAlgo::ISegmentCalibrated& segment,
                                   bool freeSegments) const = 0;
  };
  /// Builds the run-time target of one model target, its segments found through `lookup`; null
  /// drops the target from the subject.
  class ITargetFactory {
  public:
    virtual ~ITargetFactory() = default;
    virtual std::unique_ptr<IComputeTarget> Create(const KinematicAlgo::ITargetCalibrated& target,
                                                   const SegmentLookup& lookup) const = 0;
  };

  /// Evaluates the segments of a tree one at a time. The tree is a list of segments in which
  /// each segment's parent (found by its Index()) comes before it: the subject's segments in
  /// pre-order, or a target chain's copies. A cursor is a position in that list.
  class ISegmentComputer {
  public:
    virtual ~ISegmentComputer() = default;
    /// A computer of the same kind and settings, attached to no tree.
    virtual std::unique_ptr<ISegmentComputer> Clone() const = 0;
    /// The segment's share of the joint state.
    virtual std::uint32_t NumParams(const VComputeSegment& segment) const = 0;
    /// Attaches the computer to `tree`, which must outlive its use and keep its size.
    virtual void SetTree(std::span<VComputeSegment> tree) = 0;
    /// Pose (type below EChainOnly) and Jacobian blocks of `type` of the segment at `cursor`,
    /// from its own parameters; its parent is current.
    virtual void Update(std::uint32_t cursor, ConstView params, std::uint32_t type) = 0;
    /// Gives the segment at `cursor` its first parameter and room for Jacobians up to `type`,
    /// once, before any Update.
    virtual void SetUp(std::uint32_t cursor, std::uint32_t firstParam, std::uint32_t type) = 0;
  };
  /// Brings targets up to date after their segments moved. A type of EChainOnly or above means
  /// the poses did not change, so there is nothing to do for targets that follow poses.
  class ITargetComputer {
  public:
    virtual ~ITargetComputer() = default;
    /// Targets without parameters of their own.
    virtual void UpdateTargets(std::span<IComputeTarget* const> targets,
                               std::uint32_t type) const = 0;
    /// Targets with parameters: `targetState` holds theirs one after another in list order.
    virtual void UpdateParametrisedTargets(std::span<IComputeTarget* const> targets,
                                           ConstView jointState, ConstView targetState,
                                           std::uint32_t type) const = 0;
    /// Writes the targets' current parameters into `o_rState`, one after another.
    virtual void GatherTargetParams(std::span<IComputeTarget* const> targets,
                                    View o_rState) const = 0;
  };

  virtual ~IComputeSubject() = default;
  virtual const KinematicAlgo::ISubjectCalibrated& Subject() const = 0;
  virtual std::uint32_t NumSegments() const = 0;
  virtual const VComputeSegment& Segment(std::uint32_t i) const = 0;
  virtual std::uint32_t NumTargets() const = 0;
  virtual const IComputeTarget& Target(std::uint32_t i) const = 0;
  virtual std::uint32_t NumParams() const = 0;
  virtual std::uint32_t NumJointParams() const = 0;
  virtual std::uint32_t NumTargetParams() const = 0;
  /// Forward kinematics and targets, no Jacobians.
  virtual void Update(ConstView state) = 0;
  /// Segments (and targets) for `state`, with Jacobian blocks of `type`. A state equal to the
  /// previous one skips forward kinematics and only fills the Jacobians asked for.
  virtual void UpdateSegments(ConstView state, std::uint32_t type) = 0;
  virtual void UpdateTargets(ConstView state) = 0;
};

/// Selects the form of VComputeSubject::WriteToModel that writes the targets too.
struct VWithTargets {};
inline constexpr VWithTargets WithTargets{};

class VComputeSubject : public IComputeSubject {
public:
  /// The default segment factory: VComputeSegment with or without the rotator.
  class VSegmentFactory : public ISegmentFactory {
  public:
    explicit VSegmentFactory(bool useRotator = false) : m_UseRotator(useRotator) {}
    VComputeSegment Create(const KinematicAlgo::ISegmentCalibrated& segment,
                           bool freeSegments) const override;
    bool UseRotator() const { return m_UseRotator; }

  private:
    bool m_UseRotator;
  };
  /// The default target factory: every model target class with a run-time form.
  class VTargetFactory : public ITargetFactory {
  public:
    std::unique_ptr<IComputeTarget> Create(const KinematicAlgo::ITargetCalibrated& target,
                                           const SegmentLookup& lookup) const override;
  };

  /// The default segment computer: forward kinematics and the Jacobian blocks of every type,
  /// for joint-driven and free segments alike (a free segment's joint is its free transform).
  class VSegmentComputerImpl : public ISegmentComputer {
  public:
    std::unique_ptr<ISegmentComputer> Clone() const override;
    std::uint32_t NumParams(const VComputeSegment& segment) const override;
    void SetTree(std::span<VComputeSegment> tree) override;
    void Update(std::uint32_t cursor, ConstView params, std::uint32_t type) override;
    void SetUp(std::uint32_t cursor, std::uint32_t firstParam, std::uint32_t type) override;

  private:
    std::span<VComputeSegment> m_Tree;
    /// Each segment's parent as a position in m_Tree, -1 at a root.
    std::vector<std::int32_t> m_Parents;
  };
  /// The default target computer: every target follows its segments; parametrised targets
  /// take their slice of the target state first.
  class VTargetComputer : public ITargetComputer {
  public:
    void UpdateTargets(std::span<IComputeTarget* const> targets, std::uint32_t type) const override;
    void UpdateParametrisedTargets(std::span<IComputeTarget* const> targets, ConstView jointState,
                                   ConstView targetState, std::uint32_t type) const override;
    void GatherTargetParams(std::span<IComputeTarget* const> targets, View o_rState) const override;
  };

  /// `ignored` is kept for callers that pass it and changes nothing. `mode` EFreeSegmentsMode
  /// places every segment by six free parameters (the state is then six per segment in tree
  /// order, see VComputeSegment); any other value uses the joints. `useRotator` as for
  /// VComputeSegment. Targets without a run-time form are dropped; a target
  /// whose segment is missing stays, with its Errors() set.
  explicit VComputeSubject(std::shared_ptr<const KinematicAlgo::ISubjectCalibrated> subject,
                           std::uint8_t ignored = 0, std::uint32_t mode = 1,
                           std::uint32_t useRotator = 0);
  /// As above with the given factories and computers; a null one is replaced by the default (a
  /// null segment factory by VSegmentFactory without the rotator). The segment computer is
  /// attached to this subject's tree, so it must not be given to another subject; copies share
  /// the factories and the target computer and clone the segment computer.
  VComputeSubject(std::shared_ptr<const KinematicAlgo::ISubjectCalibrated> subject,
                  std::uint32_t mode, std::shared_ptr<const ISegmentFactory> segmentFactory,
                  std::shared_ptr<const ITargetFactory> targetFactory,
                  std::shared_ptr<ISegmentComputer> segmentComputer = nullptr,
                  std::shared_ptr<const ITargetComputer> targetComputer = nullptr);
  /// Independent copy: segments and targets are rebuilt, targets follow the copy's segments.
  VComputeSubject(const VComputeSubject& other);
  VComputeSubject& operator=(const VComputeSubject&) = delete;

  const KinematicAlgo::ISubjectCalibrated& Subject() const override { return *m_pSubject; }
  std::uint32_t NumSegments() const override { return std::uint32_t(m_Segments.size()); }
  const VComputeSegment& Segment(std::uint32_t i) const override { return m_Segments[i]; }
  std::uint32_t NumTargets() const override { return std::uint32_t(m_Targets.size()); }
  const IComputeTarget& Target(std::uint32_t i) const override { return *m_Targets[i]; }
  /// The target as a position target, or null.
  const VComputeTargetPosition* PositionTarget(std::uint32_t i) const;
  std::uint32_t NumParams() const override { return m_NumJointParams + m_NumTargetParams; }
  std::uint32_t NumJointParams() const override { return m_NumJointParams; }
  std::uint32_t NumTargetParams() const override { return m_NumTargetParams; }
  std::uint32_t Mode() const { return m_Mode; }
  const ISegmentFactory& SegmentFactory() const { return *m_pSegmentFactory; }
  const ITargetFactory& TargetFactory() const { return *m_pTargetFactory; }
  const ISegmentComputer& SegmentComputer() const { return *m_pSegmentComputer; }
  const ITargetComputer& TargetComputer() const { return *m_pTargetComputer; }
  /// How many times forward kinematics has run over the tree (for callers that check caching).
  std::uint64_t NumPoseEvaluations() const { return m_PoseEvaluations; }

  void Update(ConstView state) override { UpdateSegments(state, ENone); }
  void UpdateSegments(ConstView state, std::uint32_t type) override;
  void UpdateTargets(ConstView state) override;
  /// Writes the parametrised targets' current parameters into the target part of `o_rState`
  /// (NumParams() values).
  void GatherTargetParams(View o_rState) const;

  /// The dense Jacobian of all position targets' world positions (3 rows each, in target
  /// order, zero rows for other targets) with respect to the joint state, from the blocks of
  /// the last EChain update.
  void TargetJacobian(Eigen::Ref<Eigen::MatrixXd> o_rJacobian) const;

  /// State operations, each slice by the segment's parameter count, in tree order. Views must
  /// hold NumJointParams() values at least.
  void PriorMeanState(View o_rState) const;
  void CurrentMeanState(View o_rState) const;
  /// Draws each joint from its working prior; returns the sum of the squared standard normal
  /// variates.
  double SampleState(View o_rState, std::mt19937& gen) const;
  void WhitenState(View o_rZ, ConstView x) const;
  void ColourState(View o_rX, ConstView z) const;
  void NormaliseState(View io_rState) const;
  /// a = Blend(a, b, wa, wb) joint by joint, on each joint's manifold.
  void BlendStates(View io_rA, ConstView b, double wa, double wb) const;
  /// Moves each joint's angles by whole turns to lie nearest `reference`, by parameter count: for
  /// three or more parameters the rotation vector's length, for one or two each value (a
  /// slider's distance included, as it has no way to tell).
  void UnwrapState(View io_rState, ConstView reference) const;
  /// The working prior of every joint becomes its dynamic prior centred on `state`.
  void RecentrePrior(ConstView state);
  /// The working prior becomes the dynamic prior with its mean Blend(state, mean, 1 - weight,
  /// weight); for a weight outside [0, 1] the mean stays the dynamic prior's.
  void RecentrePrior(ConstView state, double weight);
  /// Six free parameters (rotation vector, translation) of each segment's P as the model gives
  /// it, in tree order: the state of the free-segment mode that puts every joint at rest.
  void FreeState(View o_rState) const;
  /// Stores each segment's P (in the free-segment mode the one of the last update) and Q into
  /// the segment of `io_rModel` at the same tree position, with the joint's fixed rotation taken
  /// out again. False, with `io_rModel` untouched, when its tree has another size.
  bool WriteToModel(KinematicAlgo::ISubjectCalibrated& io_rModel) const;
  /// As above, and writes each target's geometry back into the model's target at the same
  /// position in its list (see IComputeTarget::WriteToModel). The model must have the tree's
  /// size and a target list of the same keys (rigid bodies with as many members) as the one
  /// this subject was built from, for example a copy of it; if not, nothing is written, the
  /// reason goes to `o_pWhy` and the result is false.
  bool WriteToModel(KinematicAlgo::ISubjectCalibrated& io_rModel, VWithTargets,
                    std::string* o_pWhy = nullptr) const;

  /// Reads every segment's fixed poses, joint rotation and priors, and every target's geometry,
  /// from the model again, after the caller changed them. The tree's shape, its segment objects,
  /// the joint types and the model's target list must be those the subject was built from; if
  /// not, nothing changes, the reason goes to `o_pWhy` and the result is false (build a new
  /// compute subject then). Working priors return to the dynamic priors; the next Update runs in
  /// full.
  bool ReloadFromModel(std::string* o_pWhy = nullptr);

  /// What one target needs to be evaluated without the rest of the tree: copies of the segments
  /// from the root to its parent, the ranges of the joint state they read, and the state
  /// compacted to those ranges.
  struct VTgtChainInfo {
    /// Root first, the target's parent last; each is the parent of the next.
    std::vector<VComputeSegment> m_Chain;
    /// Each chain segment's first parameter in m_State.
    std::vector<std::uint32_t> m_Offsets;
    /// Half-open ranges [first, end) of the full state read by the chain, in order; ranges that
    /// touch are merged.
    std::vector<std::pair<std::uint32_t, std::uint32_t>> m_Runs;
    /// The compacted state: the runs one after another.
    std::vector<double> m_State;
    /// The target, bound to m_Chain.back().
    std::unique_ptr<IComputeTarget> m_pTarget;
    /// A clone of the subject's segment computer, attached to m_Chain.
    std::unique_ptr<ISegmentComputer> m_pComputer;
  };

  /// Evaluates target `index` alone: forward kinematics (and Jacobian blocks of `type`) of the
  /// segments from the root to its parent only, then the target. Returns the evaluated target,
  /// which is the chain's own copy: the subject's segments, targets and state cache are left as
  /// they were. Its Jacobian columns are those of the full state. A target with no segment in
  /// the tree is returned as it is; a target on two segments is evaluated with the whole tree
  /// (UpdateSegments) and returned. Chains are built on first use.
  const IComputeTarget& UpdateTarget(std::uint32_t index, ConstView state, std::uint32_t type);
  /// The chain of target `index` (built if needed); null for a target with no segment.
  const VTgtChainInfo* ChainInfo(std::uint32_t index) { return Chain(index); }

  /// The parameters each joint needs to give its segment's current local pose; true only when
  /// every joint could (within `tolerance`). Segments that fail still get their best reading.
  bool StateFromWorldPoses(View o_rState, double tolerance) const;

private:
  void Build();
  const VComputeSegment* SegmentByIdentifier(std::uint32_t id) const;
  SegmentLookup Lookup() const;
  void BuildChain(std::uint32_t index, VTgtChainInfo& o_rInfo) const;
  VTgtChainInfo* Chain(std::uint32_t index);

  std::shared_ptr<const KinematicAlgo::ISubjectCalibrated> m_pSubject;
  std::uint32_t m_Mode;
  std::shared_ptr<const ISegmentFactory> m_pSegmentFactory;
  std::shared_ptr<const ITargetFactory> m_pTargetFactory;
  std::vector<VComputeSegment> m_Segments;
  std::shared_ptr<ISegmentComputer> m_pSegmentComputer;
  std::shared_ptr<const ITargetComputer> m_pTargetComputer;
  std::vector<std::unique_ptr<IComputeTarget>> m_Targets;
  /// m_Targets split by whether they have parameters, each in model order.
  std::vector<IComputeTarget*> m_PlainTargets;
  std::vector<IComputeTarget*> m_ParamTargets;
  /// Each run-time target's position in the model's target list (targets without a run-time
  /// form are dropped, so the two lists differ).
  std::vector<std::uint32_t> m_TargetModelIndex;
  /// The model's targets as of construction (kept alive), to check a reload against.
  std::vector<std::shared_ptr<const KinematicAlgo::ITargetCalibrated>> m_ModelTargets;
  std::map<std::uint32_t, VTgtChainInfo> m_Chains;
  std::uint32_t m_NumJointParams = 0;
  std::uint32_t m_NumTargetParams = 0;
  std::vector<double> m_Cache;
  bool m_FirstTime = true;
  std::uint64_t m_PoseEvaluations = 0;
};

} // namespace ComputeSubject
