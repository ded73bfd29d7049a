#pragma once
#include "HObject.h"
#include "HString.h"
#include "TSimpleArray.h"
#include <vector>

class Character;
class Node;

/// One object of the scene tree. A module owns its children.
class ANVIL_HOST_API Module : public HObject {
  H_DECLARE_RUNTIME_CLASS(Module)
public:
  explicit Module(const HString& i_rName = HString());
  ~Module() override;
  Module(const Module&) = delete;
  Module& operator=(const Module&) = delete;

  virtual const HString& getName() const { return m_name; }
  void setName(const HString& i_rName) { m_name = i_rName; }

  Module* getParent() const { return m_pParent; }
  bool hasParent() const { return m_pParent != nullptr; }
  /// The nearest `Character` above this module, or null.
  Character* getCharacterParent() const;
  /// Names from below the top-level module down to this one, separated by "\\".
  HString getPartialPathString() const;
  /// Names from the top-level module down to this one, separated by "\\".
  HString getFullPathString() const;
  bool isVisible() const { return m_visible; }
  void setVisible(bool i_visible) { m_visible = i_visible; }
  bool isSelected() const { return m_selected; }
  void setSelected(bool i_selected) { m_selected = i_selected; }
  bool isDescendedFrom(const Module* i_pAncestor) const;

  int getNumChildren() const { return static_cast<int>(m_children.size()); }
  Module* getChild(int i_index) const { return m_children[static_cast<size_t>(i_index)]; }
  /// Children that are nodes, in child order.
  int getNumNodeChildren() const;
  Node* getNodeChild(int i_index) const;
  int getNumChildrenOfType(const HRuntimeClass* i_pClass) const;
  /// Appends every descendant (not this module) whose name equals `i_name`.
  void getDescendantsWithName(HString i_name, TSimpleArray<Module*>& o_rModules) const;

  /// Host side: takes ownership of `i_pChild` and appends it; a child with a parent moves.
  void addChild(Module* i_pChild);
  /// Host side: gives up ownership of a direct child and returns it, or null.
  Module* detachChild(Module* i_pChild);
  /// Depth-first, parents before children; `this` first.
  void collect(std::vector<Module*>& o_rModules);

private:
  HString m_name;
  Module* m_pParent = nullptr;
  std::vector<Module*> m_children;
  bool m_visible = true;
  bool m_selected = false;
};

/// Path of a module relative to its top-level ancestor.
class ANVIL_HOST_API ModulePath {
public:
  explicit ModulePath(const Module* i_pModule) : m_pModule(i_pModule) {}
  HString getPartialPathString() const;

private:
  const Module* m_pModule;
};
