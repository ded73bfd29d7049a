#include "C3DTestFile.h"
#include <cmath>
#include <cstring>

namespace {
struct Record {
  int group;
  std::string name;
  int type;
  std::vector<int> dims;
  std::vector<uint8_t> data;
};

std::vector<uint8_t> chars(const std::vector<std::string>& i_rows, int i_width) {
  std::vector<uint8_t> data;
  for (const std::string& row : i_rows) {
    std::string padded = row;
    padded.resize(size_t(i_width), ' ');
    data.insert(data.end(), padded.begin(), padded.end());
  }
  return data;
}

int widest(const std::vector<std::string>& i_rows) {
  size_t width = 1;
  for (const std::string& row : i_rows)
    width = std::max(width, row.size());
  return int(width);
}
} // namespace

std::vector<uint8_t> C3DTestFile::word(int i_value) const {
  const uint16_t v = uint16_t(i_value);
  if (processor == C3D::EProcessorMips) return {uint8_t(v >> 8), uint8_t(v & 0xFF)};
  return {uint8_t(v & 0xFF), uint8_t(v >> 8)};
}

std::vector<uint8_t> C3DTestFile::real(float i_value) const {
  uint8_t b[4];
  if (processor == C3D::EProcessorDec) {
    C3D::ieeeToDec(i_value, b);
  } else {
    C3D::putFloatIntel(b, i_value);
    if (processor == C3D::EProcessorMips) {
      std::swap(b[0], b[3]);
      std::swap(b[1], b[2]);
    }
  }
  return {b[0], b[1], b[2], b[3]};
}

void C3DTestFile::fillLinear(int i_points, int i_frames) {
  labels.clear();
  for (int p = 0; p < i_points; ++p)
    labels.push_back(std::string("M").append(std::to_string(p + 1)));
  frames.assign(size_t(i_frames), std::vector<std::array<float, 4>>(size_t(i_points)));
  for (int f = 0; f < i_frames; ++f)
    for (int p = 0; p < i_points; ++p)
      frames[size_t(f)][size_t(p)] = {float(p * 10 + f), float(-p), float(f) * 0.5f, 1.0f};
}

