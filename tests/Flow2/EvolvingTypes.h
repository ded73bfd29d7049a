#pragma once
// Two versions of one item type, as an older and a newer build define it: members added,
// removed, reordered, widened (16 to 32 bits, float to double, a list of u16 to u32), an enum
// renumbered. The third version renames a member.

#include "Flow2/Flow2Types/VFlowItem.h"

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace FlowTest {

enum class EColourV1 : std::uint8_t { Red = 0, Green = 1, Blue = 2 };
enum class EColourV2 : std::uint8_t { Red = 0, Blue = 1, Green = 2, Purple = 3 };

} // namespace FlowTest

template <> struct ZMT::TFlowEnumDescription<FlowTest::EColourV1> {
  static constexpr const char* Name = "Colour";
  static std::vector<std::pair<std::string, std::uint32_t>> Values() {
    return {{"Red", 0}, {"Green", 1}, {"Blue", 2}};
  }
};
template <> struct ZMT::TFlowEnumDescription<FlowTest::EColourV2> {
  static constexpr const char* Name = "Colour";
  static std::vector<std::pair<std::string, std::uint32_t>> Values() {
    return {{"Red", 0}, {"Blue", 1}, {"Green", 2}, {"Purple", 3}};
  }
};

namespace FlowTest {

struct VSampleV1 {
  static constexpr const char* FlowClassName = "Sample";
  double m_X = 0;
  double m_Y = 0;
  double m_Z = 0;
  std::int16_t m_Count = 0;
  float m_Weight = 0;
  std::uint32_t m_Obsolete = 0;
  EColourV1 m_Colour = EColourV1::Red;
  std::string m_Label;
  std::vector<std::uint16_t> m_Ids;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("X", "", s.m_X);
    v("Y", "", s.m_Y);
    v("Z", "", s.m_Z);
    v("Count", "", s.m_Count);
    v("Weight", "", s.m_Weight);
    v("Obsolete", "", s.m_Obsolete);
    v("Colour", "", s.m_Colour);
    v("Label", "", s.m_Label);
    v("Ids", "", s.m_Ids);
  }
};

struct VSampleV2 {
  static constexpr const char* FlowClassName = "Sample";
  double m_X = 0;
  double m_Y = 0;
  double m_Z = 0;
  std::string m_Label = "unset";
  std::int32_t m_Count = 0;
  double m_Weight = 0;
  EColourV2 m_Colour = EColourV2::Purple;
  std::vector<std::uint32_t> m_Ids;
  std::uint32_t m_Added = 42;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("X", "", s.m_X);
    v("Y", "", s.m_Y);
    v("Z", "", s.m_Z);
    v("Label", "", s.m_Label);
    v("Count", "", s.m_Count);
    v("Weight", "", s.m_Weight);
    v("Colour", "", s.m_Colour);
    v("Ids", "", s.m_Ids);
    v("Added", "", s.m_Added);
  }
};

/// The second version with "Label" renamed "Name".
struct VSampleV3 : VSampleV2 {
  static constexpr std::pair<const char*, const char*> FlowRenames[] = {{"Label", "Name"}};
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("X", "", s.m_X);
    v("Y", "", s.m_Y);
    v("Z", "", s.m_Z);
    v("Name", "", s.m_Label);
    v("Count", "", s.m_Count);
    v("Weight", "", s.m_Weight);
    v("Colour", "", s.m_Colour);
    v("Ids", "", s.m_Ids);
    v("Added", "", s.m_Added);
  }
};

struct VFlowSampleV1 : VSampleV1 {
  static constexpr const char* FlowTypeName = "FlowSample";
  static constexpr std::uint32_t FlowTypeId = 150;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 0, 0};
};
struct VFlowSampleV2 : VSampleV2 {
  static constexpr const char* FlowTypeName = "FlowSample";
  static constexpr std::uint32_t FlowTypeId = 150;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 1, 0};
};

inline VSampleV1 FilledSampleV1(int i) {
  VSampleV1 s;
  s.m_X = 1.5 + i;
  s.m_Y = -2.25;
  s.m_Z = 1e10;
  s.m_Count = static_cast<std::int16_t>(-5 - i);
  s.m_Weight = 0.25f;
  s.m_Obsolete = 0xDEADBEEF;
  s.m_Colour = EColourV1::Blue;
  s.m_Label = "sample " + std::to_string(i);
  s.m_Ids = {1, 65535, static_cast<std::uint16_t>(i)};
  return s;
}

} // namespace FlowTest
