#include "usd/UsdStage.h"

#include "Utils/UtilsFileSystem/ReplacingFile.h"
#include "usd/UsdNames.h"
#include "usd/UsdText.h"

#include <algorithm>
#include <filesystem>

namespace AnvilUsd {

bool VAttribute::Set(VValue value, double time) {
  if (m_Uniform) return false;
  // Samples arrive in time order as a rule; anything else is put in its place.
  if (m_Samples.empty() || m_Samples.back().m_Time < time) {
    m_Samples.push_back({time, std::move(value)});
    return true;
  }
  auto it = std::lower_bound(m_Samples.begin(), m_Samples.end(), time,
                             [](const VSample& s, double t) { return s.m_Time < t; });
  if (it != m_Samples.end() && it->m_Time == time)
    it->m_Value = std::move(value);
  else
    m_Samples.insert(it, {time, std::move(value)});
  return true;
}

VAttribute& VPrim::Attribute(const std::string& name, bool uniform) {
  for (auto& pAttribute : m_Attributes)
    if (pAttribute->Name() == name) return *pAttribute;
  return *m_Attributes.emplace_back(std::make_unique<VAttribute>(name, uniform));
}

VRelationship& VPrim::Relationship(const std::string& name) {
  for (auto& pRelationship : m_Relationships)
    if (pRelationship->Name() == name) return *pRelationship;
  return *m_Relationships.emplace_back(std::make_unique<VRelationship>(name));
}

void VPrim::ApplyApiSchema(const std::string& name) {
  if (std::find(m_ApiSchemas.begin(), m_ApiSchemas.end(), name) == m_ApiSchemas.end())
    m_ApiSchemas.push_back(name);
}

VPrim* VPrim::Child(const std::string& name) const {
  for (const auto& pChild : m_Children)
    if (pChild->Name() == name) return pChild.get();
  return nullptr;
}

VPrim& VPrim::AddChild(const std::string& name, const std::string& typeName) {
  return *m_Children.emplace_back(std::make_unique<VPrim>(m_Path + "/" + name, name, typeName));
}

std::unique_ptr<VStage> VStage::CreateNew(const std::string& path, std::string& o_rError) {
  auto pOutput = std::make_unique<UtilsFileSystem::VReplacingFile>();
  if (pOutput->Open(path).IsFailure()) {
    o_rError = pOutput->Reason();
    return nullptr;
  }
  std::unique_ptr<VStage> pStage(new VStage);
  std::error_code ec;
  const std::filesystem::path absolute = std::filesystem::absolute(path, ec);
  pStage->m_RootLayerPath = ec ? path : absolute.lexically_normal().string();
  pStage->m_pOutput = std::move(pOutput);
  return pStage;
}

std::unique_ptr<VStage> VStage::CreateInMemory() {
  return std::unique_ptr<VStage>(new VStage);
}

VStage::~VStage() = default;

VPrim* VStage::DefinePrim(const std::string& path, const std::string& typeName) {
  if (path.size() < 2 || path[0] != '/') return nullptr;
  VPrim* pParent = nullptr;
  std::size_t start = 1;
  while (start <= path.size()) {
    std::size_t end = path.find('/', start);
    if (end == std::string::npos) end = path.size();
    const std::string name = path.substr(start, end - start);
    if (!IsValidIdentifier(name)) return nullptr;
    const bool last = end == path.size();
    VPrim* pPrim = nullptr;
    if (pParent) {
      pPrim = pParent->Child(name);
      if (!pPrim) pPrim = &pParent->AddChild(name, last ? typeName : std::string());
    } else {
      for (const auto& pRoot : m_Roots)
        if (pRoot->Name() == name) pPrim = pRoot.get();
      if (!pPrim)
        pPrim =
            m_Roots.emplace_back(std::make_unique<VPrim>("/" + name, name, last ? typeName : ""))
                .get();
    }
    if (last) {
      pPrim->SetTypeName(typeName);
      return pPrim;
    }
    pParent = pPrim;
    start = end + 1;
  }
  return nullptr;
}

VPrim* VStage::GetPrim(const std::string& path) const {
  if (path.size() < 2 || path[0] != '/') return nullptr;
  const std::vector<std::unique_ptr<VPrim>>* pLevel = &m_Roots;
  VPrim* pPrim = nullptr;
  std::size_t start = 1;
  while (start <= path.size()) {
    std::size_t end = path.find('/', start);
    if (end == std::string::npos) end = path.size();
    const std::string name = path.substr(start, end - start);
    pPrim = nullptr;
    for (const auto& pCandidate : *pLevel)
      if (pCandidate->Name() == name) pPrim = pCandidate.get();
    if (!pPrim) return nullptr;
    pLevel = &pPrim->Children();
    start = end + 1;
  }
  return pPrim;
}

bool VStage::SetUpAxis(const std::string& axis) {
  if (axis != "Y" && axis != "Z") return false;
  m_UpAxis = axis;
  return true;
}

std::string VStage::ExportToString(bool addSourceFileComment) const {
  char* pBuffer = nullptr;
  std::size_t size = 0;
  std::FILE* pFile = ::open_memstream(&pBuffer, &size);
  if (!pFile) return {};
  Write(pFile, addSourceFileComment);
  std::fclose(pFile);
  std::string text(pBuffer, size);
  std::free(pBuffer);
  return text;
}

bool VStage::Export(const std::string& path, bool addSourceFileComment, std::string& o_rError) {
  // The file opened at creation serves an export to the stage's own path.
  std::unique_ptr<UtilsFileSystem::VReplacingFile> pOutput;
  if (m_pOutput && m_pOutput->Target() == path) {
    pOutput = std::move(m_pOutput);
  } else {
    pOutput = std::make_unique<UtilsFileSystem::VReplacingFile>();
    if (pOutput->Open(path).IsFailure()) {
      o_rError = pOutput->Reason();
      return false;
    }
  }
  Write(pOutput->File(), addSourceFileComment);
  if (pOutput->Commit().IsFailure()) {
    o_rError = pOutput->Reason();
    return false;
  }
  return true;
}

void VStage::Write(std::FILE* pFile, bool addSourceFileComment) const {
  VTextWriter out(pFile);
  out.Text("#usda 1.0\n");
  std::string documentation = m_Documentation;
  if (addSourceFileComment) {
    if (!documentation.empty()) documentation += "\n\n";
    documentation += "Generated from Composed Stage of root layer " + m_RootLayerPath + "\n";
  }
  const bool hasMetadata = !documentation.empty() || m_EndTimeCode || m_FramesPerSecond ||
                           m_MetersPerUnit || m_StartTimeCode || m_TimeCodesPerSecond || m_UpAxis;
  if (hasMetadata) {
    out.Text("(\n");
    // Fields in byte order of their names; "doc" is stored as "documentation".
    if (!documentation.empty()) {
      out.Text("    doc = ");
      out.String(documentation);
      out.Text("\n");
    }
    auto field = [&](const char* pName, const std::optional<double>& value) {
      if (!value) return;
      out.Text("    ");
      out.Text(pName);
      out.Text(" = ");
      out.Double(*value);
      out.Text("\n");
    };
    field("endTimeCode", m_EndTimeCode);
    field("framesPerSecond", m_FramesPerSecond);
    field("metersPerUnit", m_MetersPerUnit);
    field("startTimeCode", m_StartTimeCode);
    field("timeCodesPerSecond", m_TimeCodesPerSecond);
    if (m_UpAxis) {
      out.Text("    upAxis = ");
      out.String(*m_UpAxis);
      out.Text("\n");
    }
    out.Text(")\n");
  }
  for (const auto& pRoot : m_Roots) {
    out.Text("\n");
    out.Prim(*pRoot, 0);
  }
  out.Text("\n");
  out.Flush();
}

} // namespace AnvilUsd
