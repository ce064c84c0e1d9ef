#include "tsd/Tsd_Specs.h"

#include "internal/Tsd_Report.h"
#include "tsd/Tsd_StaticBuf.h"

#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <string>

namespace {

struct UnitRow {
    Tsd_TimeValue::Units units;
    const char* word;
    double factor; // picoseconds in one unit; for a frequency, factor / f picoseconds
    bool inverted;
};

const UnitRow kUnitTable[7] = {
    {Tsd_TimeValue::UNITS_PS, "pS", 1.0, false},
    {Tsd_TimeValue::UNITS_NS, "nS", 1000.0, false},
    {Tsd_TimeValue::UNITS_US, "uS", 1000000.0, false},
    {Tsd_TimeValue::UNITS_MS, "mS", 1000000000.0, false},
    {Tsd_TimeValue::UNITS_GHZ, "GHz", 1000.0, true},
    {Tsd_TimeValue::UNITS_MHZ, "MHz", 1000000.0, true},
    {Tsd_TimeValue::UNITS_KHZ, "kHz", 1000000000.0, true},
};

const UnitRow* findRow(Tsd_TimeValue::Units units) {
    for (const UnitRow& row : kUnitTable)
        if (row.units == units)
            return &row;
    return nullptr;
}

const UnitRow& requireRow(Tsd_TimeValue::Units units) {
    const UnitRow* row = findRow(units);
    if (row == nullptr)
        TSD_MSG().fatal(2, "Unit unmatched.\n");
    return *row;
}

} // namespace

double Tsd_TimeValue::getValue(Units target) const {
    if (target == units)
        return value;
    double v = value;
    if (units != UNITS_PS) {
        const UnitRow& row = requireRow(units);
        if (row.inverted)
            v = 1.0 / v;
        v = v * row.factor;
    }
    if (target == UNITS_PS)
        return v;
    const UnitRow& row = requireRow(target);
    v = v / row.factor;
    if (row.inverted)
        v = 1.0 / v;
    return v;
}

void Tsd_TimeValue::changeUnits(Units target) {
    if (target == units)
        return;
    value = getValue(target);
    units = target;
}

const char* Tsd_TimeValue::getString(const char* separator) const {
    static Tsd_StaticBuf buffer(32, 32);
    buffer.copy(formatNumber(value));
    buffer.cat(separator);
    buffer.cat(getUnitWord(units));
    return buffer.getBuffer();
}

const char* Tsd_TimeValue::getUnitWord(Units units) {
    const UnitRow* row = findRow(units);
    return row != nullptr ? row->word : nullptr;
}

bool Tsd_TimeValue::isFrequency(Units units) {
    return units == UNITS_GHZ || units == UNITS_MHZ || units == UNITS_KHZ;
}

const char* formatNumber(double d) {
    static Tsd_StaticBuf buffer(32, 32);
    // A whole number prints as its digits: what "%.9f" gives once its zeros
    // and point are stripped, without the cost of the conversion (a million
    // specifications are written back at a time). Negative zero keeps "-0".
    if (std::isfinite(d) && std::fabs(d) < 1e15 && d == std::trunc(d) &&
        !(d == 0.0 && std::signbit(d))) {
        char digits[24];
        const auto end =
            std::to_chars(digits, digits + sizeof digits - 1, static_cast<long long>(d)).ptr;
        *end = 0;
        buffer.copy(digits);
        return buffer.getBuffer();
    }
    // Any double fits: at most 309 integer digits, the point and nine more.
    char text[400];
    std::snprintf(text, sizeof text, "%.9f", d);
    std::size_t length = std::strlen(text);
    if (std::strchr(text, '.') != nullptr) {
        while (length > 0 && text[length - 1] == '0')
            --length;
        if (length > 0 && text[length - 1] == '.')
            --length;
        text[length] = 0;
    }
    buffer.copy(text);
    return buffer.getBuffer();
}
