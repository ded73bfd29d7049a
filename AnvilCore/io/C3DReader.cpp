#include "C3DReader.h"
#include "exporters/trajectory/c3d/PrintableText.h"
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <limits>

namespace AnvilCore {

namespace {
// The largest parameter record payload accepted: a record never spans more than 64k of data in
// files written by anyone, and the cap keeps absurd dimensions from allocating.
constexpr size_t kMaxParameterBytes = 16u << 20;
// Largest coordinate, in millimetres, of a plausible recording: from a hand-sized volume to a
// large stage.
constexpr double kPlausibleMm[2] = {10.0, 100000.0};

struct C3DError {
  std::string message;
};

std::string atByte(const std::string& i_message, size_t i_offset) {
  return i_message + " (byte " + std::to_string(i_offset) + ")";
}

[[noreturn]] void fail(const std::string& i_message, size_t i_offset) {
  throw C3DError{atByte(i_message, i_offset)};
}

std::string trimRight(std::string i_text) {
  while (!i_text.empty() && (i_text.back() == ' ' || i_text.back() == '\0'))
    i_text.pop_back();
  return i_text;
}

std::string trim(std::string i_text) {
  i_text = trimRight(std::move(i_text));
  const size_t start = i_text.find_first_not_of(' ');
  return start == std::string::npos ? std::string() : i_text.substr(start);
}

std::string upper(std::string i_text) {
  for (char& c : i_text)
    if (c >= 'a' && c <= 'z') c = char(c - 'a' + 'A');
  return i_text;
}
} // namespace

size_t C3DParameter::count() const {
  size_t n = 1;
  for (int d : dims)
    n *= size_t(d);
  return n;
}

long C3DParameter::intValue(size_t i) const {
  if (i >= count()) return 0;
  switch (type) {
  case C3D::ETypeChar:
  case C3D::ETypeByte:
    return data[i];
  case C3D::ETypeInt16:
    return int16_t(C3D::getU16(&data[i * 2], processor));
  case C3D::ETypeFloat: {
    const float value = C3D::getFloat(&data[i * 4], processor);
    return std::isfinite(value) && std::fabs(value) < 2e9f ? long(value) : 0;
  }
  default:
    return 0;
  }
}

long C3DParameter::unsignedValue(size_t i) const {
  if (type == C3D::ETypeInt16 && i < count()) return C3D::getU16(&data[i * 2], processor);
  return intValue(i);
}

float C3DParameter::floatValue(size_t i) const {
  if (type == C3D::ETypeFloat && i < count()) return C3D::getFloat(&data[i * 4], processor);
  return float(intValue(i));
}

std::vector<std::string> C3DParameter::strings() const {
  std::vector<std::string> result;
  if (type != C3D::ETypeChar) return result;
  if (dims.empty()) {
    result.push_back(trimRight(std::string(data.begin(), data.end())));
    return result;
  }
  const size_t width = size_t(dims[0]);
  const size_t rows = width ? count() / width : 0;
  for (size_t r = 0; r < rows; ++r)
    result.push_back(trimRight(
        std::string(data.begin() + long(r * width), data.begin() + long((r + 1) * width))));
  return result;
}

const C3DParameter* C3DContent::find(const std::string& i_group, const std::string& i_name) const {
  const auto it = m_index.find(i_group + ":" + i_name);
  return it == m_index.end() ? nullptr : &parameters[it->second];
}

/// Reads the three sections of a file in order: header, parameters, frames.
class C3DParser {
public:
  C3DParser(const uint8_t* i_pData, size_t i_size, C3DContent& o_rContent, bool i_decodePoints)
      : m_pData(i_pData), m_size(i_size), m_rOut(o_rContent), m_decodePoints(i_decodePoints) {}

