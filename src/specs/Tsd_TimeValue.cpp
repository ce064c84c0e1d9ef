#include "tsd/Tsd_Specs.h"

#include "internal/Tsd_Report.h"
#include "tsd/Tsd_StaticBuf.h"

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
    std::string text = formatString("%.9f", d);
    if (text.find('.') != std::string::npos) {
        while (!text.empty() && text.back() == '0')
            text.pop_back();
        if (!text.empty() && text.back() == '.')
            text.pop_back();
    }
    buffer.copy(text.c_str());
    return buffer.getBuffer();
}
