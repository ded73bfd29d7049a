#pragma once
// Writing and reading subjects through files in a scratch folder, and record comparison that
// allows for rounding in values the language stores in another form.

#include "RichSubject.h"
#include "River/CoreOstraKMTIO/Reader.h"
#include "River/CoreOstraKMTIO/Writer.h"

#include <boost/filesystem.hpp>
#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <fstream>
#include <sstream>

/// A scratch folder removed at the end.
class VScratch {
public:
  VScratch()
      : m_Path(boost::filesystem::temp_directory_path() /
               boost::filesystem::unique_path("anvil-kmt-%%%%-%%%%")) {
    boost::filesystem::create_directories(m_Path);
  }
  ~VScratch() {
    boost::system::error_code error;
    boost::filesystem::remove_all(m_Path, error);
  }
  boost::filesystem::path operator/(const std::string& name) const { return m_Path / name; }

private:
  boost::filesystem::path m_Path;
};

/// The result of one read.
struct VReadBack {
  std::uint32_t m_Result = 0;
  VRichSubject m_Records;
  std::vector<std::string> m_Errors;
  std::vector<std::string> m_Warnings;
};

inline VReadBack ReadFile(const boost::filesystem::path& path, const std::string& name = "Rich") {
  VReadBack back;
  CoreOstraKMTIO::VReader reader;
  back.m_Result = reader.Read(path, back.m_Records.m_Subject, back.m_Records.m_AppData,
                              back.m_Records.m_Subspace, back.m_Errors, back.m_Warnings, name);
  return back;
}

inline VReadBack ReadString(const std::string& text) {
  VReadBack back;
  CoreOstraKMTIO::VReader reader;
  back.m_Result =
      reader.ReadText(text, back.m_Records.m_Subject, back.m_Records.m_AppData,
                      back.m_Records.m_Subspace, back.m_Errors, back.m_Warnings, "Rich");
  return back;
}

inline std::string FileText(const boost::filesystem::path& path) {
  std::ifstream in(path.string());
  std::stringstream text;
  text << in.rdbuf();
  return text.str();
}

/// Runs xmllint; returns its exit code and leaves its messages in `o_rOutput`.
inline int Xmllint(const std::string& arguments, std::string& o_rOutput) {
  const std::string command = "xmllint " + arguments + " 2>&1";
  FILE* pPipe = popen(command.c_str(), "r");
  if (!pPipe) return -1;
  char buffer[4096];
  o_rOutput.clear();
  for (std::size_t n; (n = std::fread(buffer, 1, sizeof buffer, pPipe)) > 0;)
    o_rOutput.append(buffer, n);
  return WEXITSTATUS(pclose(pPipe));
}

/// Compares near-equal doubles, then copies the expected values over so that an exact record
/// comparison can follow.
template <class A> void AlignNear(A& actual, const A& expected, const char* what) {
  ASSERT_EQ(actual.size(), expected.size()) << what;
  for (std::size_t i = 0; i < actual.size(); ++i) {
    EXPECT_NEAR(actual[i], expected[i], 1e-9) << what << " [" << i << "]";
    actual[i] = expected[i];
  }
}
