#pragma once
// Compresses arrays with zlib (RFC 1950 streams, level 1) straight into the output, with one
// stream kept between arrays: setting a stream up costs more than a small array's compression.
#include "fbx/FbxByteSink.h"
#include <cstddef>
#include <memory>

struct z_stream_s;

namespace AnvilFbx {

class VFbxDeflater {
public:
  VFbxDeflater();
  ~VFbxDeflater();
  VFbxDeflater(const VFbxDeflater&) = delete;
  VFbxDeflater& operator=(const VFbxDeflater&) = delete;

  /// Appends the compressed form of `i_size` bytes to the sink and gives its length, or gives 0
  /// and leaves the sink as it was when the compressed form would not be shorter.
  size_t compress(const void* i_pData, size_t i_size, VFbxByteSink& io_rSink);

private:
  struct Stream;
  std::unique_ptr<Stream> m_pStream;
};

} // namespace AnvilFbx
