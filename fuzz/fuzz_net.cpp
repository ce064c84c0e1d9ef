// Fuzz target of NetConstraintParser: a parse fails with one error whose
// token is part of the text, or makes exactly one call with finite numbers;
// parsing the same text again gives the same.
#include "ConstraintRecorders.h"

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>

namespace {

void check(bool condition) {
    if (!condition)
        std::abort();
}

class CheckingParser : public tsd_test::RecordingNetParser {
public:
    bool cb_offset(bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                   const char* regGroup, const char* highLow) override {
        check(std::isfinite(offsetPs) && (validPs == nullptr || std::isfinite(*validPs)));
        check(clock != nullptr);
        return RecordingNetParser::cb_offset(in, offsetPs, validPs, before, clock, regGroup,
                                             highLow);
    }
    bool cb_period(double periodPs, bool dutyLow, double dutyTimePs, double dutyPercent,
                   const double* inputJitterPs) override {
        check(std::isfinite(periodPs) && periodPs > 0 && std::isfinite(dutyTimePs) &&
              dutyPercent >= 0 && dutyPercent <= 100 &&
              (inputJitterPs == nullptr || std::isfinite(*inputJitterPs)));
        return RecordingNetParser::cb_period(periodPs, dutyLow, dutyTimePs, dutyPercent,
                                             inputJitterPs);
    }
    bool cb_maxdelay(double delayPs) override {
        check(std::isfinite(delayPs) && delayPs >= 0);
        return RecordingNetParser::cb_maxdelay(delayPs);
    }
    bool cb_maxskew(double skewPs) override {
        check(std::isfinite(skewPs) && skewPs >= 0);
        return RecordingNetParser::cb_maxskew(skewPs);
    }
    bool cb_portpair(const char* constraintName, double valuePs, const char* kind,
                     const char* group) override {
        check(std::isfinite(valuePs) && kind != nullptr && group != nullptr);
        return RecordingNetParser::cb_portpair(constraintName, valuePs, kind, group);
    }
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static CheckingParser parser;
    const std::string input(reinterpret_cast<const char*>(data), size);
    const char* text = input.c_str();

    parser.clear();
    const bool failed = parser.parse(text);
    const auto calls = parser.calls;
    const auto errors = parser.errors;
    if (failed) {
        check(calls.empty() && errors.size() == 1);
        check(std::strstr(text, errors[0].token.c_str()) != nullptr);
    } else {
        check(calls.size() == 1 && errors.empty());
    }

    parser.clear();
    check(parser.parse(text) == failed);
    check(parser.calls == calls);
    return 0;
}
