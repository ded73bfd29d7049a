#include "AnvilCore/io/TrcReader.h"
#include "AnvilCore/ExportDriver.h"
#include "SceneReaderTestSupport.h"
#include "exporters/trajectory/TrcExporter.h"
#include "plugin/host/Character.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include <cmath>
#include <limits>

using namespace AnvilCore;

namespace {

const char* const kHeader = "PathFileType\t4\t(X/Y/Z)\ttake.trc\n"
                            "DataRate\tCameraRate\tNumFrames\tNumMarkers\tUnits\tOrigDataRate\t"
                            "OrigDataStartFrame\tOrigNumFrames\n";

TrcContent parseOk(const std::string& i_text) {
  TrcContent content;
  std::string error;
  EXPECT_TRUE(parseTrc(i_text.data(), i_text.size(), content, error)) << error;
  return content;
}

std::string parseError(const std::string& i_text) {
  TrcContent content;
  std::string error;
  EXPECT_FALSE(parseTrc(i_text.data(), i_text.size(), content, error)) << i_text;
  return error;
}

bool hasSample(const TrcContent& i_rContent, int i_frame, int i_marker, double i_x) {
  for (const TrcContent::Sample& s : i_rContent.samples)
    if (s.frame == i_frame && s.marker == i_marker) return s.x == i_x;
  return false;
}

TEST(TrcReader, ReadsTheVariantsOtherProgramsWrite) {
  // One-based numbering, padded numbers, CRLF, a blank line, no trailing tab, a gap.
  const TrcContent a = parseOk(std::string(kHeader) + "60.00\t60.00\t3\t2\tmm\t60.00\t1\t3\r\n"
                                                      "Frame#\tTime\tLFHD\t\t\tRFHD\r\n"
                                                      "\t\tX1\tY1\tZ1\tX2\tY2\tZ2\r\n"
                                                      "\r\n"
                                                      "  001\t0.000\t 1.5\t2\t3\t4\t5\t6\r\n"
                                                      "2\t0.017\t\t\t\t4.5\t5\t6\r\n"
                                                      "3\t0.033\t1.0e1\t2\t3\r\n");
  EXPECT_DOUBLE_EQ(a.dataRate, 60.0);
  EXPECT_EQ(a.labels, (std::vector<std::string>{"LFHD", "RFHD"}));
  EXPECT_EQ(a.frameNumbers, (std::vector<int>{1, 2, 3}));
  ASSERT_EQ(a.samples.size(), 4u);
  EXPECT_TRUE(hasSample(a, 0, 0, 1.5));
  EXPECT_FALSE(hasSample(a, 1, 0, 0.0)); // gap
  EXPECT_TRUE(hasSample(a, 1, 1, 4.5));
  EXPECT_TRUE(hasSample(a, 2, 0, 10.0));
  EXPECT_FALSE(hasSample(a, 2, 1, 4.0)); // a short line leaves the last marker a gap

  // Zero-based numbering, trailing tabs, header columns in another order, "nan" gaps, frames
  // that start at 0 and skip.
  const TrcContent b = parseOk("PathFileType\t4\t(X/Y/Z)\tx.trc\t\n"
                               "NumMarkers\tUnits\tDataRate\n"
                               "1\tm\t100\n"
                               "Frame#\tTime\tBob:LFHD\t\t\t\n"
                               "\t\tX0\tY0\tZ0\t\n"
                               "0\t0.00\t0.1\t0.2\t0.3\t\n"
                               "5\t0.05\tnan\tNaN\tnan\t\n");
  EXPECT_EQ(b.units, "m");
  EXPECT_EQ(b.declaredFrames, 0);
  EXPECT_EQ(b.frameNumbers, (std::vector<int>{0, 5}));
  EXPECT_EQ(b.samples.size(), 1u);
  EXPECT_EQ(b.labels[0], "Bob:LFHD");

  // No markers: the name line and the X/Y/Z line are nearly empty.
  const TrcContent c = parseOk(std::string(kHeader) + "120\t120\t2\t0\tmm\t120\t1\t2\n"
                                                      "Frame#\tTime\t\n\t\t\n1\t0.0\n2\t0.1\n");
  EXPECT_TRUE(c.labels.empty());
  EXPECT_EQ(c.frameNumbers.size(), 2u);
}

TEST(TrcReader, MalformedFilesNameTheLine) {
  const std::string head = std::string(kHeader) + "60\t60\t2\t2\tmm\t60\t1\t2\n";
  const std::string names = "Frame#\tTime\tA\t\t\tB\t\t\t\n\t\tX1\tY1\tZ1\tX2\tY2\tZ2\n";
  struct Case {
    std::string text;
    std::string error;
  };
  const Case cases[] = {
      {"", "not a TRC file: it does not begin with \"PathFileType\""},
      {"Frame#\tTime\n", "line 1: not a TRC file: it does not begin with \"PathFileType\""},
      {std::string(kHeader), "the file ends after line 2, before the header values"},
      {std::string(kHeader) + "60\t60\t2\t2\n", "the file ends after line 3, before the marker "
                                                "names"},
      {std::string(kHeader) + "\t\t2\t2\n",
       "line 3: DataRate \"\" is not a rate between 0 and 1000000"},
      {std::string(kHeader) + "-5\t60\t2\t2\n",
       "line 3: DataRate \"-5\" is not a rate between 0 and 1000000"},
      {"PathFileType\nDataRate\n60\n", "line 3: the header has no NumMarkers"},
      {head + "Frame#\tTime\tA\t\t\n", "line 4: marker 2 of 2 (NumMarkers) has no name"},
      {head + "Frame#\tTime\tA\tB\n",
       "line 4: marker name \"B\" is not in a first column of three"},
      {head + "Frame#\tTime\tA\t\t\tB\t\t\tC\n", "line 4: more marker names than NumMarkers (2)"},
      {head + names + "1\t0\t1\t2\t3\n1\t0\t1\t2\t3\n", "line 7, column 1: frame 1 does not "
                                                        "follow frame 1"},
      {head + names + "1\t0\t1\t2\tabc\n", "line 6, column 5: \"abc\" is not a number"},
      {head + names + "1\t0\t1\t2\t3\t4\t5\t6\t7\n",
       "line 6, column 9: values past the columns of NumMarkers (2)"},
      {head + names + "x\t0\t1\t2\t3\n", "line 6, column 1: frame number \"x\" is not a whole "
                                         "number"},
      {head + names + "1\t0\t1\t2\t3\n", "the file ends after 1 of 2 frames (NumFrames)"},
      {std::string(kHeader) + "0.0001\t0\t1\t0\tmm\n" + "Frame#\tTime\n\t\t\n900000000\t0\n",
       "frames 900000000 to 900000000 at DataRate 0.000100 lie beyond the host's clock"},
      {head + "Frame#\tTime\tA\t\t\tB\n1\t0\t1\t2\t3\n",
       "line 5: expected the X/Y/Z column line, found a frame"},
  };
  for (const Case& c : cases)
    EXPECT_EQ(parseError(c.text), c.error) << c.text;
}

TEST(TrcReader, ExtremesAndNonFiniteValues) {
  const std::string head = std::string(kHeader) + "60\t60\t3\t2\tmm\t60\t1\t3\n" +
                           "Frame#\tTime\tA\t\t\tB\t\t\t\n\t\tX1\tY1\tZ1\tX2\tY2\tZ2\n";
  // Values beyond the double range and infinities are gaps, like "nan"; a value below the
  // smallest denormal reads as zero, the smallest denormal as itself.
  const TrcContent c = parseOk(head + "1\t0\t1e300\t-1e300\t4.9406564584124654e-324\t1\t1\t1\n"
                                      "2\t0\tinf\t1\t1\t-INF\t1\t1\n"
                                      "3\t0\t1e999\t1\t1\t1e-999\t-0\t1\n");
  ASSERT_EQ(c.samples.size(), 3u);
  EXPECT_EQ(c.samples[0].x, 1e300);
  EXPECT_EQ(c.samples[0].y, -1e300);
  EXPECT_EQ(c.samples[0].z, std::numeric_limits<double>::denorm_min());
  EXPECT_EQ(c.samples[1].marker, 1);
  EXPECT_EQ(c.samples[2].frame, 2);
  EXPECT_TRUE(hasSample(c, 2, 1, 0.0));
  EXPECT_FALSE(hasSample(c, 1, 0, 0.0));
  EXPECT_FALSE(hasSample(c, 2, 0, 0.0));
}

TEST(TrcReader, DamagedNamesArePrintableAndMessagesWhole) {
  const std::string head = std::string(kHeader) + "60\t60\t1\t2\tmm\t60\t1\t1\n";
  const TrcContent c = parseOk(head + "Frame#\tTime\tL\x01"
                                      "FHD\t\t\tR\xC3\x28\t\t\t\n\t\tX1\n1\t0\t1\t2\t3\n");
  EXPECT_EQ(c.labels, (std::vector<std::string>{"L?FHD", "R?("}));
  EXPECT_EQ(c.warnings.size(), 2u);
  // A NUL inside the quoted text does not end the message.
  const std::string names = "Frame#\tTime\tA\t\t\tB\n\t\tX1\n";
  const std::string error = parseError(head + names +
                                       std::string("1\t0\t1\t2\ta\0\x07"
                                                   "b\n",
                                                   13));
  EXPECT_EQ(error, "line 6, column 5: \"a??b\" is not a number");
}

class TrcSceneReaderTest : public SceneReaderTest {};

TEST_F(TrcSceneReaderTest, SubjectNamesUnitsAndTheClock) {
  std::string error;
  ASSERT_TRUE(
      read(writeFile("take.trc", std::string(kHeader) + "25\t25\t2\t2\tcm\t25\t1\t2\n"
                                                        "Frame#\tTime\tBob:LFHD\t\t\tLoose\t\t\t\n"
                                                        "\t\tX1\tY1\tZ1\tX2\tY2\tZ2\t\n"
                                                        "4\t0.16\t1\t2\t3\t\t\t\t\n"
                                                        "5\t0.20\t1\t2\t4\t7\t8\t9\t\n"),
           error))
      << error;
  auto* pMarker = dynamic_cast<Marker*>(find("Bob\\LFHD"));
  ASSERT_NE(pMarker, nullptr);
  EXPECT_NE(dynamic_cast<Character*>(find("Bob")), nullptr);
  HTimeManager* pTime = g_db->getTimeManager();
  EXPECT_DOUBLE_EQ(pTime->getFrameRate(), 25.0);
  EXPECT_EQ(pTime->getAnimRange(), HTimeRange(pTime->frameToTime(4), pTime->frameToTime(5)));
  EXPECT_DOUBLE_EQ(pMarker->getWSPos(pTime->frameToTime(5)).z, 40.0);
  auto* pLoose = dynamic_cast<Marker*>(find("Loose"));
  ASSERT_NE(pLoose, nullptr);
  EXPECT_EQ(pLoose->m_track.getNumKeys(), 1);

  const std::vector<std::string> before = sceneListing();
  EXPECT_FALSE(read(writeFile("bad.trc", std::string(kHeader) + "25\t25\t2\t1\tmm\t25\t1\t2\n"
                                                                "Frame#\tTime\tX\n\t\tX1\tY1\tZ1\n"
                                                                "1\t0\t1\t2\t3\n"),
                    error));
  EXPECT_NE(error.find("bad.trc: the file ends after 1 of 2 frames"), std::string::npos);
  EXPECT_EQ(sceneListing(), before);
  EXPECT_DOUBLE_EQ(pTime->getFrameRate(), 25.0);
}

TEST_F(TrcSceneReaderTest, WhatTheExporterWritesReadsBack) {
  HTimeManager* pTime = g_db->getTimeManager();
  pTime->setFrameRate(60.0);
  Character* pBob = new Character("Bob");
  g_db->addToScene(pBob, false, nullptr, false, false);
  Marker* pHead = new Marker("Head");
  g_db->addToScene(pHead, false, pBob, false, false);
  Marker* pLoose = new Marker("Loose");
  g_db->addToScene(pLoose, false, nullptr, false, false);
  for (int f = 2; f <= 9; ++f) {
    pHead->m_track.setKey(pTime->frameToTime(f), Vec3(f * 1.25, -f, 1000.0 / f));
    if (f % 3) pLoose->m_track.setKey(pTime->frameToTime(f), Vec3(f, f, f));
  }
  pTime->setAnimRange(HTimeRange(pTime->frameToTime(2), pTime->frameToTime(9)));

  TrcExporter* pExporter = TrcExporter::createInstance();
  pExporter->setWriteSubjects(true);
  ExportRequest request;
  request.path = m_folder + "/out.trc";
  std::string error;
  ASSERT_EQ(runExport(*pExporter, request, error), EExportStatus::EOk) << error;
  pExporter->deleteThis();

  g_db->clearScene();
  pTime->setFrameRate(30.0);
  ASSERT_TRUE(read(request.path, error)) << error;
  EXPECT_DOUBLE_EQ(pTime->getFrameRate(), 60.0);
  auto* pHeadBack = dynamic_cast<Marker*>(find("Bob\\Head"));
  auto* pLooseBack = dynamic_cast<Marker*>(find("Loose"));
  ASSERT_NE(pHeadBack, nullptr);
  ASSERT_NE(pLooseBack, nullptr);
  ASSERT_EQ(pHeadBack->m_track.getNumKeys(), 8);
  EXPECT_EQ(pLooseBack->m_track.getNumKeys(), 5);
  for (int i = 0; i < 8; ++i) {
    const int f = i + 2;
    EXPECT_EQ(pHeadBack->m_track.getKeyTime(i), pTime->frameToTime(f));
    EXPECT_NEAR(pHeadBack->m_track.getKeyValue(i).z, 1000.0 / f, 1e-6); // six decimals
  }
}

} // namespace
