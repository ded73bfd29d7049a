#include "plugin/host/HObject.h"
#include "plugin/host/Character.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/Marker.h"
#include "plugin/host/Plugin.h"

const HRuntimeClass HObject::s_classHObject = {"HObject", nullptr};
H_IMPLEMENT_RUNTIME_CLASS(Module, HObject)
H_IMPLEMENT_RUNTIME_CLASS(Node, Module)
H_IMPLEMENT_RUNTIME_CLASS(Marker, Node)
H_IMPLEMENT_RUNTIME_CLASS(Character, Node)
const HRuntimeClass FileExporter::s_classFileExporter = {"FileExporter", &HObject::s_classHObject};
const HRuntimeClass DruCorePluginBase::s_classDruCorePluginBase = {"DruCorePluginBase",
                                                                   &HObject::s_classHObject};
const HRuntimeClass ExporterPluginBase::s_classExporterPluginBase = {
    "ExporterPluginBase", &DruCorePluginBase::s_classDruCorePluginBase};
const HRuntimeClass CommandPluginBase::s_classCommandPluginBase = {
    "CommandPluginBase", &DruCorePluginBase::s_classDruCorePluginBase};

bool HRuntimeClass::isDerivedFrom(const HRuntimeClass* i_pBase) const {
  for (const HRuntimeClass* p = this; p; p = p->m_pBase)
    if (p == i_pBase) return true;
  return false;
}

HObject::~HObject() = default;

bool HObject::isKindOf(const HRuntimeClass* i_pClass) const {
  return i_pClass && getRuntimeClass()->isDerivedFrom(i_pClass);
}
