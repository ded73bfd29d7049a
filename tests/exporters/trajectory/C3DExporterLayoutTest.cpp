// Byte layout of the C3D file: header, parameter records, the data start patch, frames.
#include "C3DExportFixture.h"
#include <cstring>

namespace {
std::vector<std::string> recordNames(const C3DTest::File& i_rFile, const std::string& i_group) {
  std::vector<std::string> names;
  for (const C3DTest::Parameter& p : i_rFile.parameters)
    if (p.groupName == i_group) names.push_back(p.name);
  return names;
}
} // namespace

TEST_F(C3DExportTest, DefaultFloatDecFileHasHeaderRecordsAndFrames) {
  Marker* pGappy = addMarker("A", nullptr, {0, 1, 3, 4});
  addMarker("B");
  ASSERT_TRUE(exportRange(0, 4));
  const C3DTest::File f = file();
  ASSERT_TRUE(f.ok()) << f.error;

  // Header.
  EXPECT_EQ(f.u8(0), 2);
  EXPECT_EQ(f.u8(1), 0x50);
  EXPECT_EQ(f.u16(2), 2); // points
  EXPECT_EQ(f.u16(4), 0); // analog per frame
  EXPECT_EQ(f.u16(6), 0); // first frame
  EXPECT_EQ(f.u16(8), 4); // last frame
  EXPECT_EQ(f.u16(10), 0);
  const uint8_t minusOne[4] = {0x80, 0xC0, 0x00, 0x00};
  EXPECT_EQ(std::memcmp(&f.bytes[12], minusOne, 4), 0);
  EXPECT_DOUBLE_EQ(f.real(20), 120.0);
  EXPECT_EQ(f.u16(298), 0x3039);
  for (size_t i = 24; i < 298; ++i)
    ASSERT_EQ(f.u8(i), 0) << i;

  // Parameter section: leading bytes, group order, records of each group.
  EXPECT_EQ(f.u8(514), 8);
  EXPECT_EQ(f.u8(515), 0x55);
  std::vector<std::string> groups;
  for (const auto& g : f.groups)
    groups.push_back(std::to_string(g.first) + g.second);
  EXPECT_EQ(groups, (std::vector<std::string>{"1POINT", "2SUBJECTS", "3ANALOG", "5TRIAL"}));
  EXPECT_EQ(recordNames(f, "POINT"),
            (std::vector<std::string>{"USED", "SCALE", "RATE", "DATA_START", "FRAMES", "LABELS",
                                      "UNITS"}));
  EXPECT_EQ(recordNames(f, "ANALOG"), std::vector<std::string>{"USED"});
  EXPECT_EQ(f.paramInt("POINT", "USED"), 2);
  EXPECT_DOUBLE_EQ(f.paramReal("POINT", "SCALE"), -1.0);
  EXPECT_DOUBLE_EQ(f.paramReal("POINT", "RATE"), 120.0);
  EXPECT_EQ(f.paramInt("POINT", "FRAMES"), 5);
  EXPECT_EQ(f.paramText("POINT", "UNITS"), "mm  ");
  EXPECT_EQ(f.paramStrings("POINT", "LABELS"), (std::vector<std::string>{"A", "B"}));
  EXPECT_EQ(f.find("POINT", "LABELS")->dims, (std::vector<int>{64, 2}));
  EXPECT_EQ(f.paramInt("TRIAL", "X_DIRECTION"), 1);
  EXPECT_EQ(f.paramInt("TRIAL", "Y_DIRECTION"), 3);
  EXPECT_EQ(f.paramInt("TRIAL", "Z_DIRECTION"), 5);
  // Record offsets count from their own word to the record's end.
  const C3DTest::Parameter* pUsed = f.find("POINT", "USED");
  EXPECT_EQ(pUsed->offsetWord, 2 + 1 + 1 + 2 + 1);

  // DATA_START is patched with the block after the section (p / 512 + 2).
  const int block = int(f.sectionEnd / 512 + 2);
  EXPECT_EQ(f.paramInt("POINT", "DATA_START"), block);
  EXPECT_EQ(f.u16(16), block);
  EXPECT_EQ(m_pExporter->getDataStartBlock(), block);

  // Frames: 2 markers x 4 floats x 5 frames, no padding.
  const size_t start = dataStart(f);
  ASSERT_EQ(f.bytes.size(), start + 5 * 2 * 16);
  for (int fr = 0; fr < 5; ++fr) {
    const size_t a = start + size_t(fr) * 32, b = a + 16;
    const bool gap = fr == 2;
    EXPECT_DOUBLE_EQ(f.real(a), gap ? 0.0 : 10.0 + fr) << fr;
    EXPECT_DOUBLE_EQ(f.real(a + 4), gap ? 0.0 : 20.0 + 2 * fr);
    EXPECT_DOUBLE_EQ(f.real(a + 8), gap ? 0.0 : 30.0 + 3 * fr);
    EXPECT_DOUBLE_EQ(f.real(a + 12), gap ? -1.0 : 0.0);
    EXPECT_DOUBLE_EQ(f.real(b + 8), 30.0 + 3 * fr);
  }

  // Without preserve gaps the track's interpolated value is written.
  m_pExporter->setPreserveGaps(false);
  ASSERT_TRUE(exportRange(0, 4));
  const C3DTest::File g = file();
  EXPECT_DOUBLE_EQ(g.real(dataStart(g) + 64), pGappy->getWSPos(frame(2)).x);
  EXPECT_DOUBLE_EQ(g.real(dataStart(g) + 64 + 12), 0.0);
}