  void parse() {
    readHeaderStart();
    readParameters();
    readLayout();
    readPoints();
    readAnalog();
  }

private:
  void need(size_t i_offset, size_t i_count, const char* i_pWhat) const {
    if (i_offset > m_size || i_count > m_size - i_offset)
      fail(std::string("file ends inside ") + i_pWhat + ": " + std::to_string(i_count) +
               " bytes needed, " + std::to_string(i_offset < m_size ? m_size - i_offset : 0) +
               " left",
           i_offset);
  }
  uint16_t word(size_t i_offset) const { return C3D::getU16(m_pData + i_offset, m_rOut.processor); }
  float real(size_t i_offset) const { return C3D::getFloat(m_pData + i_offset, m_rOut.processor); }

  void readHeaderStart() {
    need(0, C3D::kBlockSize, "the 512-byte header");
    if (m_pData[C3D::HeaderOffset::EKey] != C3D::kFormatKey) {
      char text[96];
      std::snprintf(text, sizeof text, "not a C3D file: header byte 1 is 0x%02X, not 0x50",
                    m_pData[C3D::HeaderOffset::EKey]);
      fail(text, 1);
    }
    const int block = m_pData[C3D::HeaderOffset::EParameterBlock];
    if (block < 2) fail("header names parameter block " + std::to_string(block), 0);
    m_parameterStart = size_t(block - 1) * C3D::kBlockSize;
    need(m_parameterStart, 4, "the parameter section's first 4 bytes");
    const int processor = m_pData[m_parameterStart + 3];
    if (processor != C3D::EProcessorIntel && processor != C3D::EProcessorDec &&
        processor != C3D::EProcessorMips)
      fail("unknown processor type " + std::to_string(processor) +
               " (84 Intel, 85 DEC and 86 MIPS are known)",
           m_parameterStart + 3);
    m_rOut.processor = C3D::EProcessor(processor);
    m_dataBlock = word(C3D::HeaderOffset::EDataStart);
  }

  void readParameters() {
    // The section ends where the frames begin (its block count is not trusted: some writers
    // give a constant).
    size_t end = m_size;
    const size_t dataStart = m_dataBlock > 0 ? size_t(m_dataBlock - 1) * C3D::kBlockSize : 0;
    if (dataStart > m_parameterStart && dataStart < end) end = dataStart;
    std::map<int, std::string> groups;
    size_t pos = m_parameterStart + 4;
    while (pos + 2 <= end) {
      const int nameLength = std::abs(int(int8_t(m_pData[pos])));
      const int id = int8_t(m_pData[pos + 1]);
      if (nameLength == 0 || id == 0) break;
      const size_t record = pos;
      const size_t offsetAt = pos + 2 + size_t(nameLength);
      if (offsetAt + 2 > end) fail("parameter record runs past the parameter section", record);
      std::string name = upper(std::string(m_pData + pos + 2, m_pData + offsetAt));
      const uint16_t next = word(offsetAt);
      size_t cursor = offsetAt + 2;
      if (id < 0) {
        groups.emplace(-id, name);
      } else {
        C3DParameter parameter;
        parameter.name = std::move(name);
        parameter.offset = record;
        parameter.processor = m_rOut.processor;
        readParameterBody(parameter, cursor, end);
        m_groupIds.push_back(id);
        m_rOut.parameters.push_back(std::move(parameter));
      }
      if (next == 0) break;
      pos = offsetAt + next;
    }
    for (size_t i = 0; i < m_rOut.parameters.size(); ++i) {
      C3DParameter& parameter = m_rOut.parameters[i];
      const auto group = groups.find(m_groupIds[i]);
      if (group != groups.end()) parameter.group = group->second;
      m_rOut.m_index.emplace(parameter.group + ":" + parameter.name, i);
    }
  }

