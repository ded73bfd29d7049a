// Bad files and bad subjects: the read or write fails with the message that names the fault.

#include "KmtTestSupport.h"

#include "DebugServices/LogCapture.h"

#include <gmock/gmock.h>

using namespace CoreOstraKMTIO;
using ::testing::Contains;
using ::testing::HasSubstr;

namespace {

/// A minimal document of `version` whose skeleton and marker set are given.
std::string Document(const std::string& version, const std::string& skeleton,
                     const std::string& markers, const std::string& rest = "",
                     const std::string& rootAttributes = "") {
  return "<KinematicModel VERSION=\"" + version + "\"" + rootAttributes + "><Skeleton>" + skeleton +
         "</Skeleton><MarkerSet><Markers>" + markers + "</Markers></MarkerSet>" + rest +
         "</KinematicModel>";
}

const std::string Body = "<Segment NAME=\"Body\"><JointFree NAME=\"Root\"/></Segment>";

std::string PointTarget(const std::string& attributes, bool withTemplate = true) {
  return "<TargetSet><Targets><TargetLocalPointToWorldPoint " + attributes + ">" +
         (withTemplate ? "<TargetLocalPointToWorldPointTemplate/>" : "") +
         "</TargetLocalPointToWorldPoint></Targets></TargetSet>";
}

void ExpectError(const std::string& text, const std::string& error) {
  const auto back = ReadString(text);
  EXPECT_EQ(back.m_Result, ResultFailed);
  EXPECT_THAT(back.m_Errors, Contains(error)) << text;
}

} // namespace

TEST(KmtBadFiles, ARefusedFileGivesItsOneErrorAndNothingElse) {
  const std::string rest = "<TargetSet/><Skin/><Unknown/>";
  for (const auto& text : {Document("3.6", Body, "", rest), Document("0.9", Body, "", rest),
                           Document("3.5", Body, "", rest, " DEVELOPMENT=\"1\" xmlns:xsi=\"x\"")}) {
    const auto back = ReadString(text);
    EXPECT_EQ(back.m_Result, ResultFailed);
    EXPECT_EQ(back.m_Errors.size(), 1u) << text;
    EXPECT_THAT(back.m_Warnings, ::testing::IsEmpty()) << text;
  }
}

TEST(KmtBadFiles, VersionsOutsideTheLanguageAndDevelopmentFilesAreRefused) {
  ExpectError(Document("3.6", Body, ""),
              "Cannot load KMT file with version 3.6, maximum supported version is 3.5");
  ExpectError(Document("0.9", Body, ""),
              "Cannot load KMT file with version 0.9, minimum supported version is 1.0");
  ExpectError(Document("3.5", Body, "", "", " DEVELOPMENT=\"false\""),
              "Attempting to load a KMT version which was saved while in development.");
  ExpectError(Document("three", Body, ""),
              "KinematicModel node's VERSION attribute could not be interpreted");
}

