#pragma once
#include "plugin/host/Plugin.h"
#include "plugin/host/TSimpleArray.h"

class FileExporter;

/// Contributes the module's file exporters. The exporters belong to the host once loaded; the
/// plug-in releases only its array.
class AnvilFileExportersPlugin : public ExporterPluginBase {
public:
  static AnvilFileExportersPlugin* createInstance();

  HString getPluginVendor() const override { return "Ostra"; }
  HString getPluginAuthor() const override { return "Ostra"; }
  HString getPluginDate() const override { return "Jun 30 2020"; }
  HString getPluginVersion() const override { return "1.0"; }
  HString getPluginName() const override { return "File Exporters"; }
  HString getPluginApiText() const override { return "2.00"; }
  /// Creates every exporter in the host's listing order.
  bool loadExporters() override;
  bool unloadExporters() override { return true; }
  int getNumExporters() const override { return m_exporters.getCount(); }
  FileExporter* getExporter(int i_index) const override { return m_exporters[i_index]; }

private:
  AnvilFileExportersPlugin() : m_exporters(16) {}
  TSimpleArray<FileExporter*> m_exporters;
};
