#pragma once
// Small item types for the Flow tests: one fixed-size, one with strings and a tag, one with every
// container shape.

#include "Flow2/Flow2Types/FlowTags.h"
#include "Flow2/Flow2Types/VFlowItem.h"

#include <array>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace FlowTest {

struct VPoint {
  static constexpr const char* FlowClassName = "Point";
  static constexpr const char* FlowClassDoc = "A position in millimetres.";
  double m_X = 0;
  double m_Y = 0;
  double m_Z = 0;
  std::uint32_t m_Quality = 7;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("X", "x", s.m_X);
    v("Y", "y", s.m_Y);
    v("Z", "z", s.m_Z);
    v("Quality", "quality", s.m_Quality);
  }
};

struct VFlowTestPoint : VPoint {
  static constexpr const char* FlowTypeName = "FlowTestPoint";
  static constexpr std::uint32_t FlowTypeId = 101;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 2, 3};
  static constexpr const char* FlowDescription = "test point";
};

struct VEvent {
  static constexpr const char* FlowClassName = "Event";
  std::string m_Name;
  std::string m_Text = "none";
  std::int64_t m_Tick = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Name", "", s.m_Name);
    v("Text", "", s.m_Text);
    v("Tick", "", s.m_Tick);
  }
};

struct VFlowTestEvent : VEvent {
  static constexpr const char* FlowTypeName = "FlowTestEvent";
  static constexpr std::uint32_t FlowTypeId = 102;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 0, 0};
  bool FlowTag(ZMT::TagId tagId, std::string& o_rValue) const {
    return ZMT::FlowTags::TagText(tagId, ZMT::FlowTags::Name, m_Name, o_rValue);
  }
};

enum class EKind : std::uint16_t { None = 0, Marker = 1, Segment = 2 };

struct VMixed {
  static constexpr const char* FlowClassName = "Mixed";
  std::vector<std::uint32_t> m_Ids;
  std::map<std::string, double> m_Values;
  std::array<float, 3> m_Scale{1, 1, 1};
  EKind m_Kind = EKind::None;
  bool m_Enabled = true;
  std::vector<VPoint> m_Points;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Ids", "", s.m_Ids);
    v("Values", "", s.m_Values);
    v("Scale", "", s.m_Scale);
    v("Kind", "", s.m_Kind);
    v("Enabled", "", s.m_Enabled);
    v("Points", "", s.m_Points);
  }
};

struct VFlowTestMixed : VMixed {
  static constexpr const char* FlowTypeName = "FlowTestMixed";
  static constexpr std::uint32_t FlowTypeId = 103;
  static constexpr ZMT::IFlowItemVersion FlowVersion{2, 0, 0};
};

using PointItem = ZMT::Detail::VFlowItem<VFlowTestPoint>;
using EventItem = ZMT::Detail::VFlowItem<VFlowTestEvent>;
using MixedItem = ZMT::Detail::VFlowItem<VFlowTestMixed>;

inline ZMT::IFlowItemFactories TestFactories() {
  return ZMT::MakeFlowItemFactories<VFlowTestPoint, VFlowTestEvent, VFlowTestMixed>();
}

template <class T> const ZMT::IFlowItemTypeInfo& TypeOf() {
  return ZMT::Detail::FlowTypeStatics<T>().m_TypeInfo;
}

/// An output stream into a byte vector, and an input stream over one.
class VBytesOut : public ZMT::IOutputStream {
public:
  bool Write(const void* p, std::uint64_t n) override {
    const auto* b = static_cast<const std::uint8_t*>(p);
    m_Bytes.insert(m_Bytes.end(), b, b + n);
    return true;
  }
  std::vector<std::uint8_t> m_Bytes;
};

class VBytesIn : public ZMT::IInputStream {
public:
  explicit VBytesIn(const std::vector<std::uint8_t>& bytes) : m_Bytes(bytes) {}
  bool Read(void* p, std::uint64_t n) override {
    if (m_Failed || n > m_Bytes.size() - m_Offset) return !(m_Failed = true);
    std::copy_n(m_Bytes.data() + m_Offset, n, static_cast<std::uint8_t*>(p));
    m_Offset += n;
    return true;
  }
  bool IsFailed() const override { return m_Failed; }
  std::size_t m_Offset = 0;

private:
  const std::vector<std::uint8_t>& m_Bytes;
  bool m_Failed = false;
};

template <class Item> std::vector<std::uint8_t> Serialise(const Item& item) {
  VBytesOut out;
  item.Write(out);
  return out.m_Bytes;
}

} // namespace FlowTest
