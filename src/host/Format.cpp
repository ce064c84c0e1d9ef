// The library's one formatter: printf conversions, plus "%z" for a 16-bit
// string, and the UTF-8 / UTF-16 conversions that "%z" needs.
#include "tsd/host/Messages.h"

#include <cstdint>
#include <cstdio>
#include <cstring>
#include <cwchar>
#include <string>

namespace {

// Appends one conversion, formatted by the C library from `spec`.
template <class T>
void appendConverted(std::string& out, const std::string& spec, T value) {
    char small[128];
    int n = std::snprintf(small, sizeof small, spec.c_str(), value);
    if (n < 0)
        return;
    if (static_cast<size_t>(n) < sizeof small) {
        out.append(small, static_cast<size_t>(n));
        return;
    }
    std::string big(static_cast<size_t>(n) + 1, '\0');
    std::snprintf(big.data(), big.size(), spec.c_str(), value);
    out.append(big.data(), static_cast<size_t>(n));
}

bool isFlag(char c) {
    return c == '-' || c == '+' || c == ' ' || c == '#' || c == '0';
}

void appendCodePoint(std::string& out, char32_t cp) {
    if (cp < 0x80) {
        out += static_cast<char>(cp);
    } else if (cp < 0x800) {
        out += static_cast<char>(0xC0 | (cp >> 6));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    } else if (cp < 0x10000) {
        out += static_cast<char>(0xE0 | (cp >> 12));
        out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    } else {
        out += static_cast<char>(0xF0 | (cp >> 18));
        out += static_cast<char>(0x80 | ((cp >> 12) & 0x3F));
        out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    }
}

constexpr char32_t kReplacement = 0xFFFD;

} // namespace

std::string utf16ToUtf8(const char16_t* text) {
    std::string out;
    if (text == nullptr)
        return out;
    for (const char16_t* p = text; *p != 0; ++p) {
        char32_t c = *p;
        if (c >= 0xD800 && c <= 0xDBFF) {
            char16_t next = p[1];
            if (next >= 0xDC00 && next <= 0xDFFF) {
                c = 0x10000 + ((c - 0xD800) << 10) + (next - 0xDC00);
                ++p;
            } else {
                c = kReplacement;
            }
        } else if (c >= 0xDC00 && c <= 0xDFFF) {
            c = kReplacement;
        }
        appendCodePoint(out, c);
    }
    return out;
}

std::u16string utf8ToUtf16(const char* text) {
    std::u16string out;
    if (text == nullptr)
        return out;
    const auto* p = reinterpret_cast<const unsigned char*>(text);
    while (*p != 0) {
        char32_t cp;
        int extra;
        unsigned char b = *p;
        if (b < 0x80) {
            cp = b;
            extra = 0;
        } else if ((b & 0xE0) == 0xC0) {
            cp = b & 0x1F;
            extra = 1;
        } else if ((b & 0xF0) == 0xE0) {
            cp = b & 0x0F;
            extra = 2;
        } else if ((b & 0xF8) == 0xF0) {
            cp = b & 0x07;
            extra = 3;
        } else {
            out += static_cast<char16_t>(kReplacement);
            ++p;
            continue;
        }
        ++p;
        bool ok = true;
        for (int i = 0; i < extra; ++i) {
            // Stops at the terminator: a truncated sequence never reads past it.
            if ((*p & 0xC0) != 0x80) {
                ok = false;
                break;
            }
            cp = (cp << 6) | (*p & 0x3F);
            ++p;
        }
        static const char32_t minimum[] = {0, 0x80, 0x800, 0x10000};
        if (!ok || cp < minimum[extra] || cp > 0x10FFFF || (cp >= 0xD800 && cp <= 0xDFFF))
            cp = kReplacement;
        if (cp >= 0x10000) {
            cp -= 0x10000;
            out += static_cast<char16_t>(0xD800 + (cp >> 10));
            out += static_cast<char16_t>(0xDC00 + (cp & 0x3FF));
        } else {
            out += static_cast<char16_t>(cp);
        }
    }
    return out;
}

std::unique_ptr<char16_t[]> copyWide(const char16_t* text) {
    size_t n = 0;
    if (text != nullptr)
        while (text[n] != 0)
            ++n;
    auto copy = std::make_unique<char16_t[]>(n + 1);
    for (size_t i = 0; i < n; ++i)
        copy[i] = text[i];
    copy[n] = 0;
    return copy;
}

