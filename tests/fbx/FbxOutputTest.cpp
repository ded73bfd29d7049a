// The output path of the writer: the byte sink (own blocks, views, patches, truncation, both
// ways out), the reused zlib stream against one-shot compression, and curves taking keys in
// bulk against key by key.
#include "FbxTestReader.h"
#include "fbx/FbxAnimation.h"
#include "fbx/FbxByteSink.h"
#include "fbx/FbxDeflater.h"
#include "fbx/FbxKeyStore.h"
#include "fbx/FbxRecordWriter.h"
#include "fbx/FbxScene.h"
#include <cstdio>
#include <gtest/gtest.h>
#include <numeric>
#include <random>
#include <zlib.h>

using namespace AnvilFbx;

namespace {

// The sink's bytes, written through a stream with a file (writev) or without one (fwrite).
std::vector<uint8_t> written(const VFbxByteSink& i_rSink, bool i_file) {
  std::vector<uint8_t> bytes(i_rSink.size() + 1);
  std::FILE* pStream =
      i_file ? std::tmpfile() : fmemopen(bytes.data(), bytes.size(), "w+b"); // no descriptor
  EXPECT_NE(pStream, nullptr);
  if (i_file) std::fputs("lead", pStream); // written from the stream's position
  EXPECT_TRUE(i_rSink.writeTo(pStream));
  std::fflush(pStream);
  if (i_file) {
    EXPECT_EQ(std::ftell(pStream), long(4 + i_rSink.size()));
    std::fseek(pStream, 4, SEEK_SET);
    EXPECT_EQ(std::fread(bytes.data(), 1, i_rSink.size(), pStream), i_rSink.size());
    std::fclose(pStream);
  } else {
    EXPECT_EQ(std::ftell(pStream), long(i_rSink.size()));
    std::fclose(pStream);
  }
  bytes.resize(i_rSink.size());
  return bytes;
}

std::vector<uint8_t> pattern(size_t i_size, uint8_t i_seed) {
  std::vector<uint8_t> bytes(i_size);
  for (size_t i = 0; i < i_size; ++i)
    bytes[i] = uint8_t(i_seed + i * 7 + (i >> 11));
  return bytes;
}

} // namespace

TEST(FbxByteSinkTest, BlocksViewsPatchesAndTruncationGiveTheBytesAppended) {
  constexpr size_t kBlock = VFbxByteSink::kBlockSize;
  VFbxByteSink sink;
  std::vector<uint8_t> expected;
  auto append = [&](const std::vector<uint8_t>& i_rBytes) {
    sink.append(i_rBytes.data(), i_rBytes.size());
    expected.insert(expected.end(), i_rBytes.begin(), i_rBytes.end());
  };
  const std::vector<uint8_t> view = pattern(3 * kBlock / 2, 9);
  append(pattern(kBlock - 5, 1)); // the next append crosses into a second block
  append(pattern(12, 2));
  sink.appendView(view.data(), view.size());
  expected.insert(expected.end(), view.begin(), view.end());
  append(pattern(40, 3)); // own bytes again after the view, in the second block

  // A patch across the first block boundary, and one in the own bytes after the view.
  const uint8_t fields[8] = {0xA0, 0xA1, 0xA2, 0xA3, 0xA4, 0xA5, 0xA6, 0xA7};
  sink.patch(kBlock - 3, fields, 8);
  std::copy(fields, fields + 8, expected.begin() + long(kBlock - 3));
  const uint64_t afterView = kBlock + 7 + view.size();
  sink.patch(afterView + 10, fields, 4);
  std::copy(fields, fields + 4, expected.begin() + long(afterView + 10));
  EXPECT_THROW(sink.patch(kBlock + 100, fields, 4), std::out_of_range);        // inside the view
  EXPECT_THROW(sink.patch(expected.size() - 2, fields, 4), std::out_of_range); // past the end
  ASSERT_EQ(sink.size(), expected.size());
  EXPECT_EQ(written(sink, true), expected);
  EXPECT_EQ(written(sink, false), expected);

  // Back into the view, then on: the own bytes continue where they stood before the view.
  sink.truncate(afterView - 100);
  expected.resize(afterView - 100);
  append(pattern(kBlock + 300, 4)); // fills the second block and reuses none of the view
  EXPECT_EQ(written(sink, true), expected);
  // Back before everything but a few bytes, then on.
  sink.truncate(3);
  expected.resize(3);
  append(pattern(70, 5));
  EXPECT_EQ(sink.capacity(), 3 * kBlock); // the blocks stay for reuse
  EXPECT_EQ(written(sink, true), expected);
}

