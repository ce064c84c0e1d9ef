#include "internal/Tsd_ObjText.h"

#include <cctype>
#include <cstring>

#include "host/ConstraintLexer.h"

#include "internal/Tsd_PropBuffers.h"
#include "internal/Tsd_Report.h"

namespace tsd_detail {

namespace {
char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}
} // namespace

bool equalsNoCase(const char* a, const char* b) {
    if (a == nullptr || b == nullptr)
        return a == b;
    for (; *a != 0 && *b != 0; ++a, ++b)
        if (lower(*a) != lower(*b))
            return false;
    return *a == *b;
}

bool startsWithNoCase(const char* text, const char* keyword, size_t length) {
    if (text == nullptr || keyword == nullptr)
        return false;
    for (size_t i = 0; i < length; ++i) {
        if (text[i] == 0 || lower(text[i]) != lower(keyword[i]))
            return false;
    }
    return true;
}

bool startsWithNoCase(const char* text, const char* prefix) {
    return prefix != nullptr && startsWithNoCase(text, prefix, std::strlen(prefix));
}

void appendConstraintName(std::string& out, const char* name) {
    if (name == nullptr || *name == 0) {
        out += "\"\"";
        return;
    }
    const size_t length = std::strlen(name);
    const auto first = static_cast<unsigned char>(name[0]);
    bool quote;
    if (first == '/')
        quote = name[1] == 0 || name[1] == '/';
    else
        quote = !(std::isalnum(first) || std::strchr("$&_-<>", first) != nullptr);
    if (!quote)
        quote = !tsd_constraint::isBareWord(name, length);
    if (!quote) {
        for (const char* keyword : {"RISING", "FALLING", "TRANSHI", "TRANSLO", "EXCEPT"})
            quote = quote || equalsNoCase(name, keyword);
    }
    if (quote)
        tsd_constraint::appendQuoted(out, name, length);
    else
        out.append(name, length);
}

void appendLinkTSid(std::string& out, const char* tsid) {
    const size_t length = std::strlen(tsid);
    if (startsWithNoCase(tsid, "TS") && tsd_constraint::isBareWord(tsid, length) &&
        std::strpbrk(tsid, "*/") == nullptr)
        out.append(tsid, length);
    else
        tsd_constraint::appendQuoted(out, tsid, length);
}

void dumpLine(DumpStream& stream, int level, const std::string& text) {
    stream << indent(level) << text.c_str() << DumpStream::endl;
}

std::string nameLine(const char* name) {
    return name != nullptr ? std::string("name = ") + name : std::string("unnamed");
}

std::string dumpTime(const Tsd_TimeValue& value) {
    return value.getString(" ");
}

std::string propTime(const Tsd_TimeValue& value) {
    return value.getString(":");
}

bool refGroupProp(const char* propName, const char* groupName, const char*& name,
                  const char*& value) {
    PropBuffers& buffers = groupPropBuffers();
    buffers.name.copy(propName);
    buffers.value.copy(groupName);
    return buffers.handOut(name, value);
}

void dumpRefs(DumpStream& stream, short indent, const Tsd_RefList& refs) {
    dumpLine(stream, indent, "   references:");
    Tsd_RefListIter iter(&refs);
    while (Tsd_Ref* ref = iter.next())
        ref->dump(stream, static_cast<short>(indent + 2));
}

void dumpRefGroup(DumpStream& stream, short indent, const char* className, const char* groupName,
                  const Tsd_RefList& refs) {
    dumpLine(stream, indent, className);
    dumpLine(stream, indent + 1, nameLine(groupName));
    dumpRefs(stream, indent, refs);
}

void dumpScope(DumpStream& stream, short indent, const char* scope) {
    if (scope != nullptr)
        dumpLine(stream, indent, std::string("   constraint scope: ") + scope);
}

void appendDutyAndJitter(std::string& text, const Tsd_TimeValue* dutyValue, double dutyPercent,
                         bool high, const Tsd_TimeValue* inputJitter) {
    if (dutyValue != nullptr || dutyPercent != 0.0) {
        text += high ? ":HIGH:" : ":LOW:";
        if (dutyValue != nullptr) {
            text += propTime(*dutyValue);
        } else {
            text += formatNumber(dutyPercent);
            text += '%';
        }
    }
    if (inputJitter != nullptr) {
        text += ":INPUT_JITTER:";
        text += propTime(*inputJitter);
    }
}

void dumpDutyCycle(DumpStream& stream, short indent, const Tsd_TimeValue* dutyValue,
                   double dutyPercent, bool high) {
    const char* level = high ? "HIGH " : "LOW ";
    if (dutyValue != nullptr)
        dumpLine(stream, indent,
                 std::string("   absolute duty cycle: ") + level + dumpTime(*dutyValue));
    else
        dumpLine(stream, indent, "   absolute duty cycle unset");
    if (dutyPercent != 0.0)
        dumpLine(stream, indent,
                 std::string("   percent duty cycle: ") + level +
                     formatMessage("%f%%", dutyPercent));
    else
        dumpLine(stream, indent, "   percent duty cycle unset");
}

Tsd_TimeValue percentOfPeriod(double percent, const Tsd_TimeValue& period) {
    // A duty cycle is a time even when the period is a frequency.
    if (Tsd_TimeValue::isFrequency(period.units))
        return Tsd_TimeValue(percent / 100.0 * period.getValue(Tsd_TimeValue::UNITS_NS),
                             Tsd_TimeValue::UNITS_NS);
    return Tsd_TimeValue(percent / 100.0 * period.value, period.units);
}

} // namespace tsd_detail
