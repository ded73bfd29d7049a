#pragma once
#include "CommandOption.h"
#include "HObject.h"
#include "HString.h"
#include "HostExport.h"
#include "Variable.h"
#include <cstdint>
#include <memory>
#include <vector>

/// One option given in a call: the option's identifier (its place among the command's options)
/// and its value.
struct ANVIL_HOST_API CommandArgument {
  uint64_t m_id = 0;
  Variable m_value;
};
/// The options of one call, in the order the script gave them.
using CommandArgList = std::vector<CommandArgument>;

/// Base of a script command. A command has a name, a description and options; the host's
/// script parser checks a call against the options and hands the given ones to `doCommand`.
/// Commands are reference-counted: a count of 0 means one owner, and `unref` at 0 destroys.
class ANVIL_HOST_API Command : public HObject {
public:
  static const HRuntimeClass s_classCommand;

  /// `i_rName` is the script name; the third string is the host's help topic (may be empty).
  Command(const HString& i_rName, const HString& i_rDescription, const HString& i_rHelp);
  ~Command() override;
  Command(const Command&) = delete;
  Command& operator=(const Command&) = delete;

  /// Releases one reference (destroys the command at the last).
  void deleteThis() override { unref(); }
  const HRuntimeClass* getRuntimeClass() const override { return &s_classCommand; }

  /// Runs the command with the options of one call. True on success; a failure has been
  /// logged through `logError`.
  virtual bool doCommand(const CommandArgList& i_rArgs) = 0;

  /// One line that shows how to call the command: "name [-option <type>] ...".
  virtual HString getArgSyntaxString() const;
  /// True when every required option is among `i_rArgs` and every identifier is known.
  virtual bool checkArgSyntax(const CommandArgList& i_rArgs) const;
  /// Whether the command may run outside a batch of others; always true here.
  virtual bool canExecuteSolo() const { return true; }
  /// Type of the command's result: a bool (success).
  virtual Variable::VarType getReturnType() const { return Variable::EBool; }
  /// "-name <type>" of option `i_id`; empty for an unknown identifier.
  virtual HString getOptionSyntax(uint64_t i_id) const;
  /// Option commands change settings outside the undo history.
  virtual bool isUndoable() const { return false; }

  const HString& getName() const { return m_name; }
  const HString& getDescription() const { return m_description; }
  const HString& getHelp() const { return m_help; }
  void setCommandCategory(const HString& i_rCategory, const HString& i_rSubCategory);
  const HString& getCategory() const { return m_category; }
  const HString& getSubCategory() const { return m_subCategory; }

  /// Takes ownership of `i_pOption`; its identifier is its place in the order of addition. The
  /// flags word and the bool are the host's and only kept. A null option is ignored.
  void addOption(CommandOption* i_pOption, uint64_t i_flags, bool i_hidden);
  int getNumOptions() const { return static_cast<int>(m_options.size()); }
  const CommandOption* getOption(int i_id) const;
  /// Identifier of the option named `i_rName` (exact match), or -1.
  int findOption(const HString& i_rName) const;
  /// The bool given to `addOption`: such options are left out of listings.
  bool isOptionHidden(int i_id) const;

  void ref() { ++m_refCount; }
  /// Drops one reference; at count 0 the command is destroyed.
  void unref();

  /// printf-style messages to the host's log.
  static void logWarning(const char* i_pFormat, ...) __attribute__((format(printf, 1, 2)));
  static void logError(const char* i_pFormat, ...) __attribute__((format(printf, 1, 2)));

private:
  struct OptionEntry {
    std::unique_ptr<CommandOption> m_pOption;
    uint64_t m_flags;
    bool m_hidden;
  };
  HString m_name;
  HString m_description;
  HString m_help;
  HString m_category;
  HString m_subCategory;
  std::vector<OptionEntry> m_options;
  int m_refCount = 0;
};
