#pragma once
// A stage of one layer: prims with attributes (default values and time samples) and
// relationships, the layer's metadata, and export as USDA text.

#include "usd/UsdTypes.h"

#include <cstdio>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace UtilsFileSystem {
class VReplacingFile;
}

namespace AnvilUsd {

class VAttribute {
public:
  VAttribute(std::string name, bool uniform) : m_Name(std::move(name)), m_Uniform(uniform) {}

  const std::string& Name() const { return m_Name; }
  bool IsUniform() const { return m_Uniform; }
  /// Sets the default value.
  void Set(VValue value) { m_Default = std::move(value); }
  /// Sets the value at a time code, replacing a sample at the same time. A uniform attribute
  /// takes no samples: false.
  bool Set(VValue value, double time);

  const std::optional<VValue>& Default() const { return m_Default; }
  struct VSample {
    double m_Time;
    VValue m_Value;
  };
  const std::vector<VSample>& Samples() const { return m_Samples; }
  bool IsAuthored() const { return m_Default || !m_Samples.empty(); }

private:
  std::string m_Name;
  bool m_Uniform;
  std::optional<VValue> m_Default;
  std::vector<VSample> m_Samples;
};

class VRelationship {
public:
  explicit VRelationship(std::string name) : m_Name(std::move(name)) {}
  const std::string& Name() const { return m_Name; }
  void SetTargets(std::vector<std::string> paths) { m_Targets = std::move(paths); }
  const std::vector<std::string>& Targets() const { return m_Targets; }

private:
  std::string m_Name;
  std::vector<std::string> m_Targets;
};

class VPrim {
public:
  VPrim(std::string path, std::string name, std::string typeName)
      : m_Path(std::move(path)), m_Name(std::move(name)), m_TypeName(std::move(typeName)) {}

  const std::string& Path() const { return m_Path; }
  const std::string& Name() const { return m_Name; }
  const std::string& TypeName() const { return m_TypeName; }
  void SetTypeName(std::string typeName) { m_TypeName = std::move(typeName); }

  /// The attribute of that name, created with the type's variability when new.
  VAttribute& Attribute(const std::string& name, bool uniform);
  VRelationship& Relationship(const std::string& name);
  /// Adds an applied API schema once ("SkelBindingAPI").
  void ApplyApiSchema(const std::string& name);

  const std::vector<std::unique_ptr<VAttribute>>& Attributes() const { return m_Attributes; }
  const std::vector<std::unique_ptr<VRelationship>>& Relationships() const {
    return m_Relationships;
  }
  const std::vector<std::string>& ApiSchemas() const { return m_ApiSchemas; }
  const std::vector<std::unique_ptr<VPrim>>& Children() const { return m_Children; }
  VPrim* Child(const std::string& name) const;
  VPrim& AddChild(const std::string& name, const std::string& typeName);

private:
  std::string m_Path;
  std::string m_Name;
  std::string m_TypeName;
  std::vector<std::unique_ptr<VAttribute>> m_Attributes;
  std::vector<std::unique_ptr<VRelationship>> m_Relationships;
  std::vector<std::string> m_ApiSchemas;
  std::vector<std::unique_ptr<VPrim>> m_Children;
};

class VStage {
public:
  /// A new stage whose layer will be written at `path`. Null when the file could not be
  /// created there, with the reason in `o_rError`.
  static std::unique_ptr<VStage> CreateNew(const std::string& path, std::string& o_rError);
  /// A stage that lives only in memory.
  static std::unique_ptr<VStage> CreateInMemory();
  ~VStage();

  /// Defines a prim of a type at an absolute path ("/Walker/Anim"); ancestors that do not exist
  /// yet are defined without a type. Null for a path that is not absolute or has an element that
  /// is not an identifier.
  VPrim* DefinePrim(const std::string& path, const std::string& typeName);
  VPrim* GetPrim(const std::string& path) const;
  const std::vector<std::unique_ptr<VPrim>>& RootPrims() const { return m_Roots; }

  void SetFramesPerSecond(double value) { m_FramesPerSecond = value; }
  void SetTimeCodesPerSecond(double value) { m_TimeCodesPerSecond = value; }
  void SetStartTimeCode(double value) { m_StartTimeCode = value; }
  void SetEndTimeCode(double value) { m_EndTimeCode = value; }
  void SetMetersPerUnit(double value) { m_MetersPerUnit = value; }
  /// "Y" or "Z"; any other token is refused.
  bool SetUpAxis(const std::string& axis);
  void SetDocumentation(std::string text) { m_Documentation = std::move(text); }

  /// The layer as USDA text. With `addSourceFileComment` the documentation gains the line that
  /// names the root layer the stage was composed from.
  std::string ExportToString(bool addSourceFileComment) const;
  /// Writes the layer as USDA text at `path` through a temporary sibling; false with the reason
  /// when it could not be written, and then nothing at `path` changed.
  bool Export(const std::string& path, bool addSourceFileComment, std::string& o_rError);

  /// The root layer's path, absolute; empty for a stage in memory.
  const std::string& RootLayerPath() const { return m_RootLayerPath; }

private:
  VStage() = default;
  void Write(std::FILE* pFile, bool addSourceFileComment) const;

  std::string m_RootLayerPath;
  std::unique_ptr<UtilsFileSystem::VReplacingFile> m_pOutput;
  std::vector<std::unique_ptr<VPrim>> m_Roots;
  std::optional<double> m_FramesPerSecond, m_TimeCodesPerSecond, m_StartTimeCode, m_EndTimeCode,
      m_MetersPerUnit;
  std::optional<std::string> m_UpAxis;
  std::string m_Documentation;
};

} // namespace AnvilUsd
