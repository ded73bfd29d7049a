// Writes the seed files of fuzz_mcp_reader (corpus/mcp_reader): recordings in the exporter's
// layout, with and without trajectory table, track sets, static items, cameras and a subject.
#include "AnvilCore/demo/DemoWalk.h"
#include "McpTestFile.h"
#include <cstdio>
#include <string>

namespace {
void save(const std::string& i_path, const std::vector<uint8_t>& i_bytes) {
  std::FILE* pFile = std::fopen(i_path.c_str(), "wb");
  if (!pFile || std::fwrite(i_bytes.data(), 1, i_bytes.size(), pFile) != i_bytes.size())
    std::perror(i_path.c_str());
  if (pFile) std::fclose(pFile);
}
} // namespace

int main(int argc, char** argv) {
  const std::string folder = argc > 1 ? argv[1] : ".";
  for (int seed = 0; seed < 3; ++seed) {
    McpTestFile file;
    file.ticksPerFrame = 135000000 / (60 * (seed + 1));
    file.firstFrame = seed * 7;
    file.table = {{0, "Sam:LFHD"}, {1, "Sam:RFHD"}, {2, "*4"}, {5, "Loose"}};
    for (int f = 0; f < 3 + 2 * seed; ++f) {
      std::vector<McpTestFile::Point> points = {
          {0, {1.0 * f, 2, 3}}, {2, {4, 5.0 * f, 6}, 0.0f}, {5, {7, 8, 9.0 * f}}};
      if (f % 2 == 0) points.push_back({1, {-1, -2, -3}});
      file.frames.push_back(points);
    }
    file.withTable = seed != 1;
    file.withTrackSet = seed != 2;
    file.withStaticItems = seed != 2;
    if (seed == 0) file.orientation = std::array<double, 4>{0.70710678, 0, 0, 0.70710678};
    file.cameras = {mcpTestCamera(1), mcpTestCamera(2, seed != 0)};
    if (seed != 1) {
      AnvilCore::SubjectRecords sam = AnvilCore::demoWalkRecords();
      sam.subject.m_Name = "Sam";
      file.subjects.push_back(sam);
    }
    save(folder + "/seed" + std::to_string(seed + 1) + ".mcp", file.build());
  }
  return 0;
}