TEST(FbxDeflaterTest, StreamsTheOneShotFormAcrossBlocksAndRefusesWhatDoesNotShrink) {
  VFbxDeflater deflater;
  std::vector<int64_t> times(200000);
  for (size_t i = 0; i < times.size(); ++i)
    times[i] = int64_t(i) * 384884650;
  std::mt19937 random(7);
  std::vector<uint32_t> noise(4000);
  for (uint32_t& word : noise)
    word = random();
  auto oneShot = [](const void* i_pData, size_t i_size) {
    uLongf size = compressBound(uLong(i_size));
    std::vector<uint8_t> out(size);
    EXPECT_EQ(compress2(out.data(), &size, static_cast<const Bytef*>(i_pData), uLong(i_size), 1),
              Z_OK);
    out.resize(size);
    return out;
  };

  VFbxByteSink sink;
  const std::vector<uint8_t> lead = pattern(VFbxByteSink::kBlockSize - 100, 1);
  sink.append(lead.data(), lead.size()); // the compressed form starts 100 bytes before a block end
  for (int round = 0; round < 2; ++round) { // the second round runs on the reused stream
    const size_t start = size_t(sink.size());
    const size_t size = deflater.compress(times.data(), times.size() * 8, sink);
    const std::vector<uint8_t> expected = oneShot(times.data(), times.size() * 8);
    ASSERT_EQ(size, expected.size());
    const std::vector<uint8_t> bytes = written(sink, true);
    EXPECT_TRUE(std::equal(expected.begin(), expected.end(), bytes.begin() + long(start)));
  }
  const uint64_t before = sink.size();
  EXPECT_EQ(deflater.compress(noise.data(), noise.size() * 4, sink), 0u);
  EXPECT_EQ(sink.size(), before);
  sink.append("end", 3);
  const std::vector<uint8_t> bytes = written(sink, false);
  EXPECT_EQ(std::string(bytes.end() - 3, bytes.end()), "end");
}

TEST(FbxByteSinkTest, ViewArraysReadBackRawAndCompressedAlike) {
  std::vector<int64_t> times(5000);
  std::vector<float> values(5000);
  for (size_t i = 0; i < times.size(); ++i) {
    times[i] = int64_t(i) * 1000;
    values[i] = float(i) * 0.25f;
  }
  for (size_t threshold : {size_t(128), SIZE_MAX}) {
    VFbxByteSink sink;
    VFbxRecordWriter writer(sink, 7500, threshold);
    writer.writeHeader();
    writer.begin("Curve");
    writer.propArrayView(std::span<const int64_t>(times));
    writer.propArrayView(std::span<const float>(values));
    writer.propArrayView(std::span<const float>(values.data(), 3)); // small: copied
    writer.end();
    const uint8_t id[16] = {};
    writer.finish(id);
    const FbxTest::File file = FbxTest::parse(written(sink, true));
    const auto& props = file.top.at(0).props;
    ASSERT_EQ(props.size(), 3u);
    EXPECT_EQ(props[0].compressed, threshold == 128);
    EXPECT_EQ(props[0].integers, std::vector<int64_t>(times.begin(), times.end()));
    ASSERT_EQ(props[1].reals.size(), values.size());
    EXPECT_EQ(props[1].reals[4999], 4999 * 0.25);
    EXPECT_EQ(props[2].reals, (std::vector<double>{0.0, 0.25, 0.5}));
  }
}

