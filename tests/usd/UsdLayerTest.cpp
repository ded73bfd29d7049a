// The USD layer: number texts, names, prims and their text, topology and transforms.
#include "tests/support/UsdaReader.h"
#include "usd/UsdNames.h"
#include "usd/UsdNumbers.h"
#include "usd/UsdSkel.h"
#include "usd/UsdText.h"

#include <Eigen/Geometry>
#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <limits>
#include <random>
#include <unistd.h>

using namespace AnvilUsd;

namespace {
std::string FloatText(float value) {
  char text[MaxNumberChars];
  return std::string(text, WriteFloat(text, value));
}
std::string DoubleText(double value) {
  char text[MaxNumberChars];
  return std::string(text, WriteDouble(text, value));
}
std::string HalfText(float value) {
  char text[MaxNumberChars];
  return std::string(text, WriteHalf(text, FloatToHalf(value)));
}
} // namespace

TEST(UsdNumbers, LayoutFollowsTheLayersRule) {
  EXPECT_EQ(FloatText(1.0f), "1");
  EXPECT_EQ(FloatText(950.0f), "950");
  EXPECT_EQ(FloatText(0.5f), "0.5");
  EXPECT_EQ(FloatText(-0.0f), "-0");
  EXPECT_EQ(FloatText(0.0f), "0");
  EXPECT_EQ(FloatText(1e-6f), "0.000001");
  EXPECT_EQ(FloatText(1e-7f), "1e-7");
  EXPECT_EQ(FloatText(1.5e15f), "1.5e15");
  EXPECT_EQ(FloatText(0.017452406f), "0.017452406");
  EXPECT_EQ(DoubleText(123456789012345.0), "123456789012345");
  EXPECT_EQ(DoubleText(1e15), "1e15");
  EXPECT_EQ(DoubleText(-2.5e-300), "-2.5e-300");
  EXPECT_EQ(DoubleText(double(std::cos(2.0f * float(M_PI) / 180.0f))),
            DoubleText(double(std::cos(2.0f * float(M_PI) / 180.0f))));
  EXPECT_EQ(DoubleText(std::numeric_limits<double>::infinity()), "inf");
  EXPECT_EQ(DoubleText(-std::numeric_limits<double>::infinity()), "-inf");
  EXPECT_EQ(DoubleText(std::nan("")), "nan");
  EXPECT_EQ(HalfText(1.0f), "1");
  EXPECT_EQ(HalfText(0.1f), "0.0999756");
  EXPECT_EQ(HalfText(65504.0f), "65504");
  EXPECT_EQ(HalfText(1.1f), "1.09961");
}

TEST(UsdNumbers, EveryFloatAndDoubleReadsBackBitForBit) {
  std::mt19937_64 random(20261123);
  for (int i = 0; i < 1000000; ++i) {
    const float f = std::bit_cast<float>(std::uint32_t(random()));
    if (!std::isfinite(f)) continue;
    const std::string text = FloatText(f);
    ASSERT_EQ(std::bit_cast<std::uint32_t>(std::strtof(text.c_str(), nullptr)),
              std::bit_cast<std::uint32_t>(f))
        << text;
    const double d = std::bit_cast<double>(random());
    if (!std::isfinite(d)) continue;
    const std::string dtext = DoubleText(d);
    ASSERT_EQ(std::bit_cast<std::uint64_t>(std::strtod(dtext.c_str(), nullptr)),
              std::bit_cast<std::uint64_t>(d))
        << dtext;
  }
  for (float f : {std::numeric_limits<float>::denorm_min(), std::numeric_limits<float>::min(),
                  std::numeric_limits<float>::max(), -std::numeric_limits<float>::max()})
    EXPECT_EQ(std::strtof(FloatText(f).c_str(), nullptr), f) << FloatText(f);
}

TEST(UsdNumbers, HalvesRoundToNearestEvenAndRoundTrip) {
  for (std::uint32_t bits = 0; bits < 0x10000; ++bits) {
    const auto half = std::uint16_t(bits);
    const float value = HalfToFloat(half);
    if (std::isnan(value)) continue;
    ASSERT_EQ(FloatToHalf(value), half) << bits;
    // The printed text reads back to the same half.
    char text[MaxNumberChars];
    const std::string printed(text, WriteHalf(text, half));
    ASSERT_EQ(FloatToHalf(std::strtof(printed.c_str(), nullptr)), half) << printed;
  }
  // 1 + 2^-11 lies halfway between 1 and the next half: ties go to the even one, 1.
  EXPECT_EQ(FloatToHalf(1.0f + 1.0f / 2048.0f), FloatToHalf(1.0f));
  EXPECT_EQ(FloatToHalf(1.0f + 3.0f / 2048.0f), std::uint16_t(FloatToHalf(1.0f) + 2));
  EXPECT_EQ(FloatToHalf(1e6f), 0x7c00);
  EXPECT_EQ(FloatToHalf(-1e-9f), 0x8000);
}

