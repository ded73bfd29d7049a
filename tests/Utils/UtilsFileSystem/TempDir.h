#pragma once
// A fresh directory under the system's temporary folder, removed with its content at the end.

#include <boost/filesystem.hpp>

class VTempDir {
public:
  VTempDir()
      : m_Path(boost::filesystem::temp_directory_path() /
               boost::filesystem::unique_path("anvil-fs-%%%%-%%%%-%%%%")) {
    boost::filesystem::create_directories(m_Path);
  }
  ~VTempDir() {
    boost::system::error_code error;
    boost::filesystem::remove_all(m_Path, error);
  }
  const boost::filesystem::path& Path() const { return m_Path; }
  boost::filesystem::path operator/(const std::string& name) const { return m_Path / name; }

private:
  boost::filesystem::path m_Path;
};