  void readParameterBody(C3DParameter& io_rParameter, size_t i_cursor, size_t i_end) {
    const std::string what = "parameter " + io_rParameter.name;
    if (i_cursor + 2 > i_end) fail(what + " runs past the parameter section", io_rParameter.offset);
    io_rParameter.type = int8_t(m_pData[i_cursor]);
    const int dimCount = m_pData[i_cursor + 1];
    if (io_rParameter.type != C3D::ETypeChar && io_rParameter.type != C3D::ETypeByte &&
        io_rParameter.type != C3D::ETypeInt16 && io_rParameter.type != C3D::ETypeFloat)
      fail(what + " has data type " + std::to_string(io_rParameter.type) + " (known: -1, 1, 2, 4)",
           i_cursor);
    i_cursor += 2;
    if (i_cursor + size_t(dimCount) > i_end)
      fail(what + " runs past the parameter section", io_rParameter.offset);
    size_t bytes = size_t(std::abs(io_rParameter.type));
    for (int d = 0; d < dimCount; ++d) {
      io_rParameter.dims.push_back(m_pData[i_cursor + size_t(d)]);
      bytes *= m_pData[i_cursor + size_t(d)];
      if (bytes > kMaxParameterBytes) fail(what + " declares absurd dimensions", i_cursor);
    }
    i_cursor += size_t(dimCount);
    if (i_cursor + bytes > i_end)
      fail(what + " holds " + std::to_string(bytes) + " bytes of data past the parameter section",
           io_rParameter.offset);
    io_rParameter.data.assign(m_pData + i_cursor, m_pData + i_cursor + bytes);
  }

  // Counts, rates and frame range from the header and the parameters.
  void readLayout() {
    const size_t headerPoints = word(C3D::HeaderOffset::EPointCount);
    m_rOut.pointCount = int(headerPoints);
    if (const C3DParameter* p = m_rOut.find("POINT", "USED")) {
      if (p->unsignedValue(0) != long(headerPoints))
        fail("POINT:USED is " + std::to_string(p->unsignedValue(0)) + " but the header counts " +
                 std::to_string(headerPoints) + " points",
             p->offset);
    }
    readFrameRange();
    readScaleAndRate();
    if (!framesFitClock(m_rOut.frameRate, m_rOut.firstFrame,
                        int64_t(m_rOut.firstFrame) + m_rOut.frameCount))
      fail("frames " + std::to_string(m_rOut.firstFrame) + " to " +
               std::to_string(int64_t(m_rOut.firstFrame) + m_rOut.frameCount - 1) + " at " +
               std::to_string(m_rOut.frameRate) + " Hz lie beyond the host's clock",
           C3D::HeaderOffset::EFirstFrame);
    readLabels();
    readAnalogLayout();
  }

  void readFrameRange() {
    long first = word(C3D::HeaderOffset::EFirstFrame);
    long last = word(C3D::HeaderOffset::ELastFrame);
    const C3DParameter* pStart = m_rOut.find("TRIAL", "ACTUAL_START_FIELD");
    const C3DParameter* pEnd = m_rOut.find("TRIAL", "ACTUAL_END_FIELD");
    const C3DParameter* pDruFirst = m_rOut.find("POINT", "DRU_FIRST_FRAME");
    const C3DParameter* pDruLast = m_rOut.find("POINT", "DRU_LAST_FRAME");
    if (pStart && pEnd && pStart->count() >= 2 && pEnd->count() >= 2) {
      first = pStart->unsignedValue(0) | (pStart->unsignedValue(1) << 16);
      last = pEnd->unsignedValue(0) | (pEnd->unsignedValue(1) << 16);
    } else if (pDruFirst || pDruLast) {
      // This family's writer keeps frame numbers above 65534 here as 32-bit integers.
      auto int32 = [](const C3DParameter* i_p, long i_default) {
        if (!i_p || i_p->data.size() != 4) return i_default;
        const uint8_t* b = i_p->data.data();
        return long(int32_t(uint32_t(b[0]) | uint32_t(b[1]) << 8 | uint32_t(b[2]) << 16 |
                            uint32_t(b[3]) << 24));
      };
      first = int32(pDruFirst, first);
      last = int32(pDruLast, last);
    } else if (const C3DParameter* pFrames = m_rOut.find("POINT", "FRAMES")) {
      // A long file keeps the true count here while the header's last frame saturates.
      const long frames =
          pFrames->type == C3D::ETypeFloat ? pFrames->intValue(0) : pFrames->unsignedValue(0);
      if (frames > last - first + 1) last = first + frames - 1;
    }
    if (last < first - 1 || first < 0 || last > std::numeric_limits<int>::max() - 1)
      fail("frame range " + std::to_string(first) + " to " + std::to_string(last) +
               " is not a valid range",
           C3D::HeaderOffset::EFirstFrame);
    m_rOut.firstFrame = int(first);
    m_rOut.frameCount = int(last - first + 1);
  }

