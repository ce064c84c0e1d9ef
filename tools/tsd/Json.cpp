#include "Json.h"

#include <cstdint>

namespace tsd_cli {

namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";

// The length of the well-formed UTF-8 sequence at the start of `text`, or 0
// when it is not one; `bad` is then where the first byte that does not fit
// lies (1 for a byte that starts nothing).
std::size_t utf8Length(std::string_view text, std::size_t& bad) {
    auto byte = [&text](std::size_t i) { return static_cast<std::uint8_t>(text[i]); };
    std::uint8_t lead = byte(0);
    std::size_t length = 0;
    std::uint8_t low = 0x80; // the range of the second byte
    std::uint8_t high = 0xBF;
    if (lead >= 0xC2 && lead <= 0xDF) {
        length = 2;
    } else if (lead >= 0xE0 && lead <= 0xEF) {
        length = 3;
        if (lead == 0xE0)
            low = 0xA0; // no overlong forms
        else if (lead == 0xED)
            high = 0x9F; // no surrogates
    } else if (lead >= 0xF0 && lead <= 0xF4) {
        length = 4;
        if (lead == 0xF0)
            low = 0x90;
        else if (lead == 0xF4)
            high = 0x8F; // nothing above U+10FFFF
    } else {
        bad = 1;
        return 0;
    }
    for (std::size_t i = 1; i < length; ++i) {
        if (i >= text.size() || byte(i) < (i == 1 ? low : 0x80) ||
            byte(i) > (i == 1 ? high : 0xBF)) {
            bad = i;
            return 0;
        }
    }
    return length;
}

} // namespace

void appendJsonString(std::string& out, std::string_view text) {
    out += '"';
    std::size_t i = 0;
    while (i < text.size()) {
        // A run of bytes that stand for themselves.
        std::size_t run = i;
        while (run < text.size()) {
            auto c = static_cast<std::uint8_t>(text[run]);
            if (c < 0x20 || c == '"' || c == '\\' || c >= 0x80)
                break;
            ++run;
        }
        out.append(text, i, run - i);
        i = run;
        if (i == text.size())
            break;
        auto c = static_cast<std::uint8_t>(text[i]);
        if (c >= 0x80) {
            std::size_t bad = 0;
            std::size_t length = utf8Length(text.substr(i), bad);
            if (length > 0) {
                out.append(text, i, length);
                i += length;
            } else {
                out += kReplacement;
                i += bad; // the byte that did not fit may begin the next sequence
            }
            continue;
        }
        ++i;
        switch (c) {
        case '"':
            out += "\\\"";
            break;
        case '\\':
            out += "\\\\";
            break;
        case '\b':
            out += "\\b";
            break;
        case '\t':
            out += "\\t";
            break;
        case '\n':
            out += "\\n";
            break;
        case '\f':
            out += "\\f";
            break;
        case '\r':
            out += "\\r";
            break;
        default: {
            static const char kHex[] = "0123456789abcdef";
            out += "\\u00";
            out += kHex[c >> 4];
            out += kHex[c & 0xF];
            break;
        }
        }
    }
    out += '"';
}

void JsonWriter::newLine() {
    m_out += '\n';
    m_out.append(m_hasChild.size() * 2, ' ');
}

void JsonWriter::beforeValue() {
    if (m_afterKey) {
        m_afterKey = false;
        return;
    }
    if (m_hasChild.empty())
        return;
    if (m_hasChild.back())
        m_out += ',';
    m_hasChild.back() = true;
    newLine();
}

JsonWriter& JsonWriter::key(std::string_view name) {
    if (m_hasChild.back())
        m_out += ',';
    m_hasChild.back() = true;
    newLine();
    appendJsonString(m_out, name);
    m_out += ": ";
    m_afterKey = true;
    return *this;
}

JsonWriter& JsonWriter::open(char bracket) {
    beforeValue();
    m_out += bracket;
    m_hasChild.push_back(false);
    return *this;
}

JsonWriter& JsonWriter::close(char bracket) {
    bool hadChild = m_hasChild.back();
    m_hasChild.pop_back();
    if (hadChild)
        newLine();
    m_out += bracket;
    return *this;
}

JsonWriter& JsonWriter::string(std::string_view text) {
    beforeValue();
    appendJsonString(m_out, text);
    return *this;
}

JsonWriter& JsonWriter::number(long long value) {
    beforeValue();
    m_out += std::to_string(value);
    return *this;
}

JsonWriter& JsonWriter::boolean(bool value) {
    beforeValue();
    m_out += value ? "true" : "false";
    return *this;
}

JsonWriter& JsonWriter::null() {
    beforeValue();
    m_out += "null";
    return *this;
}

JsonWriter& JsonWriter::strings(const std::vector<std::string>& texts) {
    beginArray();
    for (const std::string& text : texts)
        string(text);
    return endArray();
}

} // namespace tsd_cli
