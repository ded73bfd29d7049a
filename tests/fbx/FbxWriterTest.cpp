// The binary container and the document writer, read back by the strict test reader.
#include "FbxTestReader.h"
#include "fbx/FbxAnimation.h"
#include "fbx/FbxDocumentWriter.h"
#include "fbx/FbxExporter.h"
#include "fbx/FbxRecordWriter.h"
#include "fbx/FbxScene.h"
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <gtest/gtest.h>
#include <numeric>
#include <unistd.h>

using namespace AnvilFbx;

namespace {

std::vector<uint8_t> bytesOf(const VFbxByteSink& i_rSink) {
  std::string path =
      (std::filesystem::temp_directory_path() / ("anvil-fbx-sink-" + std::to_string(::getpid())))
          .string();
  std::FILE* pFile = std::fopen(path.c_str(), "wb");
  EXPECT_TRUE(i_rSink.writeTo(pFile));
  std::fclose(pFile);
  std::FILE* pIn = std::fopen(path.c_str(), "rb");
  std::vector<uint8_t> bytes(i_rSink.size());
  EXPECT_EQ(std::fread(bytes.data(), 1, bytes.size(), pIn), bytes.size());
  std::fclose(pIn);
  std::filesystem::remove(path);
  return bytes;
}

class ContainerTest : public testing::TestWithParam<uint32_t> {};

TEST_P(ContainerTest, EveryPropertyTypeNestingAndFooterReadBack) {
  VFbxByteSink sink;
  VFbxRecordWriter writer(sink, GetParam(), 128);
  writer.writeHeader();
  writer.begin("Scalars");
  writer.propY(-12);
  writer.propC('Y');
  writer.propI(-123456);
  writer.propF(1.5f);
  writer.propD(-2.25);
  writer.propL(int64_t(1) << 40);
  writer.propS(std::string("a\0\1b", 4));
  const uint8_t raw[3] = {1, 2, 250};
  writer.propR(raw);
  writer.end();
  writer.begin("Arrays");
  std::vector<double> longReals(100);
  std::iota(longReals.begin(), longReals.end(), 0.5);
  std::vector<int64_t> longInts(64, 7);
  const float shortFloats[3] = {1.0f, 2.0f, 3.0f};
  const int32_t shortInts[2] = {-1, 5};
  writer.propArray(std::span<const double>(longReals));
  writer.propArray(std::span<const int64_t>(longInts));
  writer.propArray(std::span<const float>(shortFloats));
  writer.propArray(std::span<const int32_t>(shortInts));
  writer.propArray(std::span<const double>());
  writer.begin("Child");
  writer.propI(1);
  writer.end();
  writer.end();
  writer.beginScope("EmptyScope");
  writer.end(true);
  const uint8_t id[16] = {};
  writer.finish(id);
  EXPECT_EQ(writer.compressedArrays(), 2); // the two arrays above 128 bytes

  const std::vector<uint8_t> bytes = bytesOf(sink);
  EXPECT_EQ(bytes.size() % 16, 0u);
  const FbxTest::File file = FbxTest::parse(bytes);
  EXPECT_EQ(file.version, GetParam());
  ASSERT_EQ(file.top.size(), 3u);
  const auto& s = file.top[0].props;
  ASSERT_EQ(s.size(), 8u);
  EXPECT_EQ(s[0].integer, -12);
  EXPECT_EQ(s[1].integer, 'Y');
  EXPECT_EQ(s[2].integer, -123456);
  EXPECT_EQ(s[3].real, 1.5);
  EXPECT_EQ(s[4].real, -2.25);
  EXPECT_EQ(s[5].integer, int64_t(1) << 40);
  EXPECT_EQ(s[6].text, std::string("a\0\1b", 4));
  EXPECT_EQ(s[7].text, std::string("\x01\x02\xfa"));
  EXPECT_FALSE(file.top[0].nested);

  const auto& a = file.top[1].props;
  EXPECT_EQ(a[0].reals, longReals);
  EXPECT_TRUE(a[0].compressed);
  EXPECT_EQ(a[1].integers, longInts);
  EXPECT_TRUE(a[1].compressed);
  EXPECT_EQ(a[2].reals, std::vector<double>({1.0, 2.0, 3.0}));
  EXPECT_FALSE(a[2].compressed);
  EXPECT_EQ(a[3].integers, std::vector<int64_t>({-1, 5}));
  EXPECT_TRUE(a[4].reals.empty());
  ASSERT_EQ(file.top[1].children.size(), 1u);
  EXPECT_TRUE(file.top[1].nested);
  EXPECT_TRUE(file.top[2].nested);
  EXPECT_TRUE(file.top[2].children.empty());

  // The record header's width follows the version: the first record's end offset is 4 or 8
  // bytes, followed by the property count 8.
  uint64_t count = 0;
  std::memcpy(&count, bytes.data() + 27 + (GetParam() >= 7500 ? 8 : 4), GetParam() >= 7500 ? 8 : 4);
  EXPECT_EQ(count, 8u);
}

INSTANTIATE_TEST_SUITE_P(Versions, ContainerTest, testing::Values(7300u, 7400u, 7500u, 7700u));

TEST(FbxContainerTest, ReaderRejectsAWrongEndOffset) {
  VFbxByteSink sink;
  VFbxRecordWriter writer(sink, 7400, 128);
  writer.writeHeader();
  writer.begin("A");
  writer.propI(1);
  writer.end();
  const uint8_t id[16] = {};
  writer.finish(id);
  std::vector<uint8_t> bytes = bytesOf(sink);
  EXPECT_NO_THROW(FbxTest::parse(bytes));
  bytes[27] += 1; // end offset one byte too far
  EXPECT_THROW(FbxTest::parse(bytes), std::runtime_error);
}

TEST(FbxExporterLayerTest, VersionStringsAndOutputs) {
  EXPECT_EQ(FileVersionOf("FBX202000"), 7700u);
  EXPECT_EQ(FileVersionOf("FBX201900"), 7700u);
  EXPECT_EQ(FileVersionOf("FBX201800"), 7500u);
  EXPECT_EQ(FileVersionOf("FBX201600"), 7500u);
  EXPECT_EQ(FileVersionOf("FBX201400"), 7400u);
  EXPECT_EQ(FileVersionOf("FBX201300"), 7300u);
  EXPECT_EQ(FileVersionOf("FBX2014"), 0u);

  FbxManager* pManager = FbxManager::Create();
  FbxScene* pScene = FbxScene::Create(pManager, "s");
  FbxExporter* pExporter = FbxExporter::Create(pManager, "");
  EXPECT_FALSE(pExporter->SetFileExportVersion("FBX209900"));
  EXPECT_EQ(pExporter->fileVersion(), 7700u);
  EXPECT_TRUE(pExporter->SetFileExportVersion("FBX201400"));
  EXPECT_EQ(pExporter->fileVersion(), 7400u);
  EXPECT_FALSE(pExporter->Initialize("/nonexistent-anvil-folder/x.fbx"));
  EXPECT_FALSE(pExporter->Export(pScene));

  const std::string path = (std::filesystem::temp_directory_path() /
                            ("anvil-fbx-layer-" + std::to_string(::getpid()) + ".fbx"))
                               .string();
  ASSERT_TRUE(pExporter->Initialize(path.c_str()));
  ASSERT_TRUE(pExporter->Export(pScene));
  const FbxTest::File file = FbxTest::read(path);
  EXPECT_EQ(file.version, 7400u);
  for (const char* pSection :
       {"FBXHeaderExtension", "FileId", "CreationTime", "Creator", "GlobalSettings", "Documents",
        "References", "Definitions", "Objects", "Connections", "Takes"})
    EXPECT_NE(file.section(pSection), nullptr) << pSection;
  EXPECT_EQ(file.section("FileId")->props[0].text,
            std::string(reinterpret_cast<const char*>(kFbxFileId), 16));
  // 7400 has no OtherFlags; header version 1003.
  const FbxTest::Node* pHeader = file.section("FBXHeaderExtension");
  EXPECT_EQ(pHeader->child("FBXHeaderVersion")->props[0].integer, 1003);
  EXPECT_EQ(pHeader->child("OtherFlags"), nullptr);
  std::filesystem::remove(path);
  pScene->Destroy();
  pManager->Destroy();
}

TEST(FbxDocumentTest, RatesPastFourteenTravelAsCustomAndCurvesKeepTheirKeys) {
  FbxManager* pManager = FbxManager::Create();
  FbxScene* pScene = FbxScene::Create(pManager, "s");
  pScene->GetGlobalSettings().SetTimeMode(FbxTime::eFrames59dot94);
  FbxNode* pNode = FbxNode::Create(pManager, "n");
  pNode->SetNodeAttribute(FbxNull::Create(pManager, "n"));
  pScene->GetRootNode()->AddChild(pNode);
  FbxAnimStack* pStack = FbxAnimStack::Create(pScene, "Take");
  FbxAnimLayer* pLayer = FbxAnimLayer::Create(pScene, "Base Layer");
  pStack->AddMember(pLayer);
  FbxAnimCurve* pCurve = pNode->LclTranslation.GetCurve(pLayer, "Y", true);
  // Keys added out of order end in time order; a repeated time replaces its key.
  for (int t : {2, 0, 1, 1}) {
    const int k = pCurve->KeyAdd(FbxTime(t * 1000));
    pCurve->KeySetValue(k, float(t * 10 + (t == 1 ? 5 : 0)));
    pCurve->KeySetInterpolation(k, FbxAnimCurveDef::eInterpolationLinear);
  }
  // An empty curve is left out of the file.
  pNode->LclTranslation.GetCurve(pLayer, "X", true);

  std::FILE* pFile = std::tmpfile();
  FbxExporter* pExporter = FbxExporter::Create(pManager, "");
  ASSERT_TRUE(pExporter->Initialize(pFile));
  ASSERT_TRUE(pExporter->Export(pScene));
  std::vector<uint8_t> bytes(size_t(std::ftell(pFile)));
  std::rewind(pFile);
  ASSERT_EQ(std::fread(bytes.data(), 1, bytes.size(), pFile), bytes.size());
  std::fclose(pFile);

  const FbxTest::File file = FbxTest::parse(bytes);
  const FbxTest::Node* pSettings = file.section("GlobalSettings");
  EXPECT_EQ(pSettings->p("TimeMode")->props[4].integer, 14);
  EXPECT_NEAR(pSettings->p("CustomFrameRate")->props[4].real, 60000.0 / 1001.0, 1e-9);
  const FbxTest::Scene scene(file);
  EXPECT_EQ(scene.ofType("AnimationCurve").size(), 1u);
  const FbxTest::Node* pY = scene.curve("n", "Lcl Translation", "d|Y");
  ASSERT_NE(pY, nullptr);
  EXPECT_EQ(FbxTest::Scene::keyTimes(*pY), std::vector<int64_t>({0, 1000, 2000}));
  EXPECT_EQ(FbxTest::Scene::keyValues(*pY), std::vector<double>({0.0, 15.0, 20.0}));
  EXPECT_EQ(pY->child("KeyAttrFlags")->props[0].integers, std::vector<int64_t>({4}));
  EXPECT_EQ(pY->child("KeyAttrRefCount")->props[0].integers, std::vector<int64_t>({3}));
  EXPECT_EQ(scene.curve("n", "Lcl Translation", "d|X"), nullptr);
  EXPECT_EQ(scene.model("n")->node->p("Lcl Translation")->props[3].text, "A+");
  pScene->Destroy();
  pManager->Destroy();
}

} // namespace