  static bool usableScale(float i_scale) { return std::isfinite(i_scale) && i_scale != 0.0f; }

  void readScaleAndRate() {
    // The header and POINT:SCALE may disagree; `resolveScale` chooses once the frames' place is
    // known. Until then the parameter's (or the header's) stands.
    m_headerScale = real(C3D::HeaderOffset::EScale);
    m_rOut.scale = m_headerScale;
    size_t scaleAt = C3D::HeaderOffset::EScale;
    if (const C3DParameter* p = m_rOut.find("POINT", "SCALE")) {
      m_parameterScale = p->floatValue(0);
      m_hasParameterScale = true;
      if (usableScale(m_parameterScale) || !usableScale(m_headerScale)) {
        m_rOut.scale = m_parameterScale;
        scaleAt = p->offset;
      }
    }
    if (!usableScale(m_rOut.scale))
      fail("the point scale is " + std::to_string(m_rOut.scale), scaleAt);
    double rate = real(C3D::HeaderOffset::EFrameRate);
    size_t rateAt = C3D::HeaderOffset::EFrameRate;
    if (const C3DParameter* p = m_rOut.find("POINT", "RATE")) {
      rate = p->floatValue(0);
      rateAt = p->offset;
    }
    if (!(rate > 0.0 && rate <= 1e6))
      fail("frame rate " + std::to_string(rate) + " is not between 0 and 1000000", rateAt);
    m_rOut.frameRate = rate;
    if (const C3DParameter* p = m_rOut.find("POINT", "UNITS")) {
      const auto units = p->strings();
      if (!units.empty()) m_rOut.units = trim(units[0]);
    }
  }

  // Names from the file made printable; one warning per kind of name says how many were not.
  void makePrintable(std::vector<std::string>& io_rNames, const char* i_pWhat) {
    size_t damaged = 0, first = 0;
    for (size_t i = 0; i < io_rNames.size(); ++i) {
      bool changed = false;
      io_rNames[i] = C3D::printableText(io_rNames[i], &changed);
      if (changed && damaged++ == 0) first = i;
    }
    if (damaged > 0)
      m_rOut.warnings.push_back(std::to_string(damaged) + " " + i_pWhat +
                                " held characters that cannot be printed, replaced by '?' (the "
                                "first, number " +
                                std::to_string(first + 1) + ", reads \"" + io_rNames[first] +
                                "\")");
  }

  void readLabels() {
    std::vector<std::string> labels;
    for (int chunk = 1; labels.size() < size_t(m_rOut.pointCount); ++chunk) {
      const C3DParameter* p =
          m_rOut.find("POINT", chunk == 1 ? "LABELS" : "LABELS" + std::to_string(chunk));
      if (!p) break;
      for (std::string& label : p->strings())
        labels.push_back(trim(std::move(label)));
    }
    labels.resize(size_t(m_rOut.pointCount));
    makePrintable(labels, "point labels");
    for (size_t i = 0; i < labels.size(); ++i)
      if (labels[i].empty()) labels[i] = "Point" + std::to_string(i + 1);
    m_rOut.labels = std::move(labels);

    const C3DParameter* pUses = m_rOut.find("SUBJECTS", "USES_PREFIXES");
    const C3DParameter* pPrefixes = m_rOut.find("SUBJECTS", "LABEL_PREFIXES");
    if (!pUses || pUses->intValue(0) == 0 || !pPrefixes) return;
    const C3DParameter* pNames = m_rOut.find("SUBJECTS", "NAMES");
    std::vector<std::string> names = pNames ? pNames->strings() : std::vector<std::string>();
    std::vector<std::string> prefixes = pPrefixes->strings();
    makePrintable(names, "subject names");
    makePrintable(prefixes, "subject label prefixes");
    for (size_t i = 0; i < prefixes.size(); ++i) {
      SubjectPrefix entry{trim(prefixes[i]), i < names.size() ? trim(names[i]) : std::string()};
      if (entry.prefix.empty()) continue;
      if (entry.subject.empty()) {
        entry.subject = entry.prefix;
        while (!entry.subject.empty() && entry.subject.back() == ':')
          entry.subject.pop_back();
      }
      m_rOut.subjectPrefixes.push_back(std::move(entry));
    }
  }

