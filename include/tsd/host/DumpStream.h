// The debug output stream that every dump() of the library writes to.
#pragma once

#include <cstdint>
#include <iosfwd>

class DumpStream {
public:
    // Writes to `out` (std::cout when default-constructed); not owned.
    DumpStream();
    explicit DumpStream(std::ostream& out);

    DumpStream& operator<<(const char* text); // null writes nothing
    DumpStream& operator<<(std::int16_t value);
    DumpStream& operator<<(std::int32_t value);
    DumpStream& operator<<(DumpStream& (*manipulator)(DumpStream&)) { return manipulator(*this); }

    // End of line: `stream << "text" << DumpStream::endl;`
    static DumpStream& endl(DumpStream& stream);

    std::ostream& stream() { return *m_out; }

private:
    std::ostream* m_out;
};
