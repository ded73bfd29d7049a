#include "plugin/host/Command.h"
#include "plugin/host/Database.h"
#include <cstdarg>
#include <cstdio>
#include <string>

const HRuntimeClass Command::s_classCommand = {"Command", &HObject::s_classHObject};

namespace {
void logFormatted(HLogLevel i_level, const char* i_pFormat, va_list i_args) {
  char buffer[1024];
  va_list copy;
  va_copy(copy, i_args);
  const int size = std::vsnprintf(buffer, sizeof buffer, i_pFormat, copy);
  va_end(copy);
  if (size < 0) {
    g_db->log(i_level, i_pFormat);
  } else if (static_cast<size_t>(size) < sizeof buffer) {
    g_db->log(i_level, std::string(buffer, static_cast<size_t>(size)));
  } else {
    std::string text(static_cast<size_t>(size) + 1, '\0');
    std::vsnprintf(text.data(), text.size(), i_pFormat, i_args);
    text.resize(static_cast<size_t>(size));
    g_db->log(i_level, text);
  }
}
} // namespace

CommandOption* CommandOption::createInstance(const HString& i_rName, int i_arity,
                                             Variable::VarType i_type, bool i_required) {
  if (i_rName.IsEmpty() || i_arity < 1) return nullptr;
  return new CommandOption(i_rName, i_arity, i_type, i_required);
}

Command::Command(const HString& i_rName, const HString& i_rDescription, const HString& i_rHelp)
    : m_name(i_rName), m_description(i_rDescription), m_help(i_rHelp) {}

Command::~Command() = default;

void Command::setCommandCategory(const HString& i_rCategory, const HString& i_rSubCategory) {
  m_category = i_rCategory;
  m_subCategory = i_rSubCategory;
}

void Command::addOption(CommandOption* i_pOption, uint64_t i_flags, bool i_hidden) {
  if (!i_pOption) return;
  m_options.push_back({std::unique_ptr<CommandOption>(i_pOption), i_flags, i_hidden});
}

const CommandOption* Command::getOption(int i_id) const {
  if (i_id < 0 || i_id >= getNumOptions()) return nullptr;
  return m_options[static_cast<size_t>(i_id)].m_pOption.get();
}

int Command::findOption(const HString& i_rName) const {
  for (int i = 0; i < getNumOptions(); ++i)
    if (m_options[static_cast<size_t>(i)].m_pOption->getName() == i_rName) return i;
  return -1;
}

bool Command::isOptionHidden(int i_id) const {
  return i_id >= 0 && i_id < getNumOptions() && m_options[static_cast<size_t>(i_id)].m_hidden;
}

void Command::unref() {
  if (m_refCount == 0)
    delete this;
  else
    --m_refCount;
}

HString Command::getOptionSyntax(uint64_t i_id) const {
  if (i_id >= m_options.size()) return HString();
  const CommandOption* pOption = m_options[i_id].m_pOption.get();
  HString text = HString("-") + pOption->getName();
  for (int i = 0; i < pOption->getArity(); ++i)
    text += HString(" <") + Variable::typeName(pOption->getType()) + ">";
  return text;
}

HString Command::getArgSyntaxString() const {
  HString text = m_name;
  for (size_t i = 0; i < m_options.size(); ++i) {
    const bool required = m_options[i].m_pOption->isRequired();
    text += required ? " " : " [";
    text += getOptionSyntax(i);
    if (!required) text += "]";
  }
  return text;
}

bool Command::checkArgSyntax(const CommandArgList& i_rArgs) const {
  std::vector<bool> given(m_options.size(), false);
  for (const CommandArgument& arg : i_rArgs) {
    if (arg.m_id >= m_options.size()) return false;
    given[arg.m_id] = true;
  }
  for (size_t i = 0; i < m_options.size(); ++i)
    if (m_options[i].m_pOption->isRequired() && !given[i]) return false;
  return true;
}

void Command::logWarning(const char* i_pFormat, ...) {
  va_list args;
  va_start(args, i_pFormat);
  logFormatted(HLogLevel::EWarning, i_pFormat, args);
  va_end(args);
}

void Command::logError(const char* i_pFormat, ...) {
  va_list args;
  va_start(args, i_pFormat);
  logFormatted(HLogLevel::EError, i_pFormat, args);
  va_end(args);
}