TEST(KmtBadFiles, UnknownNamesAndMissingAttributes) {
  ExpectError(Document("2.6", Body, "<Marker NAME=\"M\" SEGMENT=\"Nope\"/>"),
              "Marker M is using unknown segment Nope");
  const std::string marker = "<Marker NAME=\"M\"/>";
  ExpectError(
      Document("3.5", Body, marker,
               PointTarget("MARKER=\"Nope\" SEGMENT=\"Body\" POSITION=\"0 0 0\" WEIGHT=\"1\" "
                           "HIDDEN=\"false\"")),
      "Target is using unknown marker Nope");
  ExpectError(Document("3.5", Body, marker,
                       PointTarget("MARKER=\"M\" SEGMENT=\"Nope\" POSITION=\"0 0 0\" WEIGHT=\"1\" "
                                   "HIDDEN=\"false\"")),
              "Target is using unknown segment Nope");
  ExpectError(
      Document("3.5", Body, marker,
               PointTarget("MARKER=\"M\" SEGMENT=\"Body\" POSITION=\"0 0 0\" WEIGHT=\"1\"")),
      "TargetLocalPointToWorldPoint element missing required attribute HIDDEN");
  ExpectError(Document("3.5", Body, marker,
                       PointTarget("MARKER=\"M\" SEGMENT=\"Body\" POSITION=\"0 0 0\" WEIGHT=\"1\" "
                                   "HIDDEN=\"false\"",
                                   false)),
              "/KinematicModel/TargetSet/Targets/TargetLocalPointToWorldPoint element must have a "
              "minimum of 1 TargetLocalPointToWorldPointTemplate child elements");
  ExpectError(Document("3.5", Body, marker,
                       PointTarget("MARKER=\"M\" SEGMENT=\"Body\" POSITION=\"0 0 0\" WEIGHT=\"1\" "
                                   "HIDDEN=\"false\" GAUSSIAN=\"true\"")),
              "Gaussian target did not supply a COVARIANCE");
  ExpectError("<KinematicModel VERSION=\"3.0\"><Skeleton>" + Body +
                  "</Skeleton><MarkerSet><Markers>" + marker +
                  "</Markers><Sticks><Stick MARKER1=\"M\" MARKER2=\"Gone\"/></Sticks>"
                  "</MarkerSet></KinematicModel>",
              "Sticks is using unknown marker Gone");
  ExpectError(Document("3.0", Body, marker + marker),
              "Marker M has encountered an ID hash collision");
  ExpectError(Document("3.0", "<Segment/>", ""), "Segment element missing required attribute NAME");
}

TEST(KmtBadFiles, JointChoiceIsExact) {
  ExpectError(Document("3.5", "<Segment NAME=\"S\"/>", ""),
              "/KinematicModel/Skeleton/Segment element must have a one of the following child "
              "elements: JointBall JointDummy JointFree JointHardySpicer JointHinge JointSlider");
  ExpectError(Document("3.5", "<Segment NAME=\"S\"><JointBall/><JointDummy/></Segment>", ""),
              "/KinematicModel/Skeleton/Segment element cannot have both a JointBall and a "
              "JointDummy child element");
  ExpectError(
      Document("3.5",
               "<Segment NAME=\"S\"><JointHardySpicer NAME=\"J\" AXIS-PAIR=\"1 0 0 1 0 0\"/>"
               "</Segment>",
               ""),
      "Hardy-Spicer joint 'J' has non orthogonal axes");
  ExpectError(
      Document("3.5", "<Segment NAME=\"S\"><JointHinge NAME=\"J\" AXIS=\"1 0\"/></Segment>", ""),
      "Hinge joint 'J' has invalid AXIS, expected 3 elements got 2");
}

TEST(KmtBadFiles, RotationTargetsFollowTheirVersion) {
  const std::string rotation =
      "<TargetSet><Targets><TargetLocalRotationToWorldRotation SEGMENT=\"Body\" HIDDEN=\"false\" "
      "WEIGHT=\"2\" ROTATION-OBSERVATION=\"Imu\" %1%/></Targets></TargetSet>";
  auto withAxes = [&](const std::string& axes) {
    std::string text = rotation;
    text.replace(text.find("%1%"), 3, axes);
    return Document("3.5", Body, "", text);
  };
  const auto v33 = ReadString(Document(
      "3.3", Body, "", withAxes("").substr(0, 0) + [&] {
        std::string text = rotation;
        text.replace(text.find("%1%"), 3, "");
        return text;
      }()));
  ASSERT_EQ(v33.m_Result, ResultOk);
  EXPECT_EQ(v33.m_Records.m_Subject.m_Targets[0].m_Weight, 1.0);
  EXPECT_THAT(v33.m_Warnings, Contains("Ignoring WEIGHT attribute in "
                                       "TargetLocalRotationToWorldRotation element. Not supported "
                                       "in files with version 3.3"));
  const auto hinge = ReadString(withAxes("AXIS=\"0 1 0\""));
  ASSERT_EQ(hinge.m_Result, ResultOk);
  EXPECT_EQ(hinge.m_Records.m_Subject.m_Targets[0].m_Weight, 2.0);
  EXPECT_EQ(hinge.m_Records.m_Subject.m_Rotations[0].m_Name, "Imu");
  EXPECT_EQ(hinge.m_Records.m_Subject.m_Targets[0].m_RotationCalibrationBehaviour,
            CoreOstraTypes::VTargetTypeBase::EHingeLike);
  ExpectError(withAxes("AXIS=\"0 1 0\" AXIS-PAIR=\"1 0 0 0 1 0\""),
              " Target '' AXIS and AXIS-PAIR are mutually exclusive");
  ExpectError(withAxes("AXIS-PAIR=\"1 0 0 1 1 0\" NAME=\"R\""),
              " Target 'R'AXIS-PAIR has non-orthogonal axes");
  ExpectError(withAxes("AXIS=\"0 0 0\" NAME=\"R\""),
              " Target 'R' AXIS or AXIS-PAIR has a 0-magnitude vector");
  ExpectError(Document("3.5", Body, "",
                       "<TargetSet><Targets><TargetLocalDirectionToWorldDirection SEGMENT=\"Body\" "
                       "HIDDEN=\"false\" WEIGHT=\"1\" DIRECTION-OBSERVATION=\"D\" DIRECTION=\"0 0 "
                       "2\"/></Targets></TargetSet>"),
              "Direction target state has to be a unit vector");
}

