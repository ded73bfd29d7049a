#pragma once
// A scene built in code and one C3D export of it into memory, the way the host drives it.
#include "AnvilCore/ExportDriver.h"
#include "C3DTestFile.h"
#include "exporters/trajectory/C3DExporter.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/NLEClip.h"
#include <cstdio>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <vector>

class C3DExportTest : public ::testing::Test {
protected:
  void SetUp() override {
    g_db->clearScene();
    time()->setFrameRate(120.0);
    time()->setTimecodeMode(ETimecodeModeNone);
    g_db->setLogSink([this](HLogLevel i_level, const std::string& i_text) {
      m_log.push_back((i_level == HLogLevel::EError ? "E: " : "W: ") + i_text);
    });
    m_pExporter.reset(C3DExporter::createInstance());
  }
  void TearDown() override {
    g_db->clearScene();
    g_db->setLogSink(nullptr);
  }

  static HTimeManager* time() { return g_db->getTimeManager(); }
  static HTime frame(int i_frame) { return time()->getTicksPerFrame() * i_frame; }

  /// A marker with a key at each given frame, at position base + frame * (1, 2, 3).
  Marker* addMarker(const HString& i_rName, Module* i_pParent = nullptr,
                    std::vector<int> i_frames = {0, 1, 2, 3, 4}, Vec3 i_base = Vec3(10, 20, 30)) {
    Marker* pMarker = new Marker(i_rName);
    for (int f : i_frames)
      pMarker->m_track.setKey(frame(f), Vec3(i_base.x + f, i_base.y + 2 * f, i_base.z + 3 * f));
    g_db->addChild(i_pParent, pMarker);
    return pMarker;
  }

  /// Exports every module the exporter takes over [first, last] frames; false when `write`
  /// refused. The file's bytes land in `m_bytes`.
  bool exportRange(int i_first, int i_last) {
    return exportTicks(HTimeRange(frame(i_first), frame(i_last)));
  }
  bool exportTicks(const HTimeRange& i_rRange) {
    FILE* pFile = std::tmpfile();
    m_pExporter->setStream(pFile);
    TSimpleArray<Module*>& modules = m_pExporter->moduleList();
    modules.removeAll();
    for (Module* p : g_db->getModules())
      if (AnvilCore::dataTypeOf(p) & m_pExporter->getDataType()) modules.add(p);
    m_pExporter->setTimeRange(i_rRange);
    m_pExporter->reset();
    const bool ok = m_pExporter->write();
    std::fflush(pFile);
    std::fseek(pFile, 0, SEEK_END);
    m_bytes.resize(size_t(std::ftell(pFile)));
    std::rewind(pFile);
    if (!m_bytes.empty()) {
      EXPECT_EQ(std::fread(m_bytes.data(), 1, m_bytes.size(), pFile), m_bytes.size());
    }
    std::fclose(pFile);
    m_pExporter->setStream(nullptr);
    return ok;
  }
  C3DTest::File file() const { return C3DTest::File(m_bytes); }

  /// Start of the frames and the size of one frame as the header and parameters describe them.
  static size_t dataStart(const C3DTest::File& i_rFile) {
    return size_t(i_rFile.u16(16) - 1) * 512;
  }

  std::unique_ptr<C3DExporter, void (*)(C3DExporter*)> m_pExporter{nullptr, [](C3DExporter* p) {
                                                                     if (p) p->deleteThis();
                                                                   }};
  std::vector<uint8_t> m_bytes;
  std::vector<std::string> m_log;
};
