// The generic item and factory: serialisation, size, clear, tags, readers, bad bytes.

#include "FlowTestTypes.h"

#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <memory>
#include <vector>

namespace {

using namespace FlowTest;

MixedItem FilledMixed() {
  MixedItem item;
  item.m_Ids = {4, 5, 6};
  item.m_Values = {{"gain", 0.5}, {"offset", -2.0}};
  item.m_Scale = {2, 3, 4};
  item.m_Kind = EKind::Segment;
  item.m_Enabled = false;
  VPoint p;
  p.m_X = 1;
  item.m_Points = {p, p};
  return item;
}

TEST(FlowItem, FixedItemWritesItsFieldsLittleEndianInOrder) {
  PointItem item;
  item.m_X = 1.5;
  item.m_Quality = 0x01020304;
  const auto bytes = Serialise(item);
  ASSERT_EQ(bytes.size(), 28u);
  EXPECT_EQ(item.GetSize(), 28u);
  double x = 0;
  std::memcpy(&x, bytes.data(), 8);
  EXPECT_EQ(x, 1.5);
  EXPECT_EQ(bytes[24], 0x04);
  EXPECT_EQ(bytes[27], 0x01);
}

TEST(FlowItem, VariableItemSizeIsWhatWriteProducesAndReadsBack) {
  const MixedItem item = FilledMixed();
  const auto bytes = Serialise(item);
  // ids 4+12, map 4+2*(4+4+8)+4+6+8, scale 12, kind 2, bool 1, points 4+2*28
  EXPECT_EQ(item.GetSize(), bytes.size());
  EXPECT_EQ(bytes.size(), 16u + 4 + (4 + 4 + 8) + (4 + 6 + 8) + 12 + 2 + 1 + 4 + 56);

  MixedItem back;
  VBytesIn in(bytes);
  ASSERT_TRUE(back.Read(in));
  EXPECT_EQ(in.m_Offset, bytes.size());
  EXPECT_EQ(back.m_Ids, item.m_Ids);
  EXPECT_EQ(back.m_Values, item.m_Values);
  EXPECT_EQ(back.m_Scale, item.m_Scale);
  EXPECT_EQ(back.m_Kind, EKind::Segment);
  EXPECT_FALSE(back.m_Enabled);
  ASSERT_EQ(back.m_Points.size(), 2u);
  EXPECT_EQ(back.m_Points[1].m_X, 1);

  EventItem event;
  event.m_Name = "start";
  EXPECT_EQ(event.GetSize(), Serialise(event).size());
  EXPECT_EQ(event.GetSize(), 4u + 5 + 4 + 4 + 8);
}

/// Every field kind a fixed layout allows: bools (alone and in an array), an enum, packed numbers
/// and nested classes.
struct VFlags {
  static constexpr const char* FlowClassName = "Flags";
  bool m_On = true;
  EKind m_Kind = EKind::Marker;
  std::array<bool, 3> m_Bits{true, false, true};
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("On", "", s.m_On);
    v("Kind", "", s.m_Kind);
    v("Bits", "", s.m_Bits);
  }
};
/// Its own item type: the type's statics beside the fields.
struct VFixedKinds {
  static constexpr const char* FlowClassName = "FixedKinds";
  static constexpr const char* FlowTypeName = "FlowFixedKinds";
  static constexpr std::uint32_t FlowTypeId = 190;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 0, 0};
  VFlags m_Flags;
  std::array<float, 3> m_Scale{1, 2, 3};
  VPoint m_Point{4, 5, 6, 9};
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Flags", "", s.m_Flags);
    v("Scale", "", s.m_Scale);
    v("Point", "", s.m_Point);
  }
};

TEST(FlowItem, AFixedLayoutIsPutWithTheBytesWriteGives) {
  ZMT::Detail::VFlowItem<VFixedKinds> kinds;
  kinds.m_Flags.m_On = false;
  kinds.m_Flags.m_Bits[1] = true;
  kinds.m_Point.m_Quality = 0x0A0B0C0D;
  PointItem point;
  point.m_Y = -0.25;
  for (const ZMT::IFlowItem* pItem :
       {static_cast<const ZMT::IFlowItem*>(&kinds), static_cast<const ZMT::IFlowItem*>(&point)}) {
    VBytesOut out;
    ASSERT_TRUE(pItem->Write(out));
    ASSERT_EQ(pItem->GetFixedSize(), out.m_Bytes.size());
    std::vector<std::uint8_t> put(out.m_Bytes.size() + 1, 0xEE);
    pItem->WriteFixed(put.data());
    EXPECT_EQ(put.back(), 0xEE); // nothing past the fixed size
    put.pop_back();
    EXPECT_EQ(put, out.m_Bytes);
  }
  EXPECT_EQ(kinds.GetFixedSize(), 1u + 2 + 3 + 12 + 28);
  // Strings, vectors and maps make the size depend on the value.
  EXPECT_EQ(EventItem().GetFixedSize(), 0u);
  EXPECT_EQ(FilledMixed().GetFixedSize(), 0u);
}

