// Growable zero-terminated character buffers in which the library composes
// the strings it returns, and the quoting of names for constraint text.
#pragma once

#include <memory>

class Tsd_StaticBuf {
public:
    // A non-positive size or increment is taken as 1: the buffer always grows.
    Tsd_StaticBuf(int initialSize, int increment);
    ~Tsd_StaticBuf();
    Tsd_StaticBuf(const Tsd_StaticBuf&) = delete;
    Tsd_StaticBuf& operator=(const Tsd_StaticBuf&) = delete;

    void cat(const char* s);  // appends; null or empty changes nothing
    void copy(const char* s); // replaces; null or empty empties
    void clear();

    const char* getBuffer() const { return m_buffer.get(); }
    operator const char*() const { return m_buffer.get(); }

    // Reports limit, size, contents and two self-checks as status messages.
    void dumpStats() const;

    int getLimit() const { return m_limit; }
    int getSize() const { return m_size; }
    int getIncrement() const { return m_increment; }

private:
    // The limit after adding the increment as often as needed for `needed`.
    int grownLimit(long long needed) const;

    std::unique_ptr<char[]> m_buffer;
    int m_limit;
    int m_size;
    int m_increment;
};

class Tsd_Util {
public:
    // The name as written in constraint text: quoted when its first
    // character could not begin a bare name, or when bare it would not read
    // back as this one name (blanks, separators, quotes, a member keyword).
    // Valid until the next call.
    static const char* getAnnoName(const char* name);
};