  void readAnalogLayout() {
    const int perFrame = word(C3D::HeaderOffset::EAnalogPerFrame);
    int samples = word(C3D::HeaderOffset::ESamplesPerFrame);
    int channels = 0;
    if (const C3DParameter* p = m_rOut.find("ANALOG", "USED"))
      channels = int(p->unsignedValue(0));
    else if (samples > 0)
      channels = perFrame / samples;
    if (channels > 0 && samples == 0) samples = perFrame / channels;
    if (channels == 0 || samples == 0) channels = samples = 0;
    m_rOut.analogChannels = channels;
    m_rOut.analogSamplesPerFrame = samples;
    if (channels == 0) return;
    m_rOut.analogRate = m_rOut.frameRate * samples;
    if (const C3DParameter* p = m_rOut.find("ANALOG", "RATE")) {
      const double rate = p->floatValue(0);
      if (rate > 0.0 && std::isfinite(rate)) m_rOut.analogRate = rate;
    }
    std::vector<std::string> labels;
    for (int chunk = 1; labels.size() < size_t(channels); ++chunk) {
      const C3DParameter* p =
          m_rOut.find("ANALOG", chunk == 1 ? "LABELS" : "LABELS" + std::to_string(chunk));
      if (!p) break;
      for (std::string& label : p->strings())
        labels.push_back(trim(std::move(label)));
    }
    labels.resize(size_t(channels));
    makePrintable(labels, "analog labels");
    for (size_t i = 0; i < labels.size(); ++i)
      if (labels[i].empty()) labels[i] = "Analog" + std::to_string(i + 1);
    m_rOut.analogLabels = std::move(labels);
    readAnalogCalibration();
  }

  void readAnalogCalibration() {
    const size_t channels = size_t(m_rOut.analogChannels);
    m_rOut.analogOffsets.assign(channels, 0.0);
    m_rOut.analogScales.assign(channels, 1.0);
    m_rOut.analogUnits.assign(channels, std::string());
    if (const C3DParameter* p = m_rOut.find("ANALOG", "OFFSET"))
      for (size_t c = 0; c < channels && c < p->count(); ++c)
        m_rOut.analogOffsets[c] = double(p->intValue(c));
    double general = 1.0;
    if (const C3DParameter* p = m_rOut.find("ANALOG", "GEN_SCALE")) {
      const double value = p->floatValue(0);
      if (std::isfinite(value) && value != 0.0) general = value;
    }
    const C3DParameter* pScale = m_rOut.find("ANALOG", "SCALE");
    for (size_t c = 0; c < channels; ++c) {
      double scale = pScale && c < pScale->count() ? pScale->floatValue(c) : 1.0;
      if (!std::isfinite(scale)) scale = 1.0;
      m_rOut.analogScales[c] = scale * general;
    }
    if (const C3DParameter* p = m_rOut.find("ANALOG", "UNITS")) {
      std::vector<std::string> units = p->strings();
      units.resize(channels);
      for (std::string& unit : units)
        unit = trim(std::move(unit));
      makePrintable(units, "analog units");
      m_rOut.analogUnits = std::move(units);
    }
  }

