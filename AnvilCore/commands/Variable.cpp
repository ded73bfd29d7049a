#include "plugin/host/Variable.h"

void Variable::addBool(BoolType i_value) {
  Value v;
  v.m_int = i_value;
  m_values.push_back(v);
}

void Variable::addInt(int i_value) {
  Value v;
  v.m_int = i_value;
  v.m_float = i_value;
  m_values.push_back(v);
}

void Variable::addFloat(double i_value) {
  Value v;
  v.m_float = i_value;
  m_values.push_back(v);
}

void Variable::addString(const HString& i_rValue) {
  Value v;
  v.m_text = i_rValue;
  m_values.push_back(v);
}

const Variable::Value* Variable::at(int i_index) const {
  const int index = i_index < 0 ? 0 : i_index;
  return index < static_cast<int>(m_values.size()) ? &m_values[static_cast<size_t>(index)]
                                                   : nullptr;
}

Variable::BoolType Variable::getBoolValue(int i_index) const {
  const Value* p = at(i_index);
  if (!p || m_type != EBool) return EFalse;
  return p->m_int == ETrue ? ETrue : (p->m_int == EToggle ? EToggle : EFalse);
}

int Variable::getIntValue(int i_index) const {
  const Value* p = at(i_index);
  return p && m_type == EInteger ? static_cast<int>(p->m_int) : 0;
}

double Variable::getFloatValue(int i_index) const {
  const Value* p = at(i_index);
  return p && (m_type == EFloat || m_type == EInteger) ? p->m_float : 0.0;
}

HString Variable::getStringValue(int i_index) const {
  const Value* p = at(i_index);
  return p && m_type == EString ? p->m_text : HString();
}

const char* Variable::typeName(VarType i_type) {
  switch (i_type) {
  case EInteger:
    return "int";
  case EFloat:
    return "float";
  case EString:
    return "string";
  case EBool:
    return "bool";
  default:
    return "unknown";
  }
}
