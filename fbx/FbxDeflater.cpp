#include "FbxDeflater.h"
#include <algorithm>
#include <stdexcept>
#include <zlib.h>

namespace AnvilFbx {

namespace {
// Level 1: key data are large and the time saved outweighs the few bytes more.
constexpr int kLevel = 1;
} // namespace

struct VFbxDeflater::Stream {
  z_stream z{};
  bool ready = false;
  ~Stream() {
    if (ready) deflateEnd(&z);
  }
};

VFbxDeflater::VFbxDeflater() : m_pStream(std::make_unique<Stream>()) {}
VFbxDeflater::~VFbxDeflater() = default;

size_t VFbxDeflater::compress(const void* i_pData, size_t i_size, VFbxByteSink& io_rSink) {
  z_stream& z = m_pStream->z;
  if (!m_pStream->ready) {
    if (deflateInit(&z, kLevel) != Z_OK) throw std::runtime_error("zlib cannot start");
    m_pStream->ready = true;
  } else if (deflateReset(&z) != Z_OK) {
    throw std::runtime_error("zlib cannot restart");
  }
  const uint64_t start = io_rSink.size();
  z.next_in = static_cast<Bytef*>(const_cast<void*>(i_pData));
  z.avail_in = uInt(i_size);
  // The output goes into the sink's blocks as it comes; a form as long as the data is of no use,
  // so the stream stops there.
  size_t produced = 0;
  for (;;) {
    const std::span<uint8_t> room = io_rSink.tail();
    const size_t n = std::min(room.size(), i_size - produced);
    if (n == 0) break;
    z.next_out = room.data();
    z.avail_out = uInt(n);
    const int status = deflate(&z, Z_FINISH);
    const size_t used = n - z.avail_out;
    io_rSink.grow(used);
    produced += used;
    if (status == Z_STREAM_END) {
      if (produced < i_size) return produced;
      break;
    }
    if (status != Z_OK) break;
  }
  io_rSink.truncate(start);
  return 0;
}

} // namespace AnvilFbx
