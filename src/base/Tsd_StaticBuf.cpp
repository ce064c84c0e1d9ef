#include "tsd/Tsd_StaticBuf.h"

#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_PropBuffers.h"
#include "internal/Tsd_Report.h"

#include <climits>
#include <cstring>
#include <string>

Tsd_StaticBuf::Tsd_StaticBuf(int initialSize, int increment)
    : m_limit(initialSize > 0 ? initialSize : 1), m_size(1),
      m_increment(increment > 0 ? increment : 1) {
    m_buffer = std::make_unique<char[]>(static_cast<size_t>(m_limit));
    m_buffer[0] = 0;
}

Tsd_StaticBuf::~Tsd_StaticBuf() = default;

int Tsd_StaticBuf::grownLimit(long long needed) const {
    long long limit = m_limit;
    if (needed > limit) {
        long long steps = (needed - limit + m_increment - 1) / m_increment;
        limit += steps * m_increment;
    }
    if (limit > INT_MAX)
        TSD_MSG().fatal(2, "Tsd_StaticBuf cannot hold %lld bytes.\n", needed);
    return static_cast<int>(limit);
}

void Tsd_StaticBuf::cat(const char* s) {
    if (s == nullptr || *s == 0)
        return;
    size_t n = std::strlen(s);
    if (static_cast<long long>(n) > static_cast<long long>(m_limit) - m_size) {
        int limit = grownLimit(static_cast<long long>(m_size) + static_cast<long long>(n));
        auto grown = std::make_unique<char[]>(static_cast<size_t>(limit));
        std::memcpy(grown.get(), m_buffer.get(), static_cast<size_t>(m_size));
        // `s` may point into the old block: append before releasing it.
        std::memcpy(grown.get() + m_size - 1, s, n + 1);
        m_buffer = std::move(grown);
        m_limit = limit;
    } else {
        std::memmove(m_buffer.get() + m_size - 1, s, n + 1);
    }
    m_size += static_cast<int>(n);
}

void Tsd_StaticBuf::copy(const char* s) {
    if (s == nullptr || *s == 0) {
        clear();
        return;
    }
    size_t n = std::strlen(s);
    if (static_cast<long long>(n) >= m_limit) {
        // Grows until n is below the limit; the old contents are not kept,
        // but `s` may point into them, so it is copied before the old block goes.
        int limit = grownLimit(static_cast<long long>(n) + 1);
        auto grown = std::make_unique<char[]>(static_cast<size_t>(limit));
        std::memcpy(grown.get(), s, n + 1);
        m_buffer = std::move(grown);
        m_limit = limit;
    } else {
        std::memmove(m_buffer.get(), s, n + 1);
    }
    m_size = static_cast<int>(n) + 1;
}

void Tsd_StaticBuf::clear() {
    m_buffer[0] = 0;
    m_size = 1;
}

void Tsd_StaticBuf::dumpStats() const {
    Message msg = TSD_MSG();
    msg.status("Tsd_StaticBuf::dumpStats()\n");
    msg.status("   current limit: %ld\n", static_cast<long>(m_limit));
    msg.status("   current size:  %ld\n", static_cast<long>(m_size));
    msg.status("   contents: %s\n", m_buffer.get());
    bool lengthOk = static_cast<size_t>(m_size - 1) == std::strlen(m_buffer.get());
    msg.status("   length validation: %s\n", lengthOk ? "okay" : "FAIL");
    msg.status("   limit validation: %s\n", m_size > m_limit ? "FAIL" : "okay");
}

const char* Tsd_Util::getAnnoName(const char* name) {
    static Tsd_StaticBuf buffer(32, 16);
    if (name == nullptr || *name == 0)
        return "\"\"";
    // Composed apart first: `name` may point into the buffer.
    static std::string text;
    text.clear();
    tsd_detail::appendConstraintName(text, name);
    buffer.copy(text.c_str());
    return buffer.getBuffer();
}

namespace tsd_detail {

// Built when the library is loaded; a function-level static keeps them safe
// from the order in which other static objects are initialised.
PropBuffers& groupPropBuffers() {
    static PropBuffers buffers;
    return buffers;
}

PropBuffers& specPropBuffers() {
    static PropBuffers buffers;
    return buffers;
}

namespace {
[[maybe_unused]] const bool g_buffersBuilt = (groupPropBuffers(), specPropBuffers(), true);
} // namespace

} // namespace tsd_detail
