// Time values and the specification classes.
#pragma once

#include <cstdint>

#include "tsd/Tsd_BaseObj.h"

// A number and its unit. Every time quantity of the specifications is one;
// conversions go through picoseconds, and frequency units convert to times by
// their reciprocal.
struct Tsd_TimeValue {
    enum Units : std::int32_t {
        UNITS_PS = 0,
        UNITS_NS = 1,
        UNITS_US = 2,
        UNITS_MS = 3,
        UNITS_GHZ = 4,
        UNITS_MHZ = 5,
        UNITS_KHZ = 6,
    };

    double value;
    Units units;

    Tsd_TimeValue() : value(0.0), units(UNITS_PS) {}
    Tsd_TimeValue(double v, Units u) : value(v), units(u) {}

    double getValue(Units target) const;
    double getPicoSeconds() const { return getValue(UNITS_PS); }
    void changeUnits(Units target);
    // Number, separator, unit word ("10:nS"); valid until the next getString.
    const char* getString(const char* separator) const;

    // "pS", "nS", "uS", "mS", "GHz", "MHz", "kHz"; null outside the table.
    static const char* getUnitWord(Units units);
    // True for GHz, MHz and kHz.
    static bool isFrequency(Units units);
};

// The canonical text of a number: "%.9f" without trailing zeros or point.
// Valid until the next call.
const char* formatNumber(double d);
