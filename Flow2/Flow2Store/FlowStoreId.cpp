#include "Flow2/Flow2Store/FlowStoreId.h"

#include <boost/uuid/entropy_error.hpp>

#include <cerrno>
#include <sys/random.h>

namespace Flow2Store {

std::uint64_t FlowStoreIdFromBytes(std::array<std::uint8_t, 16> bytes) {
  bytes[6] = static_cast<std::uint8_t>((bytes[6] & 0x0F) | 0x40);
  bytes[8] = static_cast<std::uint8_t>((bytes[8] & 0x3F) | 0x80);
  std::uint64_t high = 0;
  std::uint64_t low = 0;
  for (int i = 0; i < 8; ++i) {
    high = (high << 8) | bytes[i];
    low = (low << 8) | bytes[8 + i];
  }
  return high ^ low;
}

std::array<std::uint8_t, 16> RandomBytes16() {
  std::array<std::uint8_t, 16> bytes{};
  std::size_t have = 0;
  while (have < bytes.size()) {
    const ssize_t got = getrandom(bytes.data() + have, bytes.size() - have, 0);
    if (got < 0) {
      if (errno == EINTR) continue;
      throw boost::uuids::entropy_error(static_cast<unsigned long>(errno), "getrandom");
    }
    have += static_cast<std::size_t>(got);
  }
  return bytes;
}

std::uint64_t NewFlowStoreId() {
  std::uint64_t id = 0;
  while (id == 0)
    id = FlowStoreIdFromBytes(RandomBytes16());
  return id;
}

} // namespace Flow2Store
