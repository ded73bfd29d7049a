#include "River/CoreOstraKMTIO/Reader.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraKMTIO/Declaration.h"
#include "River/CoreOstraKMTIO/ReaderPasses.h"
#include "Utils/UtilsFileSystem/FileStreams.h"
#include "Utils/UtilsFileSystem/ReplacingFile.h"
#include "Utils/UtilsRapidXml/VReaderNode.h"
#include "Utils/UtilsRapidXml/VSchemaNode.h"

#include <rapidxml/rapidxml.hpp>
#include <rapidxml/rapidxml_print.hpp>

#include <iterator>

namespace CoreOstraKMTIO {

namespace {

/// Elements may nest this deep at most: the segment limit and the levels around it.
constexpr std::size_t MaxElementDepth = Detail::MaxSegmentDepth + 16;

std::uint32_t Fail(std::vector<std::string>& o_rErrors, const std::string& message) {
  o_rErrors.push_back(message);
  return ResultFailed;
}

} // namespace

std::uint32_t VReader::Read(const boost::filesystem::path& fileName,
                            VSubjectParametrised& o_rSubject, VSubjectApplicationData& o_rAppData,
                            VSubjectDynamicSubspace& o_rSubspace,
                            std::vector<std::string>& o_rErrors,
                            std::vector<std::string>& o_rWarnings, const std::string& subjectName,
                            std::uint32_t subjectId) {
  o_rErrors.clear();
  o_rWarnings.clear();
  auto [pFile, result] = UtilsFileSystem::OpenInputFile(fileName, true);
  if (result.IsFailure()) {
    return Fail(o_rErrors,
                ZMT::FormatOrRaw("Error opening file '%1%' for reading", fileName.string()));
  }
  UtilsFileSystem::VFileInputStream stream(pFile);
  std::vector<char> buffer;
  char chunk[65536];
  std::size_t count = 0;
  while ((count = std::fread(chunk, 1, sizeof chunk, pFile)) > 0)
    buffer.insert(buffer.end(), chunk, chunk + count);
  if (std::ferror(pFile)) return Fail(o_rErrors, "Failed to read file");
  buffer.push_back('\0');
  const std::string name = subjectName.empty() ? fileName.stem().string() : subjectName;
  return ReadBuffer(buffer, o_rSubject, o_rAppData, o_rSubspace, o_rErrors, o_rWarnings, name,
                    subjectId);
}

std::uint32_t VReader::Read(std::istream& stream, VSubjectParametrised& o_rSubject,
                            VSubjectApplicationData& o_rAppData,
                            VSubjectDynamicSubspace& o_rSubspace,
                            std::vector<std::string>& o_rErrors,
                            std::vector<std::string>& o_rWarnings, const std::string& subjectName,
                            std::uint32_t subjectId) {
  o_rErrors.clear();
  o_rWarnings.clear();
  if (!stream) return Fail(o_rErrors, "Could not open file");
  std::vector<char> buffer((std::istreambuf_iterator<char>(stream)),
                           std::istreambuf_iterator<char>());
  if (stream.bad()) return Fail(o_rErrors, "Failed to read file");
  buffer.push_back('\0');
  return ReadBuffer(buffer, o_rSubject, o_rAppData, o_rSubspace, o_rErrors, o_rWarnings,
                    subjectName, subjectId);
}

std::uint32_t VReader::ReadText(std::string_view text, VSubjectParametrised& o_rSubject,
                                VSubjectApplicationData& o_rAppData,
                                VSubjectDynamicSubspace& o_rSubspace,
                                std::vector<std::string>& o_rErrors,
                                std::vector<std::string>& o_rWarnings,
                                const std::string& subjectName, std::uint32_t subjectId) {
  o_rErrors.clear();
  o_rWarnings.clear();
  std::vector<char> buffer(text.begin(), text.end());
  buffer.push_back('\0');
  return ReadBuffer(buffer, o_rSubject, o_rAppData, o_rSubspace, o_rErrors, o_rWarnings,
                    subjectName, subjectId);
}

std::uint32_t VReader::ReadBuffer(std::vector<char>& buffer, VSubjectParametrised& o_rSubject,
                                  VSubjectApplicationData& o_rAppData,
                                  VSubjectDynamicSubspace& o_rSubspace,
                                  std::vector<std::string>& o_rErrors,
                                  std::vector<std::string>& o_rWarnings,
                                  const std::string& subjectName, std::uint32_t subjectId) {
  VSubjectParametrised subject;
  VSubjectApplicationData appData;
  VSubjectDynamicSubspace subspace;
  m_Extras = {};
  m_FileVersion = IVersion(1, 0);
  subject.m_Name = subjectName;
  subject.m_SubjectId =
      subjectId == CoreOstraTypes::InvalidId ? CoreOstraTypes::NameHash(subjectName) : subjectId;
  appData.m_SubjectId = subject.m_SubjectId;

  // A zero byte inside the text ends it for the parser; what follows is not read.
  rapidxml::xml_document<> document;
  if (Detail::NestsDeeperThan(buffer.data(), MaxElementDepth)) {
    return Fail(o_rErrors, "Failed to read file");
  }
  try {
    document.parse<0>(buffer.data());
  } catch (const rapidxml::parse_error&) {
    return Fail(o_rErrors, "Failed to read file");
  }

  Detail::VReadContext context{subject, appData, subspace, m_Extras};
  context.m_MinVersion = m_MinVersion;
  context.m_MaxVersion = m_MaxVersion;
  std::shared_ptr<UtilsRapidXml::VReaderNode::VGlobalInfo> info;
  {
    UtilsRapidXml::VReaderNode root(document, false);
    Detail::DeclareDocument(root, context);
    info = root.Info();
  }
  o_rErrors = std::move(info->m_Errors);
  o_rWarnings = std::move(info->m_Warnings);
  m_FileVersion = context.m_FileVersion;

  if (!context.m_Refused) {
    CoreOstraTypesUtils::VDynamicExpressionParserSimple parser;
    if (!Detail::CheckExpressions(context, parser, o_rErrors)) {
      o_rErrors.push_back("Failed validating one or more Expressions");
    } else {
      Detail::CompleteJointsAndTargets(context, parser, o_rErrors, o_rWarnings);
    }
  }
  if (subspace.m_SubjectId == CoreOstraTypes::InvalidId &&
      !subspace.m_PcaControlledParams.empty()) {
    subspace.m_SubjectId = subject.m_SubjectId;
  }
  o_rSubject = std::move(subject);
  o_rAppData = std::move(appData);
  o_rSubspace = std::move(subspace);
  return o_rErrors.empty() ? ResultOk : ResultFailed;
}

std::string VReader::SchemaText() {
  rapidxml::xml_document<> document;
  {
    UtilsRapidXml::VSchemaNode root(document, true, SchemaNamespaceUri, SchemaStylesheet);
    VSubjectParametrised subject;
    VSubjectApplicationData appData;
    VSubjectDynamicSubspace subspace;
    VSubjectKMTExtras extras;
    Detail::VReadContext context{subject, appData, subspace, extras};
    Detail::DeclareDocument(root, context);
  }
  std::string text;
  rapidxml::print(std::back_inserter(text), document, 0);
  return text;
}

bool VReader::WriteSchema(const boost::filesystem::path& fileName) const {
  const std::string text = SchemaText();
  UtilsFileSystem::VReplacingFile file;
  if (file.Open(fileName).IsFailure()) {
    ZMT_LOG("KMTIO", ZMT::ELogError, "Error opening file '%1%' for writing: %2%", fileName.string(),
            file.Reason());
    return false;
  }
  file.Write(text.data(), text.size());
  if (file.Commit().IsFailure()) {
    ZMT_LOG("KMTIO", ZMT::ELogError, "Failed to write file '%1%': %2%", fileName.string(),
            file.Reason());
    return false;
  }
  return true;
}

} // namespace CoreOstraKMTIO
