#pragma once
// A tree kept as one list in depth-first pre-order: each node knows its parent and children by
// position, and a node added under a parent goes after that parent's last descendant, so walking
// the list front to back always visits parents before children.

#include <cstdint>
#include <stdexcept>
#include <vector>

namespace KinematicAlgo {

template <class T> class VTree {
public:
  static constexpr std::int32_t NoParent = -1;

  struct Node {
    T m_Value;
    std::int32_t m_Parent = NoParent;
    std::vector<std::int32_t> m_Children;
  };

  std::int32_t Size() const { return std::int32_t(m_Nodes.size()); }
  bool Empty() const { return m_Nodes.empty(); }
  const Node& operator[](std::int32_t i) const { return m_Nodes[size_t(i)]; }
  Node& operator[](std::int32_t i) { return m_Nodes[size_t(i)]; }
  const std::vector<Node>& Nodes() const { return m_Nodes; }

  /// Adds the root of an empty tree, or a node under `parent`; returns its position. Positions
  /// of nodes after it move up by one.
  std::int32_t Add(std::int32_t parent, T value) {
    if (m_Nodes.size() >= size_t(INT32_MAX)) throw std::length_error("list<T> too long");
    if (parent == NoParent) {
      if (!m_Nodes.empty()) throw std::logic_error("VTree already has a root");
      m_Nodes.push_back(Node{std::move(value), NoParent, {}});
      return 0;
    }
    const std::int32_t at = SubtreeEnd(parent);
    for (Node& node : m_Nodes) {
      if (node.m_Parent >= at) ++node.m_Parent;
      for (std::int32_t& child : node.m_Children)
        if (child >= at) ++child;
    }
    m_Nodes.insert(m_Nodes.begin() + at, Node{std::move(value), parent, {}});
    m_Nodes[size_t(parent)].m_Children.push_back(at);
    return at;
  }

  /// One past the last descendant of `i`.
  std::int32_t SubtreeEnd(std::int32_t i) const {
    std::int32_t end = i + 1;
    while (end < Size() && IsAncestor(i, end))
      ++end;
    return end;
  }

  /// True when `ancestor` lies on the path from `node` to the root (a node is its own ancestor).
  bool IsAncestor(std::int32_t ancestor, std::int32_t node) const {
    for (; node != NoParent; node = m_Nodes[size_t(node)].m_Parent)
      if (node == ancestor) return true;
    return false;
  }

  std::int32_t Depth(std::int32_t i) const {
    std::int32_t depth = 0;
    for (; m_Nodes[size_t(i)].m_Parent != NoParent; i = m_Nodes[size_t(i)].m_Parent)
      ++depth;
    return depth;
  }

private:
  std::vector<Node> m_Nodes;
};

} // namespace KinematicAlgo
