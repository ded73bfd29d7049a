#include "plugin/host/Module.h"
#include "plugin/host/Character.h"
#include <algorithm>

Module::Module(const HString& i_rName) : m_name(i_rName) {}

Module::~Module() {
  for (Module* pChild : m_children)
    delete pChild;
}

Character* Module::getCharacterParent() const {
  for (Module* p = m_pParent; p; p = p->m_pParent)
    if (p->isKindOf(&Character::s_classCharacter)) return static_cast<Character*>(p);
  return nullptr;
}

namespace {
// The scene's root has no parent and no name of its own in paths.
HString pathOf(const Module* i_pModule) {
  std::vector<const Module*> chain;
  for (const Module* p = i_pModule; p && p->hasParent(); p = p->getParent())
    chain.push_back(p);
  HString path;
  for (auto it = chain.rbegin(); it != chain.rend(); ++it) {
    if (!path.IsEmpty()) path += "\\";
    path += (*it)->getName();
  }
  return path;
}
} // namespace

HString Module::getPartialPathString() const {
  return pathOf(this);
}

HString Module::getFullPathString() const {
  return HString("\\") + pathOf(this);
}

bool Module::isDescendedFrom(const Module* i_pAncestor) const {
  for (const Module* p = m_pParent; p; p = p->m_pParent)
    if (p == i_pAncestor) return true;
  return false;
}

int Module::getNumNodeChildren() const {
  return static_cast<int>(std::count_if(m_children.begin(), m_children.end(),
                                        [](Module* p) { return p->isKindOf(&Node::s_classNode); }));
}

Node* Module::getNodeChild(int i_index) const {
  for (Module* p : m_children)
    if (p->isKindOf(&Node::s_classNode) && i_index-- == 0) return static_cast<Node*>(p);
  return nullptr;
}

int Module::getNumChildrenOfType(const HRuntimeClass* i_pClass) const {
  return static_cast<int>(std::count_if(m_children.begin(), m_children.end(),
                                        [&](Module* p) { return p->isKindOf(i_pClass); }));
}

void Module::getDescendantsWithName(HString i_name, TSimpleArray<Module*>& o_rModules) const {
  for (Module* p : m_children) {
    if (p->getName() == i_name) o_rModules.add(p);
    p->getDescendantsWithName(i_name, o_rModules);
  }
}

void Module::addChild(Module* i_pChild) {
  if (!i_pChild || i_pChild == this) return;
  if (i_pChild->m_pParent) i_pChild->m_pParent->detachChild(i_pChild);
  i_pChild->m_pParent = this;
  m_children.push_back(i_pChild);
}

Module* Module::detachChild(Module* i_pChild) {
  auto it = std::find(m_children.begin(), m_children.end(), i_pChild);
  if (it == m_children.end()) return nullptr;
  m_children.erase(it);
  i_pChild->m_pParent = nullptr;
  return i_pChild;
}

void Module::collect(std::vector<Module*>& o_rModules) {
  o_rModules.push_back(this);
  for (Module* p : m_children)
    p->collect(o_rModules);
}

HString ModulePath::getPartialPathString() const {
  return m_pModule ? m_pModule->getPartialPathString() : HString();
}
