#include "AnvilCore/io/C3DReader.h"
#include "C3DTestFile.h"
#include <algorithm>
#include <cmath>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>

using namespace AnvilCore;

namespace {

std::vector<uint8_t> sample(const char* i_pName) {
  std::ifstream in(std::string(ANVIL_TEST_DATA) + "/c3d/" + i_pName, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

C3DContent parseOk(const std::vector<uint8_t>& i_bytes) {
  C3DContent content;
  std::string error;
  EXPECT_TRUE(parseC3D(i_bytes.data(), i_bytes.size(), content, error)) << error;
  return content;
}

std::string parseError(const std::vector<uint8_t>& i_bytes) {
  C3DContent content;
  std::string error;
  EXPECT_FALSE(parseC3D(i_bytes.data(), i_bytes.size(), content, error));
  return error;
}

TEST(C3DReader, SampleFilesInIntegerAndDecFormHoldTheSameRecording) {
  const C3DContent pi = parseOk(sample("Eb015pi.c3d"));
  const C3DContent vr = parseOk(sample("Eb015vr.c3d"));
  EXPECT_EQ(pi.processor, C3D::EProcessorIntel);
  EXPECT_EQ(vr.processor, C3D::EProcessorDec);
  EXPECT_GT(pi.scale, 0.0f);
  EXPECT_LT(vr.scale, 0.0f);
  for (const C3DContent* p : {&pi, &vr}) {
    EXPECT_EQ(p->pointCount, 26);
    EXPECT_EQ(p->firstFrame, 1);
    EXPECT_EQ(p->frameCount, 450);
    EXPECT_DOUBLE_EQ(p->frameRate, 50.0);
    EXPECT_EQ(p->labels.front(), "RFT1");
    EXPECT_EQ(p->labels.back(), "pv4");
    EXPECT_EQ(p->analogChannels, 16);
    EXPECT_DOUBLE_EQ(p->analogRate, 200.0);
    EXPECT_EQ(p->analog.size(), 450u * 4u * 16u);
  }
  const float tolerance = pi.scale; // one step of the integer form
  int present = 0;
  for (int f = 0; f < 450; ++f)
    for (int m = 0; m < 26; ++m) {
      const float* a = pi.point(f, m);
      const float* b = vr.point(f, m);
      ASSERT_EQ(a[3] < 0.0f, b[3] < 0.0f) << "frame " << f << " marker " << m;
      if (a[3] < 0.0f) continue;
      ++present;
      for (int k = 0; k < 3; ++k)
        ASSERT_NEAR(a[k], b[k], tolerance) << f << " " << m << " " << k;
    }
  EXPECT_GT(present, 26 * 400);
  EXPECT_LT(present, 26 * 450); // the recording has gaps
}

TEST(C3DReader, ReadsAsManyWholeFramesAsAFileHolds) {
  const C3DContent content = parseOk(sample("Optotrak.c3d"));
  EXPECT_EQ(content.pointCount, 54);
  EXPECT_EQ(content.frameCount, 29);
  EXPECT_DOUBLE_EQ(content.frameRate, 30.0);
  EXPECT_EQ(content.units, "mm");
  ASSERT_EQ(content.warnings.size(), 1u);
  EXPECT_EQ(content.warnings[0], "the file declares 1149 frames but holds 29; 29 read");
}

TEST(C3DReader, EveryProcessorFormGivesTheSameValues) {
  for (C3D::EProcessor processor :
       {C3D::EProcessorIntel, C3D::EProcessorDec, C3D::EProcessorMips}) {
    for (float scale : {-1.0f, 0.25f}) {
      C3DTestFile file;
      file.processor = processor;
      file.scale = scale;
      file.rate = 120.0f;
      file.firstFrame = 7;
      file.fillLinear(3, 5);
      file.frames[2][1][3] = -1.0f; // a gap
      file.analogSamplesPerFrame = 2;
      file.analogLabels = {"Mic", "Mic"};
      file.analogOffsets = {0, 100};
      for (int f = 0; f < 5; ++f)
        file.analog.push_back({f, 100 - f, -f, 200 + f});
      SCOPED_TRACE(::testing::Message() << "processor " << int(processor) << " scale " << scale);
      const C3DContent content = parseOk(file.build());
      EXPECT_EQ(content.processor, processor);
      EXPECT_EQ(content.firstFrame, 7);
      EXPECT_EQ(content.frameCount, 5);
      EXPECT_DOUBLE_EQ(content.frameRate, 120.0);
      EXPECT_EQ(content.labels, (std::vector<std::string>{"M1", "M2", "M3"}));
      for (int f = 0; f < 5; ++f)
        for (int m = 0; m < 3; ++m) {
          const float* p = content.point(f, m);
          if (f == 2 && m == 1) {
            EXPECT_LT(p[3], 0.0f);
            continue;
          }
          EXPECT_GE(p[3], 0.0f);
          EXPECT_FLOAT_EQ(p[0], float(m * 10 + f));
          EXPECT_FLOAT_EQ(p[1], float(-m));
          EXPECT_FLOAT_EQ(p[2], float(f) * 0.5f);
        }
      EXPECT_EQ(content.analogChannels, 2);
      EXPECT_DOUBLE_EQ(content.analogRate, 240.0);
      // Frame 3, second sample: raw 200 + 3 on the channel with offset 100.
      EXPECT_DOUBLE_EQ(content.analog[3 * 4 + 3], 103.0);
      EXPECT_DOUBLE_EQ(content.analog[3 * 4 + 1], -3.0);
    }
  }
}

TEST(C3DReader, LabelsPast255AndSubjectPrefixes) {
  C3DTestFile file;
  file.fillLinear(300, 2);
  file.labels[0] = "Bob:LFHD";
  file.labels[256] = "Ann_RFHD";
  file.labels[299] = "";
  file.subjectPrefixes = {"Ann_", "Bob:"};
  file.subjectNames = {"Ann"};
  const C3DContent content = parseOk(file.build());
  ASSERT_NE(content.find("POINT", "LABELS2"), nullptr);
  ASSERT_EQ(content.labels.size(), 300u);
  EXPECT_EQ(content.labels[0], "Bob:LFHD");
  EXPECT_EQ(content.labels[256], "Ann_RFHD");
  EXPECT_EQ(content.labels[298], "M299");
  EXPECT_EQ(content.labels[299], "Point300");
  ASSERT_EQ(content.subjectPrefixes.size(), 2u);
  EXPECT_EQ(content.subjectPrefixes[0].prefix, "Ann_");
  EXPECT_EQ(content.subjectPrefixes[0].subject, "Ann");
  EXPECT_EQ(content.subjectPrefixes[1].prefix, "Bob:");
  EXPECT_EQ(content.subjectPrefixes[1].subject, "Bob");
}

TEST(C3DReader, LongFilesTakeTheirRangeFromTheParameters) {
  C3DTestFile file;
  file.fillLinear(1, 3);
  file.firstFrame = 70000; // the header word saturates; the parameters hold the truth
  const auto pair = [&](long v) {
    auto lo = file.word(int(v & 0xFFFF));
    const auto hi = file.word(int(v >> 16));
    lo.insert(lo.end(), hi.begin(), hi.end());
    return lo;
  };
  file.extras.push_back({4, "ACTUAL_START_FIELD", 2, {2}, pair(70000)});
  file.extras.push_back({4, "ACTUAL_END_FIELD", 2, {2}, pair(70002)});
  C3DContent content = parseOk(file.build());
  EXPECT_EQ(content.firstFrame, 70000);
  EXPECT_EQ(content.frameCount, 3);

  // This family's writer: 32-bit integers under a float type byte.
  file.extras.clear();
  file.extras.push_back({1, "DRU_FIRST_FRAME", 4, {}, {0x70, 0x11, 0x01, 0x00}}); // 70000
  file.extras.push_back({1, "DRU_LAST_FRAME", 4, {}, {0x72, 0x11, 0x01, 0x00}});
  content = parseOk(file.build());
  EXPECT_EQ(content.firstFrame, 70000);
  EXPECT_EQ(content.frameCount, 3);
}

TEST(C3DReader, MalformedFilesGiveClearErrors) {
  C3DTestFile good;
  good.fillLinear(2, 4);
  const std::vector<uint8_t> bytes = good.build();
  const size_t dataStart = (size_t(bytes[16]) - 1) * 512;

  EXPECT_EQ(parseError({bytes.begin(), bytes.begin() + 100}),
            "file ends inside the 512-byte header: 512 bytes needed, 100 left (byte 0)");
  auto notC3D = bytes;
  notC3D[1] = 0x12;
  EXPECT_EQ(parseError(notC3D), "not a C3D file: header byte 1 is 0x12, not 0x50 (byte 1)");
  auto farParameters = bytes;
  farParameters[0] = 200;
  EXPECT_EQ(parseError(farParameters),
            "file ends inside the parameter section's first 4 bytes: 4 bytes needed, 0 left "
            "(byte 101888)");
  auto processor = bytes;
  processor[512 + 3] = 90;
  EXPECT_EQ(parseError(processor), "unknown processor type 90 (84 Intel, 85 DEC and 86 MIPS are "
                                   "known) (byte 515)");
  EXPECT_EQ(parseError({bytes.begin(), bytes.begin() + long(dataStart) + 40}),
            "file ends inside frame 2 of 4 (frames of 32 bytes from byte 1024) (byte 1064)");
  // The section stops where the frames begin: a record may not run into them.
  const auto nameAt = [&](const std::string& i_name) {
    const auto it = std::search(bytes.begin() + 512, bytes.end(), i_name.begin(), i_name.end());
    return size_t(it - bytes.begin());
  };
  auto longRecord = bytes;
  longRecord[nameAt("UNITS") + 5 + 2] = 4;   // floats
  longRecord[nameAt("UNITS") + 5 + 4] = 250; // 250 of them
  EXPECT_NE(parseError(longRecord)
                .find("parameter UNITS holds 1000 bytes of data past the "
                      "parameter section"),
            std::string::npos);
  auto badType = bytes;
  badType[nameAt("SCALE") + 5 + 2] = 3;
  EXPECT_NE(parseError(badType).find("parameter SCALE has data type 3"), std::string::npos);

  C3DTestFile absurd = good;
  absurd.extras.push_back({1, "USED", 2, {}, absurd.word(65535)});
  absurd.writeUsed = false;
  EXPECT_EQ(parseError(absurd.build()).find("POINT:USED is 65535 but the header counts 2 points"),
            0u);
  C3DTestFile zeroRate = good;
  zeroRate.rate = 0.0f;
  EXPECT_EQ(parseError(zeroRate.build()).find("frame rate 0.000000 is not between"), 0u);
  C3DTestFile nanScale = good;
  nanScale.scale = std::nanf("");
  EXPECT_EQ(parseError(nanScale.build()).find("the point scale is"), 0u);
  C3DTestFile huge = good;
  huge.extras.push_back({1, "HUGE", 4, {255, 255, 255, 255}, {}});
  EXPECT_NE(parseError(huge.build()).find("parameter HUGE declares absurd dimensions"),
            std::string::npos);
  C3DTestFile slow = good;
  slow.rate = 1e-6f; // frames a million seconds apart
  slow.firstFrame = 60000;
  EXPECT_NE(parseError(slow.build()).find("lie beyond the host's clock"), std::string::npos);
  auto manyFrames = bytes;
  manyFrames[8] = 0xFF;
  manyFrames[9] = 0xFF; // last frame 65535 over 4 whole frames of data: read as 4
  const C3DContent content = parseOk(manyFrames);
  EXPECT_EQ(content.frameCount, 4);
  EXPECT_EQ(content.warnings.size(), 1u);
}

} // namespace
