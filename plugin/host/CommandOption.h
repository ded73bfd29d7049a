#pragma once
#include "HString.h"
#include "HostExport.h"
#include "Variable.h"

/// One named option of a script command: `-name value`. Created by `createInstance` and owned
/// by the command it is added to.
class ANVIL_HOST_API CommandOption {
public:
  /// A new option; `i_arity` values of type `i_type` follow its name in a script. A required
  /// option must be given in every call. Null when the name is empty or the arity below 1.
  static CommandOption* createInstance(const HString& i_rName, int i_arity,
                                       Variable::VarType i_type, bool i_required);

  const HString& getName() const { return m_name; }
  int getArity() const { return m_arity; }
  Variable::VarType getType() const { return m_type; }
  bool isRequired() const { return m_required; }

private:
  CommandOption(const HString& i_rName, int i_arity, Variable::VarType i_type, bool i_required)
      : m_name(i_rName), m_arity(i_arity), m_type(i_type), m_required(i_required) {}

  HString m_name;
  int m_arity;
  Variable::VarType m_type;
  bool m_required;
};