std::vector<uint8_t> C3DTestFile::build() const {
  const int points = int(labels.size());
  const int channels = int(analogLabels.size());
  const int frameCount = int(frames.size());
  const int lastFrame = firstFrame + frameCount - 1;
  std::vector<Record> records;
  auto add = [&](int g, const std::string& n, int t, std::vector<int> d, std::vector<uint8_t> v) {
    records.push_back({g, n, t, std::move(d), std::move(v)});
  };
  if (writeUsed) add(1, "USED", 2, {}, word(points));
  add(1, "SCALE", 4, {}, real(parameterScale != 0.0f ? parameterScale : scale));
  add(1, "RATE", 4, {}, real(rate));
  add(1, "FRAMES", 2, {}, word(frameCount));
  for (int chunk = 0; chunk * 255 < std::max(points, 1); ++chunk) {
    std::vector<std::string> rows(labels.begin() + chunk * 255,
                                  labels.begin() + std::min(points, chunk * 255 + 255));
    add(1, chunk == 0 ? "LABELS" : "LABELS" + std::to_string(chunk + 1), -1, {16, int(rows.size())},
        chars(rows, 16));
  }
  add(1, "UNITS", -1, {int(units.size())}, chars({units}, int(units.size())));
  if (channels > 0) {
    add(2, "USED", 2, {}, word(channels));
    add(2, "LABELS", -1, {widest(analogLabels), channels},
        chars(analogLabels, widest(analogLabels)));
    std::vector<uint8_t> offsets;
    for (int c = 0; c < channels; ++c) {
      const auto w = word(c < int(analogOffsets.size()) ? analogOffsets[size_t(c)] : 0);
      offsets.insert(offsets.end(), w.begin(), w.end());
    }
    add(2, "OFFSET", 2, {channels}, offsets);
    add(2, "RATE", 4, {},
        real(analogRate != 0.0f ? analogRate : rate * float(analogSamplesPerFrame)));
  }
  if (!subjectPrefixes.empty()) {
    add(3, "USES_PREFIXES", 2, {}, word(1));
    add(3, "LABEL_PREFIXES", -1, {widest(subjectPrefixes), int(subjectPrefixes.size())},
        chars(subjectPrefixes, widest(subjectPrefixes)));
  }
  if (!subjectNames.empty())
    add(3, "NAMES", -1, {widest(subjectNames), int(subjectNames.size())},
        chars(subjectNames, widest(subjectNames)));
  for (const Extra& e : extras)
    add(e.group, e.name, e.type, e.dims, e.data);

  std::vector<uint8_t> params = {0x01, 0x50, 0x00, uint8_t(processor)};
  const char* groupNames[] = {"", "POINT", "ANALOG", "SUBJECTS", "TRIAL"};
  for (int g = 1; g <= 4; ++g) {
    const std::string name = groupNames[g];
    params.push_back(uint8_t(name.size()));
    params.push_back(uint8_t(-g));
    params.insert(params.end(), name.begin(), name.end());
    const auto next = word(3);
    params.insert(params.end(), next.begin(), next.end());
    params.push_back(0);
  }
  for (const Record& r : records) {
    params.push_back(uint8_t(r.name.size()));
    params.push_back(uint8_t(r.group));
    params.insert(params.end(), r.name.begin(), r.name.end());
    const int size = 2 + 2 + int(r.dims.size()) + int(r.data.size()) + 1;
    const auto next = word(size);
    params.insert(params.end(), next.begin(), next.end());
    params.push_back(uint8_t(int8_t(r.type)));
    params.push_back(uint8_t(r.dims.size()));
    for (int d : r.dims)
      params.push_back(uint8_t(d));
    params.insert(params.end(), r.data.begin(), r.data.end());
    params.push_back(0);
  }
  params.push_back(0);
  const size_t paramBlocks = (params.size() + 511) / 512;
  params[2] = uint8_t(paramBlocks);
  const int dataBlock = int(2 + paramBlocks);

  std::vector<uint8_t> file(512, 0);
  auto put = [&](size_t at, const std::vector<uint8_t>& bytes) {
    std::memcpy(&file[at], bytes.data(), bytes.size());
  };
  file[0] = 2;
  file[1] = 0x50;
  put(2, word(points));
  put(4, word(channels * analogSamplesPerFrame));
  put(6, word(firstFrame));
  put(8, word(lastFrame));
  put(12, real(scale));
  put(16, word(dataBlock));
  put(18, word(analogSamplesPerFrame));
  put(20, real(rate));
  file.insert(file.end(), params.begin(), params.end());
  file.resize(size_t(dataBlock - 1) * 512, 0);
  for (int f = 0; f < frameCount; ++f) {
    for (int p = 0; p < points; ++p) {
      const auto& v = frames[size_t(f)][size_t(p)];
      for (int k = 0; k < 4; ++k) {
        std::vector<uint8_t> bytes;
        if (scale < 0.0f)
          bytes = real(v[size_t(k)]);
        else if (k < 3)
          bytes = word(int(std::lround(v[size_t(k)] / scale)));
        else
          bytes = word(v[3] < 0.0f ? -1 : int(std::lround(v[3] / scale)) & 0xFF);
        file.insert(file.end(), bytes.begin(), bytes.end());
      }
    }
    if (f < int(analogReal.size()))
      for (float value : analogReal[size_t(f)]) {
        const auto bytes = real(value);
        file.insert(file.end(), bytes.begin(), bytes.end());
      }
    else if (f < int(analog.size()))
      for (int value : analog[size_t(f)]) {
        const auto bytes = scale < 0.0f ? real(float(value)) : word(value);
        file.insert(file.end(), bytes.begin(), bytes.end());
      }
  }
  return file;
}