  // Checks that every frame lies inside the file before anything is allocated for it.
  size_t frameBytes(bool i_isFloat) const {
    const size_t valueSize = i_isFloat ? 4 : 2;
    return valueSize * (size_t(m_rOut.pointCount) * 4 +
                        size_t(m_rOut.analogSamplesPerFrame) * size_t(m_rOut.analogChannels));
  }
  size_t frameBytes() const { return frameBytes(m_rOut.scale < 0.0f); }

  // Whether frames of one form fill the data exactly (up to the padding of the last block), or
  // at least fit in it.
  bool formFitsData(bool i_isFloat) const {
    const size_t bytes = frameBytes(i_isFloat);
    return bytes == 0 || size_t(m_rOut.frameCount) <= (m_size - m_dataStart) / bytes;
  }
  bool formFillsData(bool i_isFloat) const {
    if (!formFitsData(i_isFloat)) return false;
    const size_t need = frameBytes(i_isFloat) * size_t(m_rOut.frameCount);
    return m_size - m_dataStart - need < size_t(C3D::kBlockSize);
  }

  // The largest coordinate, in millimetres, that integer frames give with a scale of 1.
  double largestIntegerCoordinate() const {
    const size_t bytes = frameBytes(false);
    if (bytes == 0) return 0.0;
    const size_t frames = std::min(size_t(m_rOut.frameCount), (m_size - m_dataStart) / bytes);
    int largest = 0;
    for (size_t f = 0; f < frames; ++f)
      for (size_t i = 0; i < size_t(m_rOut.pointCount); ++i) {
        const size_t at = m_dataStart + f * bytes + i * 8;
        if (int16_t(word(at + 6)) < 0) continue; // a gap
        for (size_t k = 0; k < 3; ++k)
          largest = std::max(largest, std::abs(int(int16_t(word(at + 2 * k)))));
      }
    const double toMillimetres = millimetresPer(m_rOut.units);
    return double(largest) * (toMillimetres > 0.0 ? toMillimetres : 1.0);
  }

  // The header's scale and POINT:SCALE disagree: the sign says which form the frames take, the
  // magnitude what an integer step is worth. Chosen, with a warning:
  // - the form whose frames fill the data (then the one whose frames fit), else the parameter's;
  // - for integer frames of two magnitudes, the one whose largest coordinate is plausible for a
  //   capture volume (kPlausibleMm); when both or neither are, the header's, which is written
  //   with the frames themselves while parameters are often edited by other programs later.
  void resolveScale() {
    const float header = m_headerScale, parameter = m_parameterScale;
    if (!m_hasParameterScale || !usableScale(header) || !usableScale(parameter) ||
        header == parameter)
      return;
    std::string reason;
    bool isFloat = parameter < 0.0f;
    if ((header < 0.0f) != (parameter < 0.0f)) {
      const bool floatFills = formFillsData(true), integerFills = formFillsData(false);
      if (floatFills != integerFills) {
        isFloat = floatFills;
        reason = "its sign gives frames that fill the data";
      } else if (formFitsData(true) != formFitsData(false)) {
        isFloat = formFitsData(true);
        reason = "its sign gives frames that fit in the file";
      } else {
        reason = "the data do not tell the forms apart";
      }
    }
    float chosen = isFloat == (parameter < 0.0f) ? parameter : header;
    if (!isFloat && std::fabs(header) != std::fabs(parameter) && header > 0.0f &&
        parameter > 0.0f) {
      const double largest = largestIntegerCoordinate();
      const auto plausible = [&](float i_scale) {
        const double mm = largest * double(i_scale);
        return mm >= kPlausibleMm[0] && mm <= kPlausibleMm[1];
      };
      if (plausible(parameter) && !plausible(header)) {
        chosen = parameter;
        reason = "only it gives coordinates of a plausible size";
      } else if (plausible(header) && !plausible(parameter)) {
        chosen = header;
        reason = "only it gives coordinates of a plausible size";
      } else {
        chosen = header;
        reason = "the header's scale is written with the frames";
      }
    }
    char text[200];
    std::snprintf(text, sizeof text,
                  "the header's point scale %g and POINT:SCALE %g disagree; %g is used (%s)",
                  double(header), double(parameter), double(chosen), reason.c_str());
    m_rOut.warnings.push_back(text);
    m_rOut.scale = chosen;
  }

