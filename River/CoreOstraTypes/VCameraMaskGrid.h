#pragma once
// The threshold mask of a camera: a grid of tiles, each masked or not, kept as text.

#include <cstdint>
#include <string>

namespace CoreOstraTypes {

class VCameraMaskGrid {
public:
  /// The grid's tiles as run-length text, row by row; empty for an unmasked camera.
  std::string m_Data;
  std::int32_t m_TileWidth = 0; ///< pixels per tile
  std::int32_t m_TileHeight = 0;
  std::int32_t m_GridWidth = 0;  ///< tiles per row
  std::int32_t m_GridHeight = 0; ///< rows of tiles

  bool operator==(const VCameraMaskGrid&) const = default;
  static constexpr const char* FlowClassName = "CameraMaskGrid";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("RunLengths", "", s.m_Data);
    v("TileWidth", "", s.m_TileWidth);
    v("TileHeight", "", s.m_TileHeight);
    v("GridWidth", "", s.m_GridWidth);
    v("GridHeight", "", s.m_GridHeight);
  }
};

} // namespace CoreOstraTypes
