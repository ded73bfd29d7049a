#include "ModuleLoader.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/Plugin.h"
#include <cstdio>
#include <dlfcn.h>
#include <filesystem>
#include <unistd.h>

namespace anvil {

namespace {
constexpr unsigned int kHostApiVersion = 0x80000;
const char* const kModuleFile = "libAnvilFileExport.so";

std::filesystem::path programFolder() {
  std::error_code ec;
  const std::filesystem::path exe = std::filesystem::read_symlink("/proc/self/exe", ec);
  return ec ? std::filesystem::current_path() : exe.parent_path();
}
} // namespace

std::string LoadedModule::defaultPath() {
  const std::filesystem::path folder = programFolder();
  for (const std::filesystem::path& candidate :
       {folder / kModuleFile, folder / ".." / "lib" / kModuleFile}) {
    std::error_code ec;
    if (std::filesystem::exists(candidate, ec))
      return std::filesystem::weakly_canonical(candidate).string();
  }
  return (folder / kModuleFile).string();
}

bool LoadedModule::load(const std::string& i_path, std::string& o_rError) {
  m_path = i_path.empty() ? defaultPath() : i_path;
  m_pHandle = ::dlopen(m_path.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (!m_pHandle) {
    const char* why = ::dlerror();
    o_rError = "cannot load export module '" + m_path + "': " + (why ? why : "unknown error");
    return false;
  }
  using ApiVersionFn = unsigned int (*)();
  using NumPluginsFn = unsigned int (*)();
  using GetPluginFn = DruCorePluginBase* (*)(int);
  auto apiVersion = reinterpret_cast<ApiVersionFn>(::dlsym(m_pHandle, "apiVersion"));
  auto getNumPlugins = reinterpret_cast<NumPluginsFn>(::dlsym(m_pHandle, "getNumPlugins"));
  auto getPlugin = reinterpret_cast<GetPluginFn>(::dlsym(m_pHandle, "getPlugin"));
  if (!apiVersion || !getNumPlugins || !getPlugin) {
    o_rError =
        "'" + m_path + "' is not an export module (apiVersion, getNumPlugins or getPlugin missing)";
    return false;
  }
  if (const unsigned int version = apiVersion(); version != kHostApiVersion) {
    char text[160];
    std::snprintf(text, sizeof text,
                  "export module API version 0x%X is not supported (expected 0x%X)", version,
                  kHostApiVersion);
    o_rError = "'" + m_path + "': " + text;
    return false;
  }
  for (unsigned int i = 0, n = getNumPlugins(); i < n; ++i) {
    DruCorePluginBase* pPlugin = getPlugin(static_cast<int>(i));
    if (!pPlugin) continue;
    if (pPlugin->isKindOf(&ExporterPluginBase::s_classExporterPluginBase) && !m_pExporters) {
      m_pExporters = static_cast<ExporterPluginBase*>(pPlugin);
    } else if (pPlugin->isKindOf(&CommandPluginBase::s_classCommandPluginBase) && !m_pCommands) {
      m_pCommands = static_cast<CommandPluginBase*>(pPlugin);
    } else {
      pPlugin->deleteThis();
    }
  }
  if (!m_pExporters) {
    o_rError = "'" + m_path + "' holds no exporter plug-in";
    return false;
  }
  m_pExporters->loadExporters();
  FileExporterMgr* pMgr = g_db->getFileExporterMgr();
  for (int i = 0; i < m_pExporters->getNumExporters(); ++i)
    pMgr->registerExporter(m_pExporters->getExporter(i));
  if (m_pCommands) m_commands.addFromPlugin(*m_pCommands);
  return true;
}

LoadedModule::~LoadedModule() {
  g_db->getFileExporterMgr()->clear();
  m_commands.clear();
  if (m_pExporters) m_pExporters->deleteThis();
  if (m_pCommands) m_pCommands->deleteThis();
  // The module stays mapped until exit: objects it made may still be referenced by the host.
}

} // namespace anvil
