#pragma once
// Animation: stacks (takes), their layers, and the curves that animate node properties. A curve
// keeps its key times, values and flags in three flat arrays, the form the file stores.
#include "fbx/FbxKeyStore.h"
#include "fbx/FbxNode.h"
#include "fbx/FbxTime.h"
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

namespace AnvilFbx {

class FbxAnimLayer;

/// Key flag bits: interpolation and tangent modes.
struct FbxAnimCurveDef {
  enum EInterpolationType {
    eInterpolationConstant = 0x2,
    eInterpolationLinear = 0x4,
    eInterpolationCubic = 0x8,
  };
  enum ETangentMode {
    eTangentAuto = 0x100,
    eTangentTCB = 0x200,
    eTangentUser = 0x400,
    eTangentGenericBreak = 0x800,
  };
  static constexpr uint32_t kInterpolationMask = 0xE;
};

class FbxAnimStack : public FbxObject {
public:
  static FbxAnimStack* Create(FbxScene* i_pScene, const char* i_pName);
  /// Appends a layer (a layer belongs to one stack).
  void AddMember(FbxAnimLayer* i_pLayer);
  void SetDescription(const char* i_pText) { m_description = i_pText ? i_pText : ""; }
  const std::string& GetDescription() const { return m_description; }
  void SetReferenceTimeSpan(const FbxTimeSpan& i_rSpan) { m_reference = i_rSpan; }
  void SetLocalTimeSpan(const FbxTimeSpan& i_rSpan) { m_local = i_rSpan; }
  const FbxTimeSpan& GetReferenceTimeSpan() const { return m_reference; }
  const FbxTimeSpan& GetLocalTimeSpan() const { return m_local; }
  const std::vector<FbxAnimLayer*>& layers() const { return m_layers; }

private:
  using FbxObject::FbxObject;
  std::string m_description;
  FbxTimeSpan m_reference, m_local;
  std::vector<FbxAnimLayer*> m_layers;
};

class FbxAnimCurveNode;

class FbxAnimLayer : public FbxObject {
public:
  static FbxAnimLayer* Create(FbxScene* i_pScene, const char* i_pName);
  /// The curve nodes made on this layer, in creation order.
  const std::vector<FbxAnimCurveNode*>& curveNodes() const { return m_curveNodes; }
  FbxAnimStack* stack() const { return m_pStack; }

private:
  friend class FbxAnimStack;
  friend class FbxAnimatableDouble3;
  using FbxObject::FbxObject;
  std::vector<FbxAnimCurveNode*> m_curveNodes;
  FbxAnimStack* m_pStack = nullptr;
};

class FbxAnimCurve : public FbxObject {
public:
  /// Keys in a row with the same flags: the form the file stores flags in.
  struct FlagRun {
    uint32_t flags;
    uint32_t count;
    bool operator==(const FlagRun&) const = default;
  };

  /// Room for this many keys.
  void ResizeKeyBuffer(int i_count);
  void KeyModifyBegin() {}
  void KeyModifyEnd() {}
  /// Adds a key, keeping times in order; a key at an existing time replaces it. Gives the key's
  /// index.
  int KeyAdd(FbxTime i_time);
  void KeySetValue(int i_index, float i_value) { m_values[size_t(i_index)] = i_value; }
  /// Replaces the interpolation bits of a key's flags.
  void KeySetInterpolation(int i_index, FbxAnimCurveDef::EInterpolationType i_type);
  /// Adds many keys at once, with the result of KeyAdd, KeySetValue and KeySetInterpolation
  /// called key by key. Times after the last key, strictly increasing, are appended whole.
  void addKeys(std::span<const int64_t> i_times, std::span<const float> i_values,
               FbxAnimCurveDef::EInterpolationType i_type);
  /// The same, taking the arrays over instead of copying them when the curve has no keys and
  /// the times strictly increase: the times may be shared by other curves (each copies them
  /// before it changes them).
  void addKeys(std::shared_ptr<FbxKeyTimes> i_pTimes, FbxKeyValues i_values,
               FbxAnimCurveDef::EInterpolationType i_type);
  int KeyGetCount() const { return int(m_pTimes->size()); }
  FbxTime KeyGetTime(int i_index) const { return FbxTime((*m_pTimes)[size_t(i_index)]); }
  float KeyGetValue(int i_index) const { return m_values[size_t(i_index)]; }
  uint32_t KeyGetFlags(int i_index) const;

  const FbxKeyTimes& times() const { return *m_pTimes; }
  const FbxKeyValues& values() const { return m_values; }
  FbxKeyValues& values() { return m_values; }
  /// Flags run-length encoded, neighbouring runs always different.
  const std::vector<FlagRun>& flagRuns() const { return m_flagRuns; }

private:
  friend class FbxAnimatableDouble3;
  using FbxObject::FbxObject;
  FbxKeyTimes& ownTimes();
  /// The run holding a key and the key's place in it.
  std::pair<size_t, uint32_t> runOf(size_t i_index) const;
  void insertFlags(size_t i_index, uint32_t i_flags);
  void mergeRuns(size_t i_first, size_t i_last);

  std::shared_ptr<FbxKeyTimes> m_pTimes = std::make_shared<FbxKeyTimes>();
  FbxKeyValues m_values;
  std::vector<FlagRun> m_flagRuns;
};

/// The curves of one property on one layer, one per channel.
class FbxAnimCurveNode : public FbxObject {
public:
  FbxNode* targetNode() const { return m_pTarget; }
  const char* targetProperty() const { return m_pProperty; }
  const FbxDouble3& defaults() const { return m_defaults; }
  /// Curve of channel 0, 1 or 2, or null.
  FbxAnimCurve* curve(int i_channel) const { return m_curves[size_t(i_channel)]; }
  FbxAnimLayer* layer() const { return m_pLayer; }

private:
  friend class FbxAnimatableDouble3;
  using FbxObject::FbxObject;
  FbxNode* m_pTarget = nullptr;
  const char* m_pProperty = "";
  FbxDouble3 m_defaults{};
  std::array<FbxAnimCurve*, 3> m_curves{};
  FbxAnimLayer* m_pLayer = nullptr;
};

/// Rewrites Euler rotation curves so that each key is the equivalent rotation nearest the key
/// before it: no jumps of 180 degrees or more where the rotation itself moves little.
class FbxAnimCurveFilterUnroll {
public:
  /// The Euler order the three curves are in.
  void SetRotationOrder(EFbxRotationOrder i_order) { m_order = i_order; }
  /// Unrolls three curves X, Y, Z in place. With equal key times on all three the full set of
  /// equivalent Euler triples is searched; otherwise each curve is unrolled by whole turns alone.
  /// False when fewer or more than three curves are given, or one is null.
  bool Apply(FbxAnimCurve** i_ppCurves, int i_count);

private:
  EFbxRotationOrder m_order = eEulerXYZ;
};

} // namespace AnvilFbx
