#pragma once
// Devices beside the cameras (force plates, analog boards, audio and video sources) and the
// samples they deliver. Fields beyond a record's first listed ones carry what a reader needs to
// rebuild the device; they are written after them.

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace CoreOstraTypes {

/// One output of a device: a named group of channels in one unit.
struct VDeviceOutput {
  static constexpr const char* FlowClassName = "DeviceOutput";
  std::string m_Name;
  std::string m_Units;
  std::vector<std::string> m_Channels;
  bool operator==(const VDeviceOutput&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Name", "Output name", s.m_Name);
    v("Units", "Unit of every channel", s.m_Units);
    v("Channels", "Channel names", s.m_Channels);
  }
};

struct VDevice {
  static constexpr const char* FlowClassName = "Device";
  std::uint32_t m_SourceId = 0; ///< the device id
  std::vector<VDeviceOutput> m_Outputs;
  std::string m_Name;
  bool operator==(const VDevice&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SourceId", "Device id", s.m_SourceId);
    v("Outputs", "Outputs of the device", s.m_Outputs);
    v("Name", "Device name", s.m_Name);
  }
};

/// Display and application settings of a device and of each of its outputs, as key and value.
struct VDeviceApplicationData {
  static constexpr const char* FlowClassName = "DeviceApplicationData";
  std::string m_DeviceURN;
  std::map<std::string, std::string> m_DeviceData;
  std::vector<std::map<std::string, std::string>> m_OutputData; ///< one per output
  bool operator==(const VDeviceApplicationData&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Device", s.m_DeviceURN);
    v("DeviceData", "Settings of the device", s.m_DeviceData);
    v("OutputData", "Settings of each output", s.m_OutputData);
  }
};

/// One frame's samples of a device: `SampleCount` samples of each listed output's channels,
/// sample by sample, channel by channel within a sample.
struct VDeviceSamples {
  static constexpr const char* FlowClassName = "DeviceSamples";
  std::string m_DeviceURN;
  std::uint32_t m_SampleCount = 0;
  std::vector<std::uint32_t> m_OutputIndices;
  std::vector<double> m_DataBuffer;
  bool operator==(const VDeviceSamples&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Device", s.m_DeviceURN);
    v("SampleCount", "Samples per channel in this frame", s.m_SampleCount);
    v("OutputIndices", "Outputs present, in order", s.m_OutputIndices);
    v("DataBuffer", "Samples, interleaved by channel", s.m_DataBuffer);
  }
};

struct VDeviceWarnings {
  static constexpr const char* FlowClassName = "DeviceWarnings";
  std::vector<std::string> m_Warnings;
  std::string m_DeviceName;
  bool operator==(const VDeviceWarnings&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Warnings", "Warnings raised by the device", s.m_Warnings);
    v("DeviceName", "Device name", s.m_DeviceName);
  }
};

/// Sample formats of raw analogue and audio buffers. Values are stored in files; never renumber.
enum class ESampleFormat : std::uint32_t { Int16 = 0, Int32 = 1, Float32 = 2, Float64 = 3 };

/// Raw samples of an analogue board, channel-interleaved in the given format.
struct VAnalogueBlock {
  static constexpr const char* FlowClassName = "AnalogueBlock";
  std::string m_DeviceURN;
  std::vector<std::uint32_t> m_ChannelIndices;
  ESampleFormat m_SampleFormat = ESampleFormat::Int16;
  std::vector<std::uint8_t> m_DataBuffer;
  bool operator==(const VAnalogueBlock&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Device", s.m_DeviceURN);
    v("ChannelIndices", "Channels present, in order", s.m_ChannelIndices);
    v("SampleFormat", "Format of one sample", s.m_SampleFormat);
    v("DataBuffer", "Samples, interleaved by channel", s.m_DataBuffer);
  }
};

struct VAudioFrameInfo {
  static constexpr const char* FlowClassName = "AudioFrameInfo";
  double m_SampleRate = 0.0;
  std::uint32_t m_ChannelCount = 0;
  ESampleFormat m_SampleFormat = ESampleFormat::Int16;
  bool operator==(const VAudioFrameInfo&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SampleRate", "Samples per second", s.m_SampleRate);
    v("ChannelCount", "Channels", s.m_ChannelCount);
    v("SampleFormat", "Format of one sample", s.m_SampleFormat);
  }
};

struct VAudioFrame {
  static constexpr const char* FlowClassName = "AudioFrame";
  std::string m_DeviceURN;
  VAudioFrameInfo m_AudioFrameInfo;
  std::vector<std::vector<std::uint8_t>> m_DataBuffers; ///< one per channel
  bool operator==(const VAudioFrame&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Device", s.m_DeviceURN);
    v("AudioFrameInfo", "Format of the buffers", s.m_AudioFrameInfo);
    v("DataBuffers", "Samples of each channel", s.m_DataBuffers);
  }
};

struct VVideoFrameInfo {
  static constexpr const char* FlowClassName = "VideoFrameInfo";
  bool m_Inverted = false; ///< rows bottom to top
  double m_PixelAspectRatio = 1.0;
  std::uint32_t m_InterlacedFormat = 0; ///< 0 progressive, 1 upper field first, 2 lower
  std::uint32_t m_Width = 0;
  std::uint32_t m_Height = 0;
  std::string m_PixelFormat; ///< such as "RGB8"
  bool operator==(const VVideoFrameInfo&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Inverted", "Rows run bottom to top", s.m_Inverted);
    v("PixelAspectRatio", "Pixel width over height", s.m_PixelAspectRatio);
    v("InterlacedFormat", "Progressive or field order", s.m_InterlacedFormat);
    v("Width", "Pixels per row", s.m_Width);
    v("Height", "Rows", s.m_Height);
    v("PixelFormat", "Layout of one pixel", s.m_PixelFormat);
  }
};

struct VVideoFrame {
  static constexpr const char* FlowClassName = "VideoFrame";
  std::string m_DeviceURN;
  VVideoFrameInfo m_VideoFrameInfo;
  std::vector<std::uint8_t> m_DataBuffer;
  bool operator==(const VVideoFrame&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Device", s.m_DeviceURN);
    v("VideoFrameInfo", "Format of the image", s.m_VideoFrameInfo);
    v("DataBuffer", "Pixels", s.m_DataBuffer);
  }
};

} // namespace CoreOstraTypes