TEST_F(C3DExportTest, IntelIntegerFormScalesCoordinatesAndMarksGaps) {
  addMarker("A", nullptr, {0, 2}, Vec3(-1000.0, 5.0, 7.5));
  m_pExporter->setRealFormat(false);
  m_pExporter->setDecFormat(false);
  ASSERT_TRUE(exportRange(0, 2));
  const C3DTest::File f = file();
  ASSERT_TRUE(f.ok()) << f.error;
  EXPECT_EQ(f.u8(515), 0x54);

  // The scale factor constant is the float with bits 0x38000100.
  uint32_t bits;
  const float constant = 3.051851e-05f;
  std::memcpy(&bits, &constant, 4);
  EXPECT_EQ(bits, 0x38000100u);
  const float scale = 1000.0f * constant; // largest magnitude: x of the first key
  EXPECT_FLOAT_EQ(float(f.ieeeFloat(12)), scale);
  EXPECT_FLOAT_EQ(float(f.paramReal("POINT", "SCALE")), scale);

  const size_t start = dataStart(f);
  ASSERT_EQ(f.bytes.size(), start + 3 * 8);
  const double q = 1.0 / double(scale);
  EXPECT_EQ(f.i16(start), int16_t(int32_t(q * -1000.0)));
  EXPECT_EQ(f.i16(start + 2), int16_t(int32_t(q * 5.0)));
  EXPECT_EQ(f.i16(start + 4), int16_t(int32_t(q * 7.5)));
  EXPECT_EQ(f.u16(start + 6), 0);
  EXPECT_EQ(f.u16(start + 8 + 6), 0x8000); // frame 1 is a gap
  EXPECT_EQ(f.u16(start + 8), 0);
  EXPECT_EQ(f.i16(start + 16), int16_t(int32_t(q * -998.0)));
}

TEST_F(C3DExportTest, IntegerFormWithoutKeysUsesScaleOne) {
  g_db->addChild(nullptr, new Marker("Empty"));
  m_pExporter->setRealFormat(false);
  ASSERT_TRUE(exportRange(0, 1));
  EXPECT_FLOAT_EQ(m_pExporter->getScale(), 1.0f);
  EXPECT_DOUBLE_EQ(file().paramReal("POINT", "SCALE"), 1.0);
}

TEST_F(C3DExportTest, LabelsAreChunkedBy255) {
  for (int i = 0; i < 255; ++i)
    addMarker(HString(std::string("M") + std::to_string(i)), nullptr, {0});
  ASSERT_TRUE(exportRange(0, 0));
  C3DTest::File f = file();
  ASSERT_TRUE(f.ok()) << f.error;
  EXPECT_EQ(f.find("POINT", "LABELS")->dims, (std::vector<int>{64, 255}));
  ASSERT_NE(f.find("POINT", "LABELS2"), nullptr);
  EXPECT_EQ(f.find("POINT", "LABELS2")->dims, (std::vector<int>{64, 0}));
  EXPECT_EQ(f.find("POINT", "LABELS2")->dataSize, 0u);
  EXPECT_EQ(f.find("POINT", "LABELS3"), nullptr);

  addMarker("Last", nullptr, {0});
  ASSERT_TRUE(exportRange(0, 0));
  f = file();
  EXPECT_EQ(f.find("POINT", "LABELS")->dims, (std::vector<int>{64, 255}));
  EXPECT_EQ(f.paramStrings("POINT", "LABELS2"), std::vector<std::string>{"Last"});
  EXPECT_EQ(f.paramStrings("POINT", "LABELS").at(254), "M254");
  EXPECT_EQ(f.paramInt("POINT", "USED"), 256);
  EXPECT_EQ(f.bytes.size(), dataStart(f) + 256 * 16);
}

