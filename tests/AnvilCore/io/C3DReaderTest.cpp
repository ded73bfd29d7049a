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

TEST(C3DReader, HeaderAndParameterScalesThatDisagree) {
  // Integer frames written with 0.1 mm steps, coordinates up to about 3 m.
  C3DTestFile file;
  file.scale = 0.1f;
  file.fillLinear(2, 3);
  for (auto& frame : file.frames)
    for (auto& point : frame)
      point = {3000.0f, -1500.0f, 1000.0f, 0.0f};
  // POINT:SCALE 2.56 times smaller: both are plausible sizes; the header's wins, with a warning.
  file.parameterScale = 0.1f / 2.56f;
  C3DContent content = parseOk(file.build());
  EXPECT_FLOAT_EQ(content.scale, 0.1f);
  EXPECT_NEAR(content.point(2, 1)[0], 3000.0f, 0.1f);
  ASSERT_EQ(content.warnings.size(), 1u);
  EXPECT_EQ(content.warnings[0].find("the header's point scale 0.1 and POINT:SCALE 0.0390625 "
                                     "disagree; 0.1 is used"),
            0u);

  // A header scale that makes a 3 m volume 30 micrometres wide yields to the parameter.
  C3DTestFile tiny = file;
  tiny.parameterScale = 0.0f;
  std::vector<uint8_t> bytes = tiny.build();
  const std::vector<uint8_t> header = tiny.real(1e-6f);
  std::copy(header.begin(), header.end(), bytes.begin() + 12);
  content = parseOk(bytes);
  EXPECT_FLOAT_EQ(content.scale, 0.1f);
  EXPECT_NE(content.warnings.at(0).find("only it gives coordinates of a plausible size"),
            std::string::npos);

  // Signs that disagree: the form whose frames fill the data decides, either way round.
  for (float written : {-1.0f, 0.25f}) {
    C3DTestFile signs;
    signs.scale = written;
    signs.fillLinear(3, 40);
    bytes = signs.build();
    const std::vector<uint8_t> flipped = signs.real(-written);
    std::copy(flipped.begin(), flipped.end(), bytes.begin() + 12);
    content = parseOk(bytes);
    EXPECT_EQ(content.scale, written);
    EXPECT_FLOAT_EQ(content.point(39, 2)[0], 59.0f);
    ASSERT_EQ(content.warnings.size(), 1u);
    EXPECT_NE(content.warnings[0].find("fill the data"), std::string::npos);
  }
}

TEST(C3DReader, DamagedNamesBecomePrintable) {
  C3DTestFile file;
  file.fillLinear(3, 2);
  file.labels[1] = "L\aASI\xff";
  file.labels[2] = "RASI\xe2\x82"; // a UTF-8 sequence cut short
  file.analogSamplesPerFrame = 1;
  file.analogLabels = {"F\x1bz"};
  file.analog = {{1}, {2}};
  C3DContent content = parseOk(file.build());
  EXPECT_EQ(content.labels, (std::vector<std::string>{"M1", "L?ASI?", "RASI??"}));
  EXPECT_EQ(content.analogLabels, std::vector<std::string>{"F?z"});
  ASSERT_EQ(content.warnings.size(), 2u);
  EXPECT_EQ(content.warnings[0], "2 point labels held characters that cannot be printed, "
                                 "replaced by '?' (the first, number 2, reads \"L?ASI?\")");

  // A damaged parameter name with a NUL and a BEL in it: the message is whole.
  file.extras.push_back({1, std::string("USED\0\a", 6), 9, {}, {}});
  const std::string error = parseError(file.build());
  EXPECT_EQ(error.find("parameter USED?? has data type 9 (known: -1, 1, 2, 4) (byte "), 0u)
      << error;
  EXPECT_EQ(error.find('\0'), std::string::npos);
}

TEST(C3DReader, AnalogCalibrationIsRead) {
  C3DTestFile file;
  file.fillLinear(1, 2);
  file.analogSamplesPerFrame = 2;
  file.analogLabels = {"Fx", "EMG"};
  file.analogOffsets = {10, 0};
  file.analogReal = {{10.5f, 0.001f, 9.5f, -0.002f}, {10.25f, 0.0f, 10.0f, 0.003f}};
  file.extras.push_back({2, "SCALE", 4, {2}, {}});
  for (float v : {2.0f, 0.5f}) {
    const auto b = file.real(v);
    file.extras.back().data.insert(file.extras.back().data.end(), b.begin(), b.end());
  }
  file.extras.push_back({2, "GEN_SCALE", 4, {}, file.real(4.0f)});
  file.extras.push_back({2, "UNITS", -1, {4, 2}, {'N', ' ', ' ', ' ', 'm', 'V', ' ', ' '}});
  const C3DContent content = parseOk(file.build());
  EXPECT_EQ(content.analogOffsets, (std::vector<double>{10.0, 0.0}));
  EXPECT_EQ(content.analogScales, (std::vector<double>{8.0, 2.0}));
  EXPECT_EQ(content.analogUnits, (std::vector<std::string>{"N", "mV"}));
  // Readings at full precision, less the offset.
  EXPECT_DOUBLE_EQ(content.analog[0], 0.5);
  EXPECT_DOUBLE_EQ(content.analog[1], double(0.001f));
  EXPECT_DOUBLE_EQ(content.analog[7], double(0.003f));
}

} // namespace
