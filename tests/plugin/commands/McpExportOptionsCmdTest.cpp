#include "CommandTestSupport.h"
#include "exporters/mcp/AnvilMCPExporter.h"
#include <cstring>

namespace {

using McpExportOptionsCmdTest = ExporterCommandTest<AnvilMCPExporter>;

TEST_F(McpExportOptionsCmdTest, DeclaresItsOptionsInOrder) {
  expectDeclaration("mcpExportOptions", "Set MCP Export Options",
                    {{"exportCameras", Variable::EBool},
                     {"exportSubjects", Variable::EBool},
                     {"exportCameraData", Variable::EBool},
                     {"exportSubjectMotion", Variable::EBool}});
}

TEST_F(McpExportOptionsCmdTest, EachOptionSetsItsOwnFlag) {
  EXPECT_TRUE(run("mcpExportOptions -exportCameras false"));
  EXPECT_FALSE(m_pExporter->getExportCameras());
  EXPECT_TRUE(m_pExporter->getExportSubjects());
  EXPECT_TRUE(run("mcpExportOptions -exportSubjects off -exportCameras toggle"));
  EXPECT_TRUE(m_pExporter->getExportCameras());
  EXPECT_FALSE(m_pExporter->getExportSubjects());
  EXPECT_TRUE(run("mcpExportOptions -exportCameraData 0"));
  EXPECT_FALSE(m_pExporter->getExportCamerasDynamicData());
  EXPECT_TRUE(m_pExporter->getExportSubjectsDynamicData());
  EXPECT_TRUE(run("mcpExportOptions -exportSubjectMotion false -exportCameraData true"));
  EXPECT_FALSE(m_pExporter->getExportSubjectsDynamicData());
  EXPECT_TRUE(m_pExporter->getExportCamerasDynamicData());
  EXPECT_TRUE(log().empty());

  // The four flags travel as one 32-bit block.
  std::uint32_t block = 0;
  ASSERT_TRUE(m_pExporter->getOptions(&block));
  const McpExportOptions expected{true, false, true, false};
  EXPECT_EQ(std::memcmp(&block, &expected, sizeof block), 0);
}

TEST_F(McpExportOptionsCmdTest, FailsWithoutExporter) {
  g_db->getFileExporterMgr()->clear();
  EXPECT_FALSE(run("mcpExportOptions -exportCameras true"));
  ASSERT_EQ(log().size(), 1u);
  EXPECT_EQ(log()[0], "error: Could not find MCP exporter.");
}

} // namespace