TEST(KmtBadFiles, BrokenTextAndMissingFiles) {
  ExpectError("<KinematicModel><Skeleton>", "Failed to read file");
  ExpectError(std::string(5000, '<') + "a>", "Failed to read file");
  ExpectError(Document("3.5", "<Segment NAME=\"S\" BOUNDS=\"1 2\"><JointDummy/></Segment>", ""),
              "Segment node's BOUNDS attribute could not be interpreted");
  ExpectError(Document("3.5",
                       "<Segment NAME=\"S\"><JointFree PRE-POSITION=\"0 0 0\"><JointTemplate "
                       "PRE-POSITION=\"Missing 0 0\"/></JointFree></Segment>",
                       ""),
              "Failed validating one or more Expressions");

  VScratch scratch;
  const auto missing = ReadFile(scratch / "none.kmt");
  EXPECT_EQ(missing.m_Result, ResultFailed);
  EXPECT_EQ(missing.m_Errors,
            std::vector<std::string>{"Error opening file '" + (scratch / "none.kmt").string() +
                                     "' for reading"});
  std::istringstream closed;
  closed.setstate(std::ios::failbit);
  VRichSubject records;
  std::vector<std::string> errors, warnings;
  EXPECT_EQ(VReader().Read(closed, records.m_Subject, records.m_AppData, records.m_Subspace, errors,
                           warnings),
            ResultFailed);
  EXPECT_EQ(errors, std::vector<std::string>{"Could not open file"});
}

TEST(KmtBadSubjects, WriterReportsEveryFaultAndLeavesTheFileAlone) {
  VScratch scratch;
  const auto path = scratch / "kept.kmt";
  std::ofstream(path.string()) << "previous";
  auto rich = MakeRichSubject();
  rich.m_Subject.m_Segments[1].m_Bounds = {"a b", "0", "0", "0", "0", "0"};
  rich.m_Subject.m_Targets[6].m_RotationTargetOrientation.clear();
  rich.m_Subject.m_Targets[7].m_RotationTargetOrientation = {1, 0, 0};
  std::vector<std::string> messages;
  EXPECT_EQ(Write(path, rich.m_Subject, rich.m_AppData, rich.m_Subspace, &messages, 16),
            ResultFailed);
  EXPECT_THAT(messages, Contains("Node BOUNDS attribute value a b contains spaces."));
  EXPECT_THAT(messages, Contains("Target 'T7' requires a target orientation"));
  EXPECT_THAT(messages, Contains("Target 'T8' should not have a target orientation"));
  EXPECT_EQ(FileText(path), "previous");

  rich = MakeRichSubject();
  rich.m_Subject.m_Segments[2].m_PreTranslation[2] = "Unknown";
  {
    ZMT::VLogCapture capture;
    EXPECT_EQ(Write(path, rich.m_Subject, rich.m_AppData, rich.m_Subspace, nullptr, 16),
              ResultFailed);
    const auto records = capture.Records();
    ASSERT_FALSE(records.empty());
    EXPECT_EQ(records[0].Channel, "KMTIO");
    EXPECT_EQ(records[0].File, "CoreOstraKMTIO/Writer");
    EXPECT_THAT(records[0].Message, HasSubstr("Could not evaluate expression 'Unknown'"));
  }
  rich = MakeRichSubject();
  rich.m_Subspace.m_PcaControlledParams[0].m_JointParametersIndices = {7, 8};
  EXPECT_EQ(Write(path, rich.m_Subject, rich.m_AppData, rich.m_Subspace, &messages, 16),
            ResultFailed);
  EXPECT_THAT(messages, Contains("Failed to build a generic subspace for chunk 'Leg'"));

  rich = MakeRichSubject();
  EXPECT_EQ(Write(scratch / "no" / "dir.kmt", rich.m_Subject, rich.m_AppData, rich.m_Subspace,
                  &messages, 16),
            ResultFailed);
  EXPECT_EQ(messages, std::vector<std::string>{"Error opening file '" +
                                               (scratch / "no" / "dir.kmt").string() +
                                               "' for writing: the folder '" +
                                               (scratch / "no").string() + "' does not exist"});
}

