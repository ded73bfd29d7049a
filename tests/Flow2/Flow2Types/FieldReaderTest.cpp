// Readers compiled from an older or newer schema: what reads into what, and where the reader
// collapses to block copies.

#include "EvolvingTypes.h"
#include "FlowTestTypes.h"

#include "Flow2/Flow2Types/FlowCompile.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

using namespace FlowTest;
using ZMT::IResult;
using ZMT::ISchema;
using ZMT::IO::VReaderBytes;
using ZMT::IO::VReaderTuple;

template <class T> const ISchema& SchemaOf() {
  static const ISchema s_Schema = [] {
    ISchema schema;
    ZMT::TFlowField<T>::Schema(schema, false);
    return schema;
  }();
  return s_Schema;
}

template <class T> std::vector<std::uint8_t> Bytes(const T& value) {
  VBytesOut out;
  ZMT::TFlowField<T>::Write(out, value);
  return out.m_Bytes;
}

/// Reads bytes written as From into a To through a reader compiled from From's schema.
template <class From, class To> IResult ReadAs(const From& value, To& o_rTarget) {
  ZMT::IReaderPtr pReader = ZMT::CompileReader<To>(SchemaOf<From>(), SchemaOf<To>());
  if (!pReader) return IResult::InvalidType;
  const auto bytes = Bytes(value);
  VBytesIn in(bytes);
  const IResult result = pReader->Read(in, &o_rTarget);
  EXPECT_EQ(in.m_Offset, bytes.size()) << "every byte of the value is consumed";
  return result;
}

struct VMarker32 {
  static constexpr const char* FlowClassName = "Marker32";
  double m_X = 0, m_Y = 0, m_Z = 0;
  float m_Residual = 0;
  std::uint32_t m_Flags = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("X", "", s.m_X);
    v("Y", "", s.m_Y);
    v("Z", "", s.m_Z);
    v("Residual", "", s.m_Residual);
    v("Flags", "", s.m_Flags);
  }
};

struct VGap {
  static constexpr const char* FlowClassName = "Gap";
  std::uint8_t m_A = 0;
  std::uint32_t m_B = 0; // three bytes of padding before it
  std::uint32_t m_C = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("A", "", s.m_A);
    v("B", "", s.m_B);
    v("C", "", s.m_C);
  }
};

struct VNested {
  static constexpr const char* FlowClassName = "Nested";
  std::vector<VMarker32> m_Markers;
  std::array<VMarker32, 2> m_Pair;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Markers", "", s.m_Markers);
    v("Pair", "", s.m_Pair);
  }
};

struct VF {
  static constexpr const char* FlowClassName = "F";
  float m_V = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) { v("V", "", s.m_V); }
};
struct VD {
  static constexpr const char* FlowClassName = "F";
  double m_V = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) { v("V", "", s.m_V); }
};
struct VI8 {
  static constexpr const char* FlowClassName = "F";
  std::int8_t m_V = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) { v("V", "", s.m_V); }
};
struct VI16 {
  static constexpr const char* FlowClassName = "F";
  std::int16_t m_V = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) { v("V", "", s.m_V); }
};
struct VOld {
  static constexpr const char* FlowClassName = "L";
  std::vector<std::string> m_Gone;
  std::vector<VMarker32> m_Empty;
  std::uint32_t m_Last = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Gone", "", s.m_Gone);
    v("Empty", "", s.m_Empty);
    v("Last", "", s.m_Last);
  }
};
struct VNew {
  static constexpr const char* FlowClassName = "L";
  std::vector<VMarker32> m_Empty{VMarker32{}};
  std::uint32_t m_Last = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Empty", "", s.m_Empty);
    v("Last", "", s.m_Last);
  }
};

TEST(FlowFieldReaders, AnUnchangedLayoutReadsAsOneBlockCopy) {
  ZMT::IReaderPtr pReader =
      ZMT::CompileReader<VMarker32>(SchemaOf<VMarker32>(), SchemaOf<VMarker32>());
  ASSERT_TRUE(pReader);
  auto* pBytes = dynamic_cast<VReaderBytes*>(pReader.get());
  ASSERT_NE(pBytes, nullptr);
  EXPECT_EQ(pBytes->m_Size, sizeof(VMarker32));

  // A list of them is one contiguous read; a fixed array of them one block.
  ZMT::IReaderPtr pNested = ZMT::CompileReader<VNested>(SchemaOf<VNested>(), SchemaOf<VNested>());
  auto* pTuple = dynamic_cast<VReaderTuple*>(pNested.get());
  ASSERT_NE(pTuple, nullptr);
  ASSERT_EQ(pTuple->Children().size(), 2u);
  EXPECT_NE(dynamic_cast<ZMT::IO::VReaderContiguousVector<VMarker32>*>(pTuple->Children()[0].get()),
            nullptr);
  EXPECT_EQ(pTuple->Children()[1]->m_Size, 2 * sizeof(VMarker32));

  VNested source;
  source.m_Markers = {{1, 2, 3, 0.5f, 7}, {4, 5, 6, 0.25f, 8}};
  source.m_Pair[1].m_Flags = 99;
  VNested target;
  EXPECT_EQ(ReadAs(source, target), IResult(IResult::Ok));
  EXPECT_EQ(Bytes(target), Bytes(source));
}