TEST_F(C3DExportTest, SubjectsComeFromLabelPrefixes) {
  Character* pBob = new Character("__Bob");
  g_db->addChild(nullptr, pBob);
  addMarker("LFHD", pBob);
  addMarker("RFHD", pBob);
  Marker* pLoose = addMarker("*123");
  pLoose->setUnlabeled(true);
  addMarker("X", nullptr)->setUnlabeled(true);
  addMarker("Ann:Head");
  addMarker("", nullptr);

  ASSERT_TRUE(exportRange(0, 1));
  C3DTest::File f = file();
  EXPECT_EQ(f.paramStrings("POINT", "LABELS"),
            (std::vector<std::string>{"__Bob:LFHD", "__Bob:RFHD", "*123", "*", "Ann:Head",
                                      "NamelessMarker"}));
  EXPECT_EQ(f.paramInt("SUBJECTS", "USED"), 2);
  EXPECT_EQ(f.paramInt("SUBJECTS", "USES_PREFIXES"), 1);
  EXPECT_EQ(f.paramInt("SUBJECTS", "IS_STATIC"), 0);
  EXPECT_EQ(f.find("SUBJECTS", "NAMES")->dims, (std::vector<int>{5, 2}));
  EXPECT_EQ(f.paramText("SUBJECTS", "NAMES"), "__BobAnn  ");
  EXPECT_EQ(f.find("SUBJECTS", "LABEL_PREFIXES")->dims, (std::vector<int>{6, 2}));
  EXPECT_EQ(f.paramText("SUBJECTS", "LABEL_PREFIXES"), "__Bob:Ann:  ");

  // Underscore removal: from the label's path, and from the names after the width is fixed.
  m_pExporter->setRemoveLeadingUnderscores(true);
  ASSERT_TRUE(exportRange(0, 1));
  f = file();
  EXPECT_EQ(f.paramStrings("POINT", "LABELS").at(0), "_Bob:LFHD");
  EXPECT_EQ(f.paramText("SUBJECTS", "NAMES"), "Bob Ann ");
  EXPECT_EQ(f.paramText("SUBJECTS", "LABEL_PREFIXES"), "Bob: Ann: ");

  // Without collapsing, or with unlabelled off, names are written as they are.
  m_pExporter->setCollapseToSubjects(false);
  m_pExporter->setWriteUnlabelled(false);
  ASSERT_TRUE(exportRange(0, 1));
  f = file();
  EXPECT_EQ(f.paramStrings("POINT", "LABELS"),
            (std::vector<std::string>{"LFHD", "RFHD", "*123", "X", "Ann:Head", "NamelessMarker"}));
  EXPECT_EQ(f.paramStrings("SUBJECTS", "NAMES"), std::vector<std::string>{"Ann"});
}

TEST_F(C3DExportTest, LongLabelIsWrittenWhole) {
  const std::string name(70, 'L');
  addMarker(HString(name), nullptr, {0});
  ASSERT_TRUE(exportRange(0, 0));
  const C3DTest::File f = file();
  ASSERT_TRUE(f.ok()) << f.error;
  EXPECT_EQ(f.paramText("POINT", "LABELS"), name);
}

TEST_F(C3DExportTest, FramesPast0xFFFEUseTheDruRecords) {
  addMarker("A", nullptr, {69998, 70000});
  ASSERT_TRUE(exportRange(69998, 70000));
  const C3DTest::File f = file();
  ASSERT_TRUE(f.ok()) << f.error;
  EXPECT_EQ(f.u16(6), 0xFFFF);
  EXPECT_EQ(f.u16(8), 0xFFFF); // the first frame's word, not the last frame
  const C3DTest::Parameter* pFirst = f.find("POINT", "DRU_FIRST_FRAME");
  const C3DTest::Parameter* pLast = f.find("POINT", "DRU_LAST_FRAME");
  ASSERT_TRUE(pFirst && pLast);
  EXPECT_EQ(pLast->type, 4);
  EXPECT_EQ(f.i32(pFirst->dataOffset), 69998);
  EXPECT_EQ(f.i32(pLast->dataOffset), 70000);
  EXPECT_EQ(f.paramInt("POINT", "FRAMES"), 3);
  EXPECT_EQ(f.bytes.size(), dataStart(f) + 3 * 16);

  // A first frame in 16 bits with a last frame past it: offset 8 repeats the first frame.
  addMarker("B", nullptr, {65530});
  ASSERT_TRUE(exportRange(65530, 65540));
  const C3DTest::File g = file();
  EXPECT_EQ(g.u16(6), 65530);
  EXPECT_EQ(g.u16(8), 65530);
  EXPECT_NE(g.find("POINT", "DRU_FIRST_FRAME"), nullptr);
}

TEST_F(C3DExportTest, GapTestLooksHalfAFrameEachWay) {
  const HTime half = time()->getTicksPerFrame() / 2;
  Marker* pMarker = new Marker("Off");
  pMarker->m_track.setKey(frame(1) + half, Vec3(1, 1, 1));     // ends of frames 1 and 2
  pMarker->m_track.setKey(frame(4) - half - 1, Vec3(2, 2, 2)); // inside frame 3 only
  g_db->addChild(nullptr, pMarker);
  ASSERT_TRUE(exportRange(0, 4));
  const C3DTest::File f = file();
  std::vector<bool> present;
  for (int fr = 0; fr < 5; ++fr)
    present.push_back(f.real(dataStart(f) + size_t(fr) * 16 + 12) == 0.0);
  EXPECT_EQ(present, (std::vector<bool>{false, true, true, true, false}));
}
