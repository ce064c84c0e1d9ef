// Fuzz target of LogicalConstraintParser. Beyond crashes, leaks and undefined
// behaviour it checks what callers rely on: a parse either fails with one
// error whose token stands at its column in the text, or makes exactly one
// call; numbers are finite; parsing the same text again gives the same.
#include "ConstraintRecorders.h"

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>

namespace {

class CheckingParser : public tsd_test::RecordingLogicalParser {
public:
    bool cb_tspec_period(const char* tsid, const char* group, const char* linkTsid, bool multiply,
                         double valueOrFactor, bool isTime, bool phasePositive, double phasePs,
                         bool dutyLow, double dutyTimePs, double dutyPercent,
                         const double* inputJitterPs, int priority,
                         const ConstraintHandle* h) override {
        finite(valueOrFactor);
        finite(phasePs);
        finite(dutyTimePs);
        finite(dutyPercent);
        if (inputJitterPs != nullptr)
            finite(*inputJitterPs);
        return RecordingLogicalParser::cb_tspec_period(
            tsid, group, linkTsid, multiply, valueOrFactor, isTime, phasePositive, phasePs, dutyLow,
            dutyTimePs, dutyPercent, inputJitterPs, priority, h);
    }
    bool cb_tspec_maxdelay(const char* tsid, bool hasFrom, bool hasTo,
                           const std::vector<const char*>& groups, const char* linkTsid,
                           bool multiply, double valueOrFactor, bool isTime, int priority,
                           bool dataPathOnly, const ConstraintHandle* h) override {
        finite(valueOrFactor);
        return RecordingLogicalParser::cb_tspec_maxdelay(tsid, hasFrom, hasTo, groups, linkTsid,
                                                         multiply, valueOrFactor, isTime, priority,
                                                         dataPathOnly, h);
    }
    bool cb_offset(bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                   const char* highLow, const ConstraintHandle* h) override {
        finite(offsetPs);
        if (validPs != nullptr)
            finite(*validPs);
        return RecordingLogicalParser::cb_offset(in, offsetPs, validPs, before, clock, highLow, h);
    }

private:
    static void finite(double d) {
        if (!std::isfinite(d))
            std::abort();
    }
};

void check(bool condition) {
    if (!condition)
        std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    // Reused across inputs, as the library reuses its parser.
    static CheckingParser parser;
    const std::string input(reinterpret_cast<const char*>(data), size);
    const char* text = input.c_str(); // an embedded zero ends the text
    const std::size_t length = std::strlen(text);

    parser.clear();
    const bool failed = parser.parse(text);
    const auto calls = parser.calls;
    const auto errors = parser.errors;
    if (failed) {
        check(calls.empty() && errors.size() == 1);
        const tsd_test::RecordedError& e = errors[0];
        check(e.code >= CONSTRAINT_ERR_EMPTY && e.code <= CONSTRAINT_ERR_TOO_LONG);
        check(e.column >= 1 && static_cast<std::size_t>(e.column) <= length + 1);
        check(std::string(text + e.column - 1).compare(0, e.token.size(), e.token) == 0);
    } else {
        check(calls.size() == 1 && errors.empty());
        const ConstraintHandle& h = parser.handles[0];
        check(h.column() >= 1 && static_cast<std::size_t>(h.column() - 1 + h.length()) <= length);
        check(text[h.column() - 1 + h.length() - 1] == ';');
    }

    parser.clear();
    check(parser.parse(text) == failed);
    check(parser.calls == calls);
    check(parser.errors.size() == errors.size());
    return 0;
}
