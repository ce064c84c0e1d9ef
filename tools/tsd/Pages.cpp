#include "Pages.h"

#include <cstdint>

#ifdef __linux__
#include <sys/mman.h>
#endif

namespace tsd_cli {

void adviseLargePages(void* data, std::size_t size) {
#if defined(__linux__) && defined(MADV_HUGEPAGE)
    constexpr std::uintptr_t kLarge = std::uintptr_t(1) << 21;
    auto begin = (reinterpret_cast<std::uintptr_t>(data) + kLarge - 1) & ~(kLarge - 1);
    auto end = (reinterpret_cast<std::uintptr_t>(data) + size) & ~(kLarge - 1);
    if (end > begin)
        madvise(reinterpret_cast<void*>(begin), end - begin, MADV_HUGEPAGE); // a hint: failure is fine
#else
    (void)data;
    (void)size;
#endif
}

} // namespace tsd_cli
