// Large buffers of the tool (file texts, records, the product) are written
// once from end to end; on Linux they are offered large pages, which spares
// one page fault per 4 KiB of them.
#pragma once

#include <cstddef>

namespace tsd_cli {

// A hint about [data, data + size); does nothing where it does not apply.
void adviseLargePages(void* data, std::size_t size);

// Reserves room for `count` elements of `buffer` (a std::vector or
// std::string) and offers it large pages.
template <class Buffer>
void reserveLarge(Buffer& buffer, std::size_t count) {
    buffer.reserve(count);
    adviseLargePages(buffer.data(), buffer.capacity() * sizeof(*buffer.data()));
}

} // namespace tsd_cli