TEST(UsdNames, InvalidNamesBecomeIdentifiers) {
  EXPECT_TRUE(IsValidIdentifier("Hips_01"));
  EXPECT_FALSE(IsValidIdentifier("1Hips"));
  EXPECT_FALSE(IsValidIdentifier(""));
  EXPECT_EQ(MakeValidIdentifier("ns:Hips"), "ns_Hips");
  EXPECT_EQ(MakeValidIdentifier("Left Arm"), "Left_Arm");
  EXPECT_EQ(MakeValidIdentifier("1Hips"), "_Hips");
  EXPECT_EQ(MakeValidIdentifier(""), "_");
  EXPECT_EQ(MakeValidIdentifier("H\xc3\xbc"), "H__");
  EXPECT_EQ(MakeValidRelativePath("/Hips/Spine-1//Neck.001"), "Hips/Spine_1/Neck_001");
}

TEST(UsdTopology, ParentsAreTheNearestJointAncestors) {
  VSkelTopology topology({"A", "A/B", "A/B/C/D", "X/Y", "bad name", "A/B"});
  // The last of duplicates wins; a skipped level goes to the nearest joint above it.
  EXPECT_EQ(topology.Parents(), (std::vector<int>{-1, 0, 5, -1, -1, 0}));
  std::string reason;
  EXPECT_FALSE(topology.Validate(&reason));
  EXPECT_EQ(reason, "Joint 2 has mis-ordered parent 5. Joints are expected to be ordered with "
                    "parent joints always coming before children.");
  EXPECT_TRUE(VSkelTopology({"A", "A/B", "C", "A/B/D"}).Validate(&reason));
  EXPECT_TRUE(VSkelTopology({}).Validate(&reason));
}

TEST(UsdTransforms, ScaleThenRotateThenTranslateForRowVectors) {
  std::mt19937 random(7);
  std::uniform_real_distribution<double> unit(-1.0, 1.0);
  for (int i = 0; i < 100; ++i) {
    Eigen::Quaterniond q(unit(random), unit(random), unit(random), unit(random));
    q.normalize();
    const Vec3f t = {float(unit(random) * 100), float(unit(random) * 100), float(unit(random))};
    const Vec3h s = {FloatToHalf(2.0f), FloatToHalf(1.0f), FloatToHalf(0.5f)};
    const Matrix4d m =
        MakeTransform(t, {float(q.w()), float(q.x()), float(q.y()), float(q.z())}, s);
    // p' = p * M for row vectors: the 3 by 3 block is the transpose of the column-vector
    // rotation, with row i scaled by s[i].
    const Eigen::Matrix3d rotation = q.toRotationMatrix();
    const double scales[3] = {2.0, 1.0, 0.5};
    for (int r = 0; r < 3; ++r) {
      for (int c = 0; c < 3; ++c)
        EXPECT_NEAR(m[r][c], scales[r] * rotation(c, r), 1e-6);
      EXPECT_EQ(m[r][3], 0.0);
      EXPECT_EQ(m[3][r], double(t[r]));
    }
    EXPECT_EQ(m[3][3], 1.0);
  }
  Matrix4dArray out;
  EXPECT_FALSE(MakeTransforms({{0, 0, 0}}, {}, {{0, 0, 0}}, out));
}

