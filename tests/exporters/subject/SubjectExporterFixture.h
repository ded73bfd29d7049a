#pragma once
// A scene with one subject built from the test records, the four exporters, and reading back
// what they write.
#include "../../support/HostFixture.h"
#include "../../support/SubjectTestRecords.h"
#include "../RunExport.h"
#include "River/CoreOstraKMTIO/Reader.h"
#include "exporters/subject/KmfExporter.h"
#include "exporters/subject/KmrExporter.h"
#include "exporters/subject/KmsExporter.h"
#include "exporters/subject/KmtExporter.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/SubjectManager.h"
#include <memory>

namespace SubjectTest {

struct ExporterDeleter {
  void operator()(FileExporter* i_p) const { i_p->deleteThis(); }
};
template <typename T> using ExporterPtr = std::unique_ptr<T, ExporterDeleter>;

class SubjectExporterTest : public ::testing::Test {
protected:
  void SetUp() override {
    HostTest::resetScene(100.0, 10);
    g_interface.clear();
  }
  void TearDown() override { g_db->clearScene(); }

  /// Puts the test subject in the scene with its three setups.
  Character* addBob() {
    std::vector<std::string> errors;
    Character* pBob = AnvilCore::addSubjectToScene(bobRecords(), errors);
    EXPECT_TRUE(errors.empty()) << errors.front();
    return pBob;
  }

  /// Runs an export through the host's driver; true when it wrote the file.
  bool exportTo(FileExporter& i_rExporter, const std::string& i_rPath) {
    std::filesystem::remove(i_rPath);
    AnvilCore::ExportRequest request;
    request.path = i_rPath;
    std::string error;
    return AnvilCore::runExport(i_rExporter, request, error) == AnvilCore::EExportStatus::EOk;
  }

  /// Reads a subject file back; fails the test when it does not read.
  AnvilCore::SubjectRecords readBack(const std::string& i_rPath) {
    AnvilCore::SubjectRecords records;
    std::vector<std::string> errors, warnings;
    CoreOstraKMTIO::VReader reader;
    const uint32_t result = reader.Read(i_rPath, records.subject, records.application,
                                        records.subspace, errors, warnings, "Bob");
    EXPECT_EQ(result, 0u) << (errors.empty() ? std::string() : errors.front());
    return records;
  }

  ExporterPtr<KmfExporter> m_kmf{KmfExporter::createInstance()};
  ExporterPtr<KmtExporter> m_kmt{KmtExporter::createInstance()};
  ExporterPtr<KmsExporter> m_kms{KmsExporter::createInstance()};
  ExporterPtr<KmrExporter> m_kmr{KmrExporter::createInstance()};
};

} // namespace SubjectTest