TEST(FbxAnimCurveTest, KeysInBulkEqualKeysOneByOne) {
  FbxManager* pManager = FbxManager::Create();
  FbxScene* pScene = FbxScene::Create(pManager, "s");
  FbxNode* pNode = FbxNode::Create(pManager, "n");
  FbxAnimLayer* pLayer = FbxAnimLayer::Create(pScene, "l");
  FbxAnimCurve* pBulk = pNode->LclTranslation.GetCurve(pLayer, "X", true);
  FbxAnimCurve* pSingle = pNode->LclTranslation.GetCurve(pLayer, "Y", true);
  // Increasing times after the last key; then times that fall among the keys, repeat one and
  // go back.
  const std::vector<std::vector<int64_t>> batches = {{10, 20, 30}, {40, 50}, {25, 30, 5, 60, 60}};
  float value = 1.0f;
  for (const auto& times : batches) {
    std::vector<float> values;
    for (size_t k = 0; k < times.size(); ++k)
      values.push_back(value++);
    const auto type = times.size() == 2 ? FbxAnimCurveDef::eInterpolationConstant
                                        : FbxAnimCurveDef::eInterpolationLinear;
    pBulk->addKeys(times, values, type);
    for (size_t k = 0; k < times.size(); ++k) {
      const int index = pSingle->KeyAdd(FbxTime(times[k]));
      pSingle->KeySetValue(index, values[k]);
      pSingle->KeySetInterpolation(index, type);
    }
  }
  EXPECT_EQ(pBulk->times(), (FbxKeyTimes{5, 10, 20, 25, 30, 40, 50, 60}));
  EXPECT_EQ(pBulk->times(), pSingle->times());
  EXPECT_EQ(pBulk->values(), pSingle->values());
  using Run = FbxAnimCurve::FlagRun;
  EXPECT_EQ(pBulk->flagRuns(), (std::vector<Run>{{0x4, 5}, {0x2, 2}, {0x4, 1}}));
  EXPECT_EQ(pSingle->flagRuns(), pBulk->flagRuns());
  EXPECT_EQ(pBulk->KeyGetFlags(6), uint32_t(FbxAnimCurveDef::eInterpolationConstant));

  // One key turned cubic splits its run, turned back joins it again.
  pBulk->KeySetInterpolation(2, FbxAnimCurveDef::eInterpolationCubic);
  EXPECT_EQ(pBulk->flagRuns(),
            (std::vector<Run>{{0x4, 2}, {0x8, 1}, {0x4, 2}, {0x2, 2}, {0x4, 1}}));
  pBulk->KeySetInterpolation(2, FbxAnimCurveDef::eInterpolationLinear);
  pBulk->KeySetInterpolation(7, FbxAnimCurveDef::eInterpolationConstant);
  EXPECT_EQ(pBulk->flagRuns(), (std::vector<Run>{{0x4, 5}, {0x2, 3}}));

  // Curves that take over shared times: a change to one leaves the others as they were.
  auto pTimes = std::make_shared<FbxKeyTimes>(FbxKeyTimes{1, 2, 3});
  FbxAnimCurve* pShared[2] = {pNode->LclRotation.GetCurve(pLayer, "X", true),
                              pNode->LclRotation.GetCurve(pLayer, "Y", true)};
  for (FbxAnimCurve* pCurve : pShared)
    pCurve->addKeys(pTimes, {0.5f, 1.5f, 2.5f}, FbxAnimCurveDef::eInterpolationLinear);
  EXPECT_EQ(&pShared[0]->times(), &pShared[1]->times());
  pShared[1]->KeySetValue(pShared[1]->KeyAdd(FbxTime(2)), 9.0f);
  pShared[1]->KeyAdd(FbxTime(0));
  EXPECT_EQ(pShared[0]->times(), (FbxKeyTimes{1, 2, 3}));
  EXPECT_EQ(pShared[0]->values(), (FbxKeyValues{0.5f, 1.5f, 2.5f}));
  EXPECT_EQ(pShared[1]->times(), (FbxKeyTimes{0, 1, 2, 3}));
  EXPECT_EQ(pShared[1]->values(), (FbxKeyValues{0.0f, 0.5f, 9.0f, 2.5f}));
  EXPECT_EQ(pShared[1]->flagRuns(), (std::vector<Run>{{0x108, 1}, {0x4, 3}}));
  // Times that do not increase are taken key by key.
  FbxAnimCurve* pUnsorted = pNode->LclScaling.GetCurve(pLayer, "X", true);
  pUnsorted->addKeys(std::make_shared<FbxKeyTimes>(FbxKeyTimes{3, 1, 3}), {1.0f, 2.0f, 3.0f},
                     FbxAnimCurveDef::eInterpolationLinear);
  EXPECT_EQ(pUnsorted->times(), (FbxKeyTimes{1, 3}));
  EXPECT_EQ(pUnsorted->values(), (FbxKeyValues{2.0f, 3.0f}));
  pScene->Destroy();
  pManager->Destroy();
}

TEST(FbxKeyStoreTest, LargeArraysShareSlabsThatGoWithTheirLastArray) {
  const size_t before = FbxKeyStore::slabCount();
  {
    // 40 arrays of 1 MiB fill more than one slab; one of 12 MiB gets a slab of its own; small
    // arrays never make one.
    std::vector<FbxKeyTimes> arrays;
    for (int a = 0; a < 40; ++a) {
      arrays.emplace_back(size_t(1) << 17);
      for (size_t i = 0; i < arrays.back().size(); ++i)
        arrays.back()[i] = int64_t(a) * 1000000 + int64_t(i);
    }
    FbxKeyValues big(size_t(3) << 20, 0.5f);
    FbxKeyValues small(100, 1.0f);
    EXPECT_EQ(FbxKeyStore::slabCount(), before + 3);
    for (int a = 0; a < 40; a += 2)
      arrays[size_t(a)] = FbxKeyTimes(); // give back every other array
    EXPECT_EQ(FbxKeyStore::slabCount(), before + 3);
    for (int a = 1; a < 40; a += 2) {
      const FbxKeyTimes& rArray = arrays[size_t(a)];
      EXPECT_EQ(rArray.front(), int64_t(a) * 1000000);
      EXPECT_EQ(rArray.back(), int64_t(a) * 1000000 + int64_t(rArray.size()) - 1);
    }
    EXPECT_EQ(big[size_t(3) << 19], 0.5f);
    EXPECT_EQ(reinterpret_cast<uintptr_t>(arrays[1].data()) % 64, 0u);
  }
  EXPECT_EQ(FbxKeyStore::slabCount(), before);
}