  void readPoints() {
    if (m_dataBlock == 0) fail("the header's data start block is 0", C3D::HeaderOffset::EDataStart);
    m_dataStart = size_t(m_dataBlock - 1) * C3D::kBlockSize;
    if (m_dataStart > m_size)
      fail("the frames start at byte " + std::to_string(m_dataStart) + ", past the end of the file",
           C3D::HeaderOffset::EDataStart);
    resolveScale();
    const size_t bytes = frameBytes();
    const size_t available = m_size - m_dataStart;
    if (bytes > 0 && size_t(m_rOut.frameCount) > available / bytes) {
      // Some writers declare more frames than they wrote; a file that stops at the end of a
      // frame is read as far as it goes, one that stops inside a frame is truncated.
      const size_t whole = available / bytes;
      if (available % bytes != 0)
        fail("file ends inside frame " + std::to_string(whole + 1) + " of " +
                 std::to_string(m_rOut.frameCount) + " (frames of " + std::to_string(bytes) +
                 " bytes from byte " + std::to_string(m_dataStart) + ")",
             m_size);
      m_rOut.warnings.push_back("the file declares " + std::to_string(m_rOut.frameCount) +
                                " frames but holds " + std::to_string(whole) + "; " +
                                std::to_string(whole) + " read");
      m_rOut.frameCount = int(whole);
    }
    m_rOut.dataStart = m_dataStart;
    m_rOut.frameBytes = bytes;
    if (!m_decodePoints || m_rOut.pointCount == 0) return;
    m_rOut.points.resize(size_t(m_rOut.frameCount) * size_t(m_rOut.pointCount) * 4);
    decodeC3DPoints(m_rOut, m_pData, 0, size_t(m_rOut.frameCount), m_rOut.points.data());
  }

  void readAnalog() {
    const size_t channels = size_t(m_rOut.analogChannels);
    if (channels == 0) return;
    const std::vector<double>& offsets = m_rOut.analogOffsets;
    bool isUnsigned = false;
    if (const C3DParameter* p = m_rOut.find("ANALOG", "FORMAT")) {
      const auto format = p->strings();
      isUnsigned = !format.empty() && upper(trim(format[0])) == "UNSIGNED";
    }
    const bool isFloat = m_rOut.scale < 0.0f;
    const size_t valueSize = isFloat ? 4 : 2;
    const size_t samples = size_t(m_rOut.analogSamplesPerFrame);
    const size_t frames = size_t(m_rOut.frameCount);
    const size_t pointBytes = size_t(m_rOut.pointCount) * 4 * valueSize;
    m_rOut.analog.resize(frames * samples * channels);
    double* pOut = m_rOut.analog.data();
    const size_t bytes = frameBytes();
    for (size_t f = 0; f < frames; ++f) {
      size_t at = m_dataStart + f * bytes + pointBytes;
      for (size_t s = 0; s < samples; ++s)
        for (size_t c = 0; c < channels; ++c, at += valueSize) {
          double raw;
          if (isFloat)
            raw = C3D::getFloat(m_pData + at, m_rOut.processor);
          else if (isUnsigned)
            raw = word(at);
          else
            raw = int16_t(word(at));
          *pOut++ = std::isfinite(raw) ? raw - offsets[c] : 0.0;
        }
    }
  }