TEST(UsdStage, WritesPrimsPropertiesAndSamplesInTheLayersOrder) {
  auto pStage = VStage::CreateInMemory();
  pStage->SetUpAxis("Y");
  EXPECT_FALSE(pStage->SetUpAxis("X"));
  pStage->SetFramesPerSecond(120);
  pStage->SetStartTimeCode(0);
  pStage->SetEndTimeCode(1);
  EXPECT_EQ(pStage->DefinePrim("/1bad", "Skeleton"), nullptr);
  EXPECT_EQ(pStage->DefinePrim("relative", "Skeleton"), nullptr);
  VSkeleton skeleton = VSkeleton::Define(*pStage, "/Actor");
  ASSERT_TRUE(skeleton);
  VSkelAnimation animation = VSkelAnimation::Define(*pStage, "/Actor/Anim");
  VSkelBindingAPI::Apply(skeleton.GetPrim()).CreateAnimationSourceRel().SetTargets({"/Actor/Anim"});
  skeleton.GetJointsAttr().Set(TokenArray{"Hips", "Hips/Spine"});
  animation.GetJointsAttr().Set(TokenArray{"Hips", "Hips/Spine"});
  EXPECT_FALSE(animation.GetJointsAttr().Set(TokenArray{}, 1.0)) << "uniform takes no samples";
  // Samples given out of order are written in time order; a repeated time replaces.
  animation.GetTranslationsAttr().Set(Vec3fArray{{0.5f, 950.25f, -1.1f}, {0, 100, 0}}, 1.0);
  animation.GetTranslationsAttr().Set(Vec3fArray{{9, 9, 9}, {9, 9, 9}}, 0.0);
  animation.GetTranslationsAttr().Set(Vec3fArray{{0, 950, 0}, {0, 100, 0}}, 0.0);
  animation.GetRotationsAttr().Set(QuatfArray{{}, {}}, 0.0);
  const std::string text = pStage->ExportToString(false);
  EXPECT_EQ(text, R"(#usda 1.0
(
    endTimeCode = 1
    framesPerSecond = 120
    startTimeCode = 0
    upAxis = "Y"
)

def Skeleton "Actor" (
    prepend apiSchemas = ["SkelBindingAPI"]
)
{
    uniform token[] joints = ["Hips", "Hips/Spine"]
    rel skel:animationSource = </Actor/Anim>

    def SkelAnimation "Anim"
    {
        uniform token[] joints = ["Hips", "Hips/Spine"]
        quatf[] rotations.timeSamples = {
            0: [(1, 0, 0, 0), (1, 0, 0, 0)],
        }
        float3[] translations.timeSamples = {
            0: [(0, 950, 0), (0, 100, 0)],
            1: [(0.5, 950.25, -1.1), (0, 100, 0)],
        }
    }
}

)");
  const UsdaTest::Layer layer = UsdaTest::parse(text);
  EXPECT_EQ(layer.prim("/Actor/Anim")->type, "SkelAnimation");
}

TEST(UsdStage, TextsAreQuotedAndPropertiesSortLikeADictionary) {
  EXPECT_TRUE(DictionaryLess("joint2", "joint10"));
  EXPECT_TRUE(DictionaryLess("Alpha", "beta"));
  EXPECT_TRUE(DictionaryLess("bindTransforms", "joints"));
  EXPECT_FALSE(DictionaryLess("b", "B"));
  EXPECT_TRUE(DictionaryLess("B", "b"));

  auto pStage = VStage::CreateInMemory();
  pStage->SetDocumentation("say \"hi\"\tnow");
  VPrim* pPrim = pStage->DefinePrim("/A", "Skeleton");
  pPrim->Attribute("joints", true).Set(TokenArray{"it's", "a\"b'c", "\x01"});
  const std::string text = pStage->ExportToString(true);
  // A double quote and no single quote in the text: single quotes, tripled for the newline.
  EXPECT_NE(text.find("doc = '''say \"hi\"\\tnow\n\nGenerated from Composed Stage of root "
                      "layer \n'''"),
            std::string::npos)
      << text;
  EXPECT_NE(text.find(R"(["it's", "a\"b'c", "\x01"])"), std::string::npos) << text;
  const UsdaTest::Layer layer = UsdaTest::parse(text);
  const auto& tokens = layer.prim("/A")->attributes.at("joints").value.items;
  ASSERT_EQ(tokens.size(), 3u);
  EXPECT_EQ(tokens[1].text, "a\"b'c");
  EXPECT_EQ(tokens[2].text, "\x01");
}

TEST(UsdStage, ExportReplacesTheFileOnlyWhenWhole) {
  const auto dir =
      std::filesystem::temp_directory_path() / ("usd-layer-" + std::to_string(getpid()));
  std::filesystem::create_directories(dir);
  std::string error;
  EXPECT_EQ(VStage::CreateNew((dir / "none" / "a.usd").string(), error), nullptr);
  EXPECT_NE(error.find("does not exist"), std::string::npos) << error;

  const std::string path = (dir / "a.usd").string();
  auto pStage = VStage::CreateNew(path, error);
  ASSERT_NE(pStage, nullptr) << error;
  EXPECT_FALSE(std::filesystem::exists(path)) << "nothing is written before the export";
  VSkeleton::Define(*pStage, "/Empty");
  ASSERT_TRUE(pStage->Export(path, true, error)) << error;
  const UsdaTest::Layer layer = UsdaTest::parse([&] {
    std::ifstream in(path);
    return std::string(std::istreambuf_iterator<char>(in), {});
  }());
  EXPECT_EQ(layer.metadata.at("doc").text,
            "Generated from Composed Stage of root layer " + path + "\n");
  EXPECT_EQ(layer.prim("/Empty")->type, "Skeleton");
  std::filesystem::remove_all(dir);
}