std::string vformatMessage(const char* format, va_list args) {
    std::string out;
    if (format == nullptr)
        return out;
    const char* p = format;
    while (*p != 0) {
        if (*p != '%') {
            const char* run = std::strchr(p, '%');
            size_t len = run ? static_cast<size_t>(run - p) : std::strlen(p);
            out.append(p, len);
            p += len;
            continue;
        }
        const char* start = p++;
        if (*p == '%') {
            out += '%';
            ++p;
            continue;
        }
        std::string spec = "%";
        while (isFlag(*p))
            spec += *p++;
        if (*p == '*') {
            spec += std::to_string(va_arg(args, int));
            ++p;
        } else {
            while (*p >= '0' && *p <= '9')
                spec += *p++;
        }
        if (*p == '.') {
            spec += *p++;
            if (*p == '*') {
                int precision = va_arg(args, int);
                spec += std::to_string(precision < 0 ? 0 : precision);
                ++p;
            } else {
                while (*p >= '0' && *p <= '9')
                    spec += *p++;
            }
        }
        // Length modifiers ("z" is not one here: it is the wide-string conversion).
        std::string length;
        while (*p == 'h' || *p == 'l' || *p == 'L' || *p == 'j' || *p == 't' || *p == 'q')
            length += *p++;
        char conv = *p;
        if (conv == 0) {
            out.append(start); // a lone trailing conversion is printed as it stands
            break;
        }
        ++p;
        switch (conv) {
        case 'd':
        case 'i':
            if (length == "l")
                appendConverted(out, spec + "ld", va_arg(args, long));
            else if (length == "ll" || length == "q")
                appendConverted(out, spec + "lld", va_arg(args, long long));
            else if (length == "j")
                appendConverted(out, spec + "jd", va_arg(args, intmax_t));
            else if (length == "t")
                appendConverted(out, spec + "td", va_arg(args, ptrdiff_t));
            else if (length == "h")
                appendConverted(out, spec + "hd", va_arg(args, int));
            else if (length == "hh")
                appendConverted(out, spec + "hhd", va_arg(args, int));
            else
                appendConverted(out, spec + "d", va_arg(args, int));
            break;
        case 'u':
        case 'o':
        case 'x':
        case 'X': {
            std::string tail(1, conv);
            if (length == "l")
                appendConverted(out, spec + "l" + tail, va_arg(args, unsigned long));
            else if (length == "ll" || length == "q")
                appendConverted(out, spec + "ll" + tail, va_arg(args, unsigned long long));
            else if (length == "j")
                appendConverted(out, spec + "j" + tail, va_arg(args, uintmax_t));
            else if (length == "t")
                appendConverted(out, spec + "t" + tail, va_arg(args, ptrdiff_t));
            else if (length == "h" || length == "hh")
                appendConverted(out, spec + length + tail, va_arg(args, unsigned int));
            else
                appendConverted(out, spec + tail, va_arg(args, unsigned int));
            break;
        }
        case 'f':
        case 'F':
        case 'e':
        case 'E':
        case 'g':
        case 'G':
        case 'a':
        case 'A':
            if (length == "L")
                appendConverted(out, spec + "L" + conv, va_arg(args, long double));
            else
                appendConverted(out, spec + conv, va_arg(args, double));
            break;
        case 'c':
            if (length == "l")
                appendConverted(out, spec + "lc", static_cast<wint_t>(va_arg(args, wint_t)));
            else
                appendConverted(out, spec + "c", va_arg(args, int));
            break;
        case 's':
            if (length == "l") {
                const wchar_t* ws = va_arg(args, const wchar_t*);
                appendConverted(out, spec + "ls", ws ? ws : L"(null)");
            } else {
                const char* s = va_arg(args, const char*);
                appendConverted(out, spec + "s", s ? s : "(null)");
            }
            break;
        case 'z': {
            const char16_t* ws = va_arg(args, const char16_t*);
            std::string text = ws ? utf16ToUtf8(ws) : std::string("(null)");
            if (spec == "%")
                out += text;
            else
                appendConverted(out, spec + "s", text.c_str());
            break;
        }
        case 'p':
            appendConverted(out, spec + "p", va_arg(args, void*));
            break;
        case 'n':
            // Writing through a pointer argument is never honoured.
            (void)va_arg(args, void*);
            break;
        default:
            // Unknown conversion: keep the text as written.
            out.append(start, static_cast<size_t>(p - start));
            break;
        }
    }
    return out;
}

std::string formatMessage(const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string text = vformatMessage(format, args);
    va_end(args);
    return text;
}

const char* formatString(const char* format, ...) {
    static std::string held;
    va_list args;
    va_start(args, format);
    held = vformatMessage(format, args);
    va_end(args);
    return held.c_str();
}

std::unique_ptr<char16_t[]> translateMessage(const char* /*domain*/, const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string text = vformatMessage(format, args);
    va_end(args);
    std::u16string wide = utf8ToUtf16(text.c_str());
    return copyWide(wide.c_str());
}