TEST(FlowFieldReaders, PaddingKeepsNeighboursApartAndAdjacentFieldsMerge) {
  ZMT::IReaderPtr pReader = ZMT::CompileReader<VGap>(SchemaOf<VGap>(), SchemaOf<VGap>());
  auto* pTuple = dynamic_cast<VReaderTuple*>(pReader.get());
  ASSERT_NE(pTuple, nullptr);
  ASSERT_EQ(pTuple->Children().size(), 2u); // A alone; B and C as one block
  EXPECT_EQ(pTuple->Children()[0]->m_Size, 1u);
  EXPECT_EQ(pTuple->Children()[1]->m_Offset, offsetof(VGap, m_B));
  EXPECT_EQ(pTuple->Children()[1]->m_Size, 8u);
  VGap source{3, 0x01020304, 0x0A0B0C0D};
  VGap target;
  EXPECT_TRUE(ReadAs(source, target).IsSuccess());
  EXPECT_EQ(target.m_A, 3);
  EXPECT_EQ(target.m_B, 0x01020304u);
  EXPECT_EQ(target.m_C, 0x0A0B0C0Du);
}

TEST(FlowFieldReaders, AnOlderVersionReadsIntoTheNewerOne) {
  const VSampleV1 old = FilledSampleV1(3);
  VSampleV2 now;
  EXPECT_TRUE(ReadAs(old, now).IsSuccess());
  EXPECT_EQ(now.m_X, old.m_X);
  EXPECT_EQ(now.m_Y, old.m_Y);
  EXPECT_EQ(now.m_Z, old.m_Z);
  EXPECT_EQ(now.m_Label, "sample 3");       // found though it moved
  EXPECT_EQ(now.m_Count, -8);               // widened, sign kept
  EXPECT_EQ(now.m_Weight, 0.25);            // float to double
  EXPECT_EQ(now.m_Colour, EColourV2::Blue); // 2 in the old numbering, 1 in the new
  EXPECT_EQ(now.m_Ids, (std::vector<std::uint32_t>{1, 65535, 3}));
  EXPECT_EQ(now.m_Added, 42u); // not in the file: the default stays

  // Where the layouts agree the compiled reader is a block copy: X, Y and Z as one.
  ZMT::IReaderPtr pReader =
      ZMT::CompileReader<VSampleV2>(SchemaOf<VSampleV1>(), SchemaOf<VSampleV2>());
  auto* pTuple = dynamic_cast<VReaderTuple*>(pReader.get());
  ASSERT_NE(pTuple, nullptr);
  auto* pFirst = dynamic_cast<VReaderBytes*>(pTuple->Children()[0].get());
  ASSERT_NE(pFirst, nullptr);
  EXPECT_EQ(pFirst->m_Offset, 0u);
  EXPECT_EQ(pFirst->m_Size, 3 * sizeof(double));
  // The removed member is skipped by a reader that can't merge with its neighbours.
  EXPECT_NE(dynamic_cast<ZMT::IO::VReaderSkipBytesNoCollapse*>(pTuple->Children()[3].get()),
            nullptr);
}

TEST(FlowFieldReaders, ANewerVersionReadsIntoTheOlderOneWhereItCan) {
  // Int32 can't narrow into Int16: the newer file has no reader into the older type.
  EXPECT_FALSE(ZMT::CompileReader<VSampleV1>(SchemaOf<VSampleV2>(), SchemaOf<VSampleV1>()));

  // A float field reads a double; an Int8 field refuses an Int16.
  VF f;
  VD d{2.5};
  EXPECT_TRUE(ReadAs(d, f).IsSuccess());
  EXPECT_EQ(f.m_V, 2.5f);
  EXPECT_FALSE(ZMT::CompileReader<VI8>(SchemaOf<VI16>(), SchemaOf<VI8>()));
  VI16 wide;
  VI8 narrow{-3};
  EXPECT_TRUE(ReadAs(narrow, wide).IsSuccess());
  EXPECT_EQ(wide.m_V, -3);
}

