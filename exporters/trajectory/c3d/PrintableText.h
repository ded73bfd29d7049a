#pragma once
// Names that come from files (labels, parameter names, units) made safe to print and to write
// into text formats. Header-only, shared by the trajectory readers and writers.
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace C3D {

/// Replacement for a byte that cannot be printed.
constexpr char kUnprintable = '?';

/// Length of the well-formed UTF-8 sequence that starts at `i_pos` (1 to 4), or 0 when the bytes
/// there are not one: a stray continuation byte, a truncated sequence, an overlong form, a
/// surrogate, or a code point above U+10FFFF.
inline size_t utf8SequenceLength(std::string_view i_text, size_t i_pos) {
  const auto at = [&](size_t i) { return uint8_t(i_text[i]); };
  const uint8_t lead = at(i_pos);
  if (lead < 0x80) return 1;
  size_t length;
  uint32_t code;
  if (lead >= 0xC2 && lead <= 0xDF) {
    length = 2;
    code = lead & 0x1Fu;
  } else if (lead >= 0xE0 && lead <= 0xEF) {
    length = 3;
    code = lead & 0x0Fu;
  } else if (lead >= 0xF0 && lead <= 0xF4) {
    length = 4;
    code = lead & 0x07u;
  } else {
    return 0;
  }
  if (i_pos + length > i_text.size()) return 0;
  for (size_t k = 1; k < length; ++k) {
    if ((at(i_pos + k) & 0xC0) != 0x80) return 0;
    code = (code << 6) | (at(i_pos + k) & 0x3Fu);
  }
  if ((length == 3 && code < 0x800) || (length == 4 && code < 0x10000) || code > 0x10FFFF ||
      (code >= 0xD800 && code <= 0xDFFF))
    return 0;
  return length;
}

/// `i_text` with every control character (below 0x20, 0x7F, and U+0080 to U+009F) and every
/// byte that is not part of well-formed UTF-8 replaced by '?'. Tabs and line ends are control
/// characters here: in a tab-separated header they would move columns. `o_pChanged`, when given,
/// says whether anything was replaced.
inline std::string printableText(std::string_view i_text, bool* o_pChanged = nullptr) {
  std::string out;
  out.reserve(i_text.size());
  bool changed = false;
  for (size_t i = 0; i < i_text.size();) {
    const size_t length = utf8SequenceLength(i_text, i);
    const uint8_t lead = uint8_t(i_text[i]);
    const bool control = (length == 1 && (lead < 0x20 || lead == 0x7F)) ||
                         (length == 2 && lead == 0xC2 && uint8_t(i_text[i + 1]) < 0xA0);
    if (length == 0 || control) {
      out += kUnprintable;
      changed = true;
      i += length == 0 ? 1 : length;
      continue;
    }
    out.append(i_text.substr(i, length));
    i += length;
  }
  if (o_pChanged) *o_pChanged = changed;
  return out;
}

} // namespace C3D
