#include "tsd/host/DumpStream.h"

#include <iostream>

DumpStream::DumpStream() : m_out(&std::cout) {}

DumpStream::DumpStream(std::ostream& out) : m_out(&out) {}

DumpStream& DumpStream::operator<<(const char* text) {
    if (text != nullptr)
        *m_out << text;
    return *this;
}

DumpStream& DumpStream::operator<<(std::int16_t value) {
    *m_out << value;
    return *this;
}

DumpStream& DumpStream::operator<<(std::int32_t value) {
    *m_out << value;
    return *this;
}

DumpStream& DumpStream::endl(DumpStream& stream) {
    *stream.m_out << '\n';
    return stream;
}
