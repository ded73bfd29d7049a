#pragma once
#include "HostExport.h"

/// Runtime class tag: a name and the base class's tag, walked by `HObject::isKindOf`.
struct ANVIL_HOST_API HRuntimeClass {
  const char* m_name;
  const HRuntimeClass* m_pBase;
  bool isDerivedFrom(const HRuntimeClass* i_pBase) const;
};

/// Declares the static class tag `s_class<Name>` and the virtual `getRuntimeClass`.
#define H_DECLARE_RUNTIME_CLASS(Name)                                                              \
public:                                                                                            \
  static const HRuntimeClass s_class##Name;                                                        \
  const HRuntimeClass* getRuntimeClass() const override {                                          \
    return &s_class##Name;                                                                         \
  }

/// Defines the tag of `Name` whose base class is `Base`.
#define H_IMPLEMENT_RUNTIME_CLASS(Name, Base)                                                      \
  const HRuntimeClass Name::s_class##Name = {#Name, &Base::s_class##Base};

/// Base of every host object.
class ANVIL_HOST_API HObject {
public:
  static const HRuntimeClass s_classHObject;

  HObject() = default;
  HObject(const HObject&) = default;
  HObject& operator=(const HObject&) = default;
  virtual ~HObject();

  /// Destroys the object; hosts release every object they were handed this way.
  virtual void deleteThis() { delete this; }
  virtual const HRuntimeClass* getRuntimeClass() const { return &s_classHObject; }
  /// True when the object's class is `i_pClass` or derives from it. A null class gives false.
  bool isKindOf(const HRuntimeClass* i_pClass) const;
};