  const uint8_t* m_pData;
  size_t m_size;
  C3DContent& m_rOut;
  bool m_decodePoints;
  float m_headerScale = 0.0f;
  float m_parameterScale = 0.0f;
  bool m_hasParameterScale = false;
  size_t m_parameterStart = 0;
  size_t m_dataStart = 0;
  int m_dataBlock = 0;
  std::vector<int> m_groupIds;
};

namespace {
// Points of frames in one number form: `i_read` gives the four values of one point as floats.
template <typename Read>
void decodeFrames(const uint8_t* i_pFrames, size_t i_frameBytes, size_t i_frames, size_t i_points,
                  size_t i_pointBytes, float* o_pOut, Read i_read) {
  for (size_t f = 0; f < i_frames; ++f) {
    const uint8_t* p = i_pFrames + f * i_frameBytes;
    for (size_t i = 0; i < i_points; ++i, p += i_pointBytes, o_pOut += 4) {
      i_read(p, o_pOut);
      if (!std::isfinite(o_pOut[0]) || !std::isfinite(o_pOut[1]) || !std::isfinite(o_pOut[2]))
        o_pOut[3] = -1.0f;
    }
  }
}
} // namespace

void decodeC3DPoints(const C3DContent& i_rContent, const uint8_t* i_pData, size_t i_firstFrame,
                     size_t i_frameCount, float* o_pPoints) {
  decodeC3DPoints(i_rContent, i_pData, i_firstFrame, i_frameCount, 0, size_t(i_rContent.pointCount),
                  o_pPoints);
}

void decodeC3DPoints(const C3DContent& i_rContent, const uint8_t* i_pData, size_t i_firstFrame,
                     size_t i_frameCount, size_t i_firstPoint, size_t i_pointCount,
                     float* o_pPoints) {
  const size_t points = i_pointCount;
  const size_t bytes = i_rContent.frameBytes;
  const size_t pointBytes = i_rContent.scale < 0.0f ? 16 : 8;
  const uint8_t* pFrames =
      i_pData + i_rContent.dataStart + i_firstFrame * bytes + i_firstPoint * pointBytes;
  const C3D::EProcessor processor = i_rContent.processor;
  // One loop per number form, so that none chooses per value.
  if (i_rContent.scale < 0.0f) {
    auto floats = [&](auto i_read) {
      decodeFrames(pFrames, bytes, i_frameCount, points, 16, o_pPoints,
                   [&](const uint8_t* i_p, float* o_p) {
                     for (int k = 0; k < 4; ++k)
                       o_p[k] = i_read(i_p + 4 * k);
                   });
    };
    if (processor == C3D::EProcessorDec)
      floats([](const uint8_t* i_p) { return C3D::decToIeee(i_p); });
    else if (processor == C3D::EProcessorMips)
      floats([](const uint8_t* i_p) { return C3D::getFloat(i_p, C3D::EProcessorMips); });
    else
      floats([](const uint8_t* i_p) { return C3D::getFloat(i_p, C3D::EProcessorIntel); });
    return;
  }
  const float scale = std::fabs(i_rContent.scale);
  auto words = [&](auto i_word) {
    decodeFrames(pFrames, bytes, i_frameCount, points, 8, o_pPoints,
                 [&](const uint8_t* i_p, float* o_p) {
                   for (int k = 0; k < 3; ++k)
                     o_p[k] = float(int16_t(i_word(i_p + 2 * k))) * scale;
                   const int16_t residual = int16_t(i_word(i_p + 6));
                   o_p[3] = residual < 0 ? -1.0f : float(residual & 0xFF) * scale;
                 });
  };
  if (processor == C3D::EProcessorMips)
    words([](const uint8_t* i_p) { return C3D::getU16BE(i_p); });
  else
    words([](const uint8_t* i_p) { return C3D::getU16LE(i_p); });
}

bool parseC3D(const uint8_t* i_pData, size_t i_size, C3DContent& o_rContent, std::string& o_rError,
              bool i_decodePoints) {
  o_rContent = C3DContent();
  try {
    C3DParser(i_pData, i_size, o_rContent, i_decodePoints).parse();
    return true;
  } catch (const C3DError& e) {
    // Messages quote names from the file, which may hold NULs or control characters.
    o_rError = C3D::printableText(e.message);
    return false;
  }
}

} // namespace AnvilCore