TEST(FlowItem, ClearRestoresTheDefaultByteForByte) {
  const auto fresh = Serialise(MixedItem());
  MixedItem item = FilledMixed();
  EXPECT_TRUE(item.Clear());
  EXPECT_EQ(Serialise(item), fresh);
  MixedItem untouched;
  EXPECT_TRUE(untouched.Clear());
  EXPECT_EQ(Serialise(untouched), fresh);
  EventItem event;
  event.m_Text = "changed";
  event.Clear();
  EXPECT_EQ(event.m_Text, "none");
}

TEST(FlowItem, TagsAnswerOnlyTheirOwnId) {
  std::string value = "untouched";
  PointItem point;
  for (int tag = 0; tag < 8; ++tag)
    EXPECT_FALSE(point.GetTag(ZMT::TagId(tag), value));
  EXPECT_EQ(value, "untouched");

  EventItem event;
  event.m_Name = "Bob";
  EXPECT_FALSE(event.GetTag(ZMT::TagId(3), value));
  EXPECT_EQ(value, "untouched");
  EXPECT_TRUE(event.GetTag(ZMT::TagId(ZMT::FlowTags::Name), value));
  EXPECT_EQ(value, "Bob");
  EXPECT_FALSE(ZMT::TagId().IsValid());
}

TEST(FlowItem, TruncatedOrLyingBytesFailToRead) {
  const auto bytes = Serialise(FilledMixed());
  for (std::size_t cut : {std::size_t(0), std::size_t(3), bytes.size() / 2, bytes.size() - 1}) {
    std::vector<std::uint8_t> part(bytes.begin(), bytes.begin() + cut);
    MixedItem item;
    VBytesIn in(part);
    EXPECT_FALSE(item.Read(in)) << cut;
  }
  // A string claiming four gigabytes ends in a failed read, not in a huge allocation.
  std::vector<std::uint8_t> lying = {0xFF, 0xFF, 0xFF, 0xFF, 'a', 'b'};
  EventItem event;
  VBytesIn in(lying);
  EXPECT_FALSE(event.Read(in));
  std::vector<std::uint8_t> longList = {0xFF, 0xFF, 0xFF, 0x7F, 1, 0, 0, 0};
  MixedItem mixed;
  VBytesIn listIn(longList);
  EXPECT_FALSE(mixed.Read(listIn));
}

TEST(FlowItemFactory, CreatesDefaultsAndGivesReaders) {
  ZMT::Detail::VFlowItemFactory<VFlowTestMixed> factory;
  EXPECT_EQ(factory.GetInfo().m_TypeInfo.m_Name, "FlowTestMixed");
  EXPECT_EQ(factory.GetInfo().m_TypeInfo.m_TypeId, 103u);
  EXPECT_EQ(factory.GetInfo().m_TypeInfo.m_Version, (ZMT::IFlowItemVersion{2, 0, 0}));
  std::unique_ptr<ZMT::IFlowItem> pItem(factory.Create());
  ASSERT_NE(pItem, nullptr);
  EXPECT_EQ(&pItem->GetInfo(), &factory.GetInfo().m_TypeInfo);
  EXPECT_EQ(Serialise(*pItem), Serialise(MixedItem()));

  const auto bytes = Serialise(FilledMixed());
  auto native = factory.GetReader(nullptr);
  ASSERT_TRUE(native);
  VBytesIn in(bytes);
  ASSERT_TRUE(native(in, *pItem));
  EXPECT_EQ(Serialise(*pItem), bytes);

  // Readers exist for the same schema and for one with a member fewer; a member whose type
  // can't be read into the local one leaves no reader.
  ZMT::ISchema same = factory.GetInfo().m_Schema;
  same.m_Docs.clear();
  EXPECT_TRUE(factory.GetReader(&same));
  ZMT::ISchema fewer = same;
  fewer.m_Members.pop_back();
  EXPECT_TRUE(factory.GetReader(&fewer));
  ZMT::ISchema other = same;
  other.m_Members[0].m_Schema = ZMT::ISchema();
  other.m_Members[0].m_Schema.m_Type = ZMT::ISchema::String;
  EXPECT_FALSE(factory.GetReader(&other));

  // The native reader refuses an item of another type.
  PointItem point;
  VBytesIn again(bytes);
  EXPECT_FALSE(native(again, point));
}

TEST(FlowItemFactory, EmptyCreationFunctionRaisesBadFunctionCall) {
  ZMT::Detail::VFlowItemFactory<VFlowTestPoint> factory{std::function<ZMT::IFlowItem*()>()};
  EXPECT_THROW(factory.Create(), std::bad_function_call);
}

} // namespace
