#include "codec/Cursor.h"

namespace codec {

std::size_t Cursor::countAdjacent(const std::uint8_t* position, const std::uint8_t* end,
                                  std::uint64_t key) {
  Cursor ahead(position, end);
  std::size_t count = 1;
  for (;;) {
    std::uint64_t length = 0;
    if (!ahead.readLength(length)) return count;
    ahead.position_ += length;
    if (!ahead.hasMore() || ahead.readVarint() != key) return count;
    ++count;
  }
}

}  // namespace codec