TEST(FlowFieldReaders, RenamedMembersAreFoundThroughTheHistoryBothWays) {
  // Forward: an old file's "Label" is the new "Name".
  const VSampleV1 old = FilledSampleV1(1);
  VSampleV3 renamed;
  EXPECT_TRUE(ReadAs(old, renamed).IsSuccess());
  EXPECT_EQ(renamed.m_Label, "sample 1");

  // Backward: a file written after the rename read by a build that predates it.
  VSampleV3 newer;
  newer.m_Label = "from the future";
  newer.m_X = 9;
  VSampleV2 older;
  EXPECT_TRUE(ReadAs(newer, older).IsSuccess());
  EXPECT_EQ(older.m_Label, "from the future");
  EXPECT_EQ(older.m_X, 9);

  // Histories that disagree in an entry both hold don't compile.
  ISchema tampered = SchemaOf<VSampleV3>();
  tampered.m_Renames[0].second = "Title";
  EXPECT_FALSE(ZMT::CompileReader<VSampleV3>(tampered, SchemaOf<VSampleV3>()));
}

TEST(FlowFieldReaders, EnumValuesMapByNameAndUnknownNamesFail) {
  ISchema file = SchemaOf<VSampleV2>();
  // A value the local enum lacks can't be mapped.
  auto& colour = std::find_if(file.m_Members.begin(), file.m_Members.end(), [](const auto& m) {
                   return m.m_Name == "Colour";
                 })->m_Schema;
  colour.m_EnumValues.push_back({"Orange", 4});
  EXPECT_FALSE(ZMT::CompileReader<VSampleV1>(file, SchemaOf<VSampleV1>()));

  // A value the history retires (renamed to nothing) reads to no effect.
  ISchema retiring = SchemaOf<VSampleV2>();
  auto& values =
      std::find_if(retiring.m_Members.begin(), retiring.m_Members.end(), [](const auto& m) {
        return m.m_Name == "Colour";
      })->m_Schema;
  ISchema localEnum = values;
  localEnum.m_EnumValues.pop_back(); // no Purple here
  localEnum.m_Renames.push_back({"Purple", ""});
  ZMT::IReaderPtr pEnum = ZMT::Compile(values, localEnum, *ZMT::TFlowReaderInfo<EColourV2>::Get());
  ASSERT_TRUE(pEnum);
  std::uint8_t target = 0xFF;
  const std::vector<std::uint8_t> purple{3};
  VBytesIn in(purple);
  EXPECT_EQ(pEnum->Read(in, &target), IResult(IResult::OkButNoEffect));
  EXPECT_EQ(target, 0xFF);
}

TEST(FlowFieldReaders, ListsCombineTheirElementsResults) {
  // A list of no elements is Ok; the file value of a removed member is skipped exactly even
  // when it is variable (a list of strings) and later members still read.
  VOld old;
  old.m_Gone = {"a", "", "ccc"};
  old.m_Last = 77;
  VNew now;
  EXPECT_TRUE(ReadAs(old, now).IsSuccess());
  EXPECT_TRUE(now.m_Empty.empty());
  EXPECT_EQ(now.m_Last, 77u);
}

TEST(FlowFieldReaders, CompareSchemasNamesEachChange) {
  std::vector<std::string> errors, warnings;
  ZMT::CompareSchemas(SchemaOf<VSampleV1>(), SchemaOf<VSampleV2>(), errors, warnings);
  EXPECT_TRUE(errors.empty()) << errors.front();
  auto has = [&](const std::string& text) {
    return std::any_of(warnings.begin(), warnings.end(),
                       [&](const std::string& w) { return w.find(text) != std::string::npos; });
  };
  EXPECT_TRUE(has("Sample.Obsolete member was removed."));
  EXPECT_TRUE(has("Sample.Added member was added."));
  EXPECT_TRUE(has("Sample: members were re-ordered"));
  EXPECT_TRUE(has("Sample.Count: Type changed from Int16 to Int32"));
  EXPECT_TRUE(has("Sample.Colour: Enum was modified"));

  // The other way round the narrowing is an error; a changed array length too.
  errors.clear();
  warnings.clear();
  ZMT::CompareSchemas(SchemaOf<VSampleV2>(), SchemaOf<VSampleV1>(), errors, warnings);
  EXPECT_NE(
      std::find(errors.begin(), errors.end(), "Sample.Count: Type changed from Int32 to Int16"),
      errors.end());
  ISchema longer = SchemaOf<VNested>();
  longer.m_Members[1].m_Schema.m_Count = 3;
  errors.clear();
  ZMT::CompareSchemas(SchemaOf<VNested>(), longer, errors, warnings);
  ASSERT_EQ(errors.size(), 1u);
  EXPECT_EQ(errors[0], "Nested.Pair: Array length changed from 2 to 3");

  // An enum value the new version lost.
  ISchema lost = SchemaOf<VSampleV1>();
  lost.m_Members[6].m_Schema.m_EnumValues.pop_back();
  errors.clear();
  ZMT::CompareSchemas(SchemaOf<VSampleV1>(), lost, errors, warnings);
  ASSERT_EQ(errors.size(), 1u);
  EXPECT_EQ(errors[0], "Sample.Colour: Enum value Blue could not be mapped");
}

} // namespace
