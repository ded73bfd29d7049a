#pragma once
#include "HObject.h"
#include "HString.h"

class Command;
class FileExporter;

/// Base of every plug-in object a module hands to the host.
class ANVIL_HOST_API DruCorePluginBase : public HObject {
public:
  static const HRuntimeClass s_classDruCorePluginBase;
  const HRuntimeClass* getRuntimeClass() const override { return &s_classDruCorePluginBase; }
  virtual HString getPluginVendor() const = 0;
  virtual HString getPluginAuthor() const = 0;
  virtual HString getPluginDate() const = 0;
  virtual HString getPluginVersion() const = 0;
  virtual HString getPluginName() const = 0;
  virtual HString getPluginApiText() const = 0;
};

/// A plug-in that contributes file exporters.
class ANVIL_HOST_API ExporterPluginBase : public DruCorePluginBase {
public:
  static const HRuntimeClass s_classExporterPluginBase;
  const HRuntimeClass* getRuntimeClass() const override { return &s_classExporterPluginBase; }
  virtual bool loadExporters() = 0;
  virtual bool unloadExporters() = 0;
  virtual int getNumExporters() const = 0;
  virtual FileExporter* getExporter(int i_index) const = 0;
};

/// A plug-in that contributes script commands.
class ANVIL_HOST_API CommandPluginBase : public DruCorePluginBase {
public:
  static const HRuntimeClass s_classCommandPluginBase;
  const HRuntimeClass* getRuntimeClass() const override { return &s_classCommandPluginBase; }
  virtual bool loadCommands() = 0;
  virtual bool unloadCommands() = 0;
  virtual int getNumCommands() const = 0;
  virtual Command* getCommand(int i_index) const = 0;
  // The host's own operations; this host has no script or control-stream commands of its own.
  virtual bool loadScriptCommands() { return true; }
  virtual int getNumScriptCommands() const { return 0; }
  virtual Command* getScriptCommand(int) const { return nullptr; }
  virtual int getNumControlStreamCommands() const { return 0; }
  virtual Command* getControlStreamCommand(int) const { return nullptr; }
  virtual int getNumControlStreamEvents() const { return 0; }
  virtual void* getControlStreamEvent(int) const { return nullptr; }
};
