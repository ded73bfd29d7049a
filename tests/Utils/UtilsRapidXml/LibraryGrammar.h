#pragma once
// A small document type for exercising the schema layer: a library of shelves, each holding books
// or magazines (a choice), with a version-limited catalogue and a recursive Section element.

#include "Utils/UtilsRapidXml/INode.h"

#include <rapidxml/rapidxml.hpp>

#include <memory>
#include <string>
#include <vector>

namespace LibraryGrammar {

enum class EBinding { Hard = 0, Soft = 1 };

struct VBook {
  std::string m_Kind; ///< "Book" or "Magazine"
  std::string m_Title;
  double m_Price = -1.0;
  double m_Discount = 0.0; ///< raw optional
  bool m_Signed = false;
  EBinding m_Binding = EBinding::Hard;
  std::vector<double> m_Size;
  std::vector<std::string> m_Formula;
};

struct VLibrary {
  std::string m_Name = "default";
  std::string m_Motto = "none";
  std::vector<std::string> m_ShelfIds;
  std::vector<VBook> m_Books;
  int m_Catalogues = 0;
  int m_Sections = 0;
};

/// The root declaration; fills `library` when run with a reader.
void DeclareRoot(UtilsRapidXml::INode& node, VLibrary& library);

/// Parses `text` (kept alive in `buffer`) and reads it; returns the global information.
struct VReadResult {
  VLibrary m_Library;
  std::vector<std::string> m_Errors;
  std::vector<std::string> m_Warnings;
};
VReadResult Read(const std::string& text, bool strictSequence = false);

} // namespace LibraryGrammar
