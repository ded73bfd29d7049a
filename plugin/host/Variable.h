#pragma once
#include "HString.h"
#include "HostExport.h"
#include <vector>

/// The value of one command option as the script gave it: one or more values of one type.
class ANVIL_HOST_API Variable {
public:
  /// Value types of command options.
  enum VarType { EUnknown = 0, EInteger = 1, EFloat = 2, EString = 3, EBool = 4 };
  /// A bool option's value: 1 true, 2 toggle (flip the current value); anything else is false.
  enum BoolType { EFalse = 0, ETrue = 1, EToggle = 2 };

  Variable() = default;
  explicit Variable(VarType i_type) : m_type(i_type) {}

  VarType getType() const { return m_type; }
  int getNumValues() const { return static_cast<int>(m_values.size()); }

  /// Appends one value of the variable's type.
  void addBool(BoolType i_value);
  void addInt(int i_value);
  void addFloat(double i_value);
  void addString(const HString& i_rValue);

  /// Value `i_index` (0-based); -1 means the first, the only value of an arity-1 option. A missing
  /// value or a value of another type gives false, 0, 0.0 or an empty string.
  BoolType getBoolValue(int i_index) const;
  int getIntValue(int i_index) const;
  double getFloatValue(int i_index) const;
  HString getStringValue(int i_index) const;

  /// Name of a type as scripts and listings show it: "int", "float", "string", "bool".
  static const char* typeName(VarType i_type);

private:
  struct Value {
    long long m_int = 0; // integers and bools
    double m_float = 0.0;
    HString m_text;
  };
  const Value* at(int i_index) const;

  VarType m_type = EUnknown;
  std::vector<Value> m_values;
};