TEST(KmtSchema, IsAValidSchemaThatDeclaresEveryElementOnce) {
  VScratch scratch;
  const auto schema = scratch / "kmt.xsd";
  ASSERT_TRUE(VReader().WriteSchema(schema));
  const std::string text = FileText(schema);
  for (const char* element : {"KinematicModel",
                              "Parameters",
                              "StaticParameter",
                              "Parameter",
                              "Skeleton",
                              "Segment",
                              "JointBall",
                              "JointDummy",
                              "JointFree",
                              "JointHardySpicer",
                              "JointHinge",
                              "JointSlider",
                              "JointTemplate",
                              "MarkerSet",
                              "Markers",
                              "Marker",
                              "MarkerTemplate",
                              "Sticks",
                              "Stick",
                              "TargetSet",
                              "Targets",
                              "TargetLocalLineToWorldPoint",
                              "TargetLocalPlaneToWorldPoint",
                              "TargetLocalPointToWorldPoint",
                              "TargetRigidBody",
                              "TargetLocalRotationToWorldRotation",
                              "TargetLocalDirectionToWorldDirection",
                              "TargetLocalPointToWorldPointTemplate",
                              "TargetLocalLineToWorldPointTemplate",
                              "TargetLocalPlaneToWorldPointTemplate",
                              "RigidBodyMarker",
                              "Skin",
                              "SubjectDynamicSubspace",
                              "PcaControlledParams",
                              "PrincipalComponent"}) {
    const std::string declaration = "<xsd:element name=\"" + std::string(element) + "\">";
    const auto first = text.find(declaration);
    EXPECT_NE(first, std::string::npos) << element;
    EXPECT_EQ(text.find(declaration, first + 1), std::string::npos) << element;
  }
  for (const char* type : {"TYPE_DRAW-STYLE", "TYPE_DRAW-SHADING", "TYPE_EULER-ORDER",
                           "TYPE_QUANTITY", "TYPE_STATUS", "TYPE_TARGET-DRAW-STYLE"}) {
    EXPECT_NE(text.find("<xsd:simpleType name=\"" + std::string(type) + "\">"), std::string::npos);
  }
  EXPECT_NE(text.find("href=\"Ostra_KMT_Schema-HTML.xsl\""), std::string::npos);
  // xmllint compiles the schema before it validates: a minimal file passes, a bad one doesn't.
  const auto minimal = scratch / "minimal.kmt";
  std::ofstream(minimal.string()) << Document("3.5", Body,
                                              "<Marker NAME=\"M\" STATUS=\"missing\"/>");
  std::string output;
  EXPECT_EQ(Xmllint("--noout --schema " + schema.string() + " " + minimal.string(), output), 0)
      << output;
  std::ofstream(minimal.string()) << Document("3.5", Body, "<Marker NAME=\"M\" STATUS=\"gone\"/>");
  EXPECT_NE(Xmllint("--noout --schema " + schema.string() + " " + minimal.string(), output), 0);
  EXPECT_THAT(output, Not(HasSubstr("failed to compile")));
}
