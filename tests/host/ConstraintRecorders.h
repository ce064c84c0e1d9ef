// Parser subclasses that write every callback as one line of text, so a
// test compares a whole decoded constraint (or its error) with one string.
// Also used by the fuzz targets.
#pragma once

#include "tsd/host/LogicalConstraintParser.h"
#include "tsd/host/NetConstraintParser.h"

#include <charconv>
#include <string>
#include <vector>

namespace tsd_test {

// Shortest fixed-point text that reads back as the same double ("10000", "2.5").
inline std::string num(double d) {
    char buffer[400];
    std::to_chars_result r =
        std::to_chars(buffer, buffer + sizeof buffer, d, std::chars_format::fixed);
    return std::string(buffer, r.ptr);
}
inline std::string str(const char* s) {
    return s != nullptr ? s : "(null)";
}
inline std::string opt(const double* d) {
    return d != nullptr ? num(*d) : "-";
}
inline std::string flag(bool b) {
    return b ? "1" : "0";
}
inline std::string prio(int p) {
    return p == LogicalConstraintParser::kNoPriority ? "-" : std::to_string(p);
}
inline std::string list(const std::vector<const char*>& names) {
    std::string out = "[";
    for (std::size_t i = 0; i < names.size(); ++i)
        out += (i ? "," : "") + str(names[i]);
    return out + "]";
}
inline const char* edgeName(ParserEdge e) {
    switch (e) {
    case PARSER_EDGE_RISING:
        return "RISING ";
    case PARSER_EDGE_FALLING:
        return "FALLING ";
    case PARSER_EDGE_TRANSHI:
        return "TRANSHI ";
    case PARSER_EDGE_TRANSLO:
        return "TRANSLO ";
    default:
        return "";
    }
}

struct RecordedError {
    int code = 0;
    int column = 0;
    std::string token;
};

// A parse that did not end in exactly one call: its one error, or what
// happened instead.
inline std::string summary(bool failed, const std::vector<std::string>& calls,
                           const std::vector<RecordedError>& errors, bool withColumn) {
    if (failed && calls.empty() && errors.size() == 1)
        return std::string("error: ") + constraintErrorText(errors[0].code) +
               (withColumn ? " at " + std::to_string(errors[0].column) : "") + " '" +
               errors[0].token + "'";
    return "<" + std::to_string(calls.size()) + " calls, " + std::to_string(errors.size()) +
           " errors" + (failed ? ", failed>" : ">");
}

class RecordingLogicalParser : public LogicalConstraintParser {
public:
    std::vector<std::string> calls;
    std::vector<RecordedError> errors;
    std::vector<ConstraintHandle> handles;
    bool answer = true; // what every callback but cb_error returns

    void clear() {
        calls.clear();
        errors.clear();
        handles.clear();
    }
    // What one parse of `text` gives: its one call with the place the handle
    // gives, or its one error.
    std::string result(const char* text) {
        static const char* const kinds[] = {"timegrp", "timespec", "offset", "enable", "disable"};
        clear();
        const bool failed = parse(text);
        if (!failed && calls.size() == 1 && errors.empty())
            return calls[0] + " @" + kinds[handles[0].kind()] + ":" +
                   std::to_string(handles[0].column()) + "+" + std::to_string(handles[0].length());
        return summary(failed, calls, errors, true);
    }

    bool cb_error(int code, int column, const char* token) override {
        errors.push_back({code, column, str(token)});
        return true;
    }
    bool cb_enable(bool enable, const char* delayName, const ConstraintHandle* h) override {
        return record(h, (enable ? "ENABLE " : "DISABLE ") + str(delayName));
    }
    bool cb_offset(bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                   const char* highLow, const ConstraintHandle* h) override {
        return record(h, "OFFSET " + offset(in, offsetPs, validPs, before, clock, highLow));
    }
    bool cb_toffset(const char* pad, bool in, double offsetPs, const double* validPs, bool before,
                    const char* clock, const char* highLow, const ConstraintHandle* h) override {
        return record(h, "TOFFSET pad=" + str(pad) + " " +
                             offset(in, offsetPs, validPs, before, clock, highLow));
    }
    bool cb_roffset(bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                    const char* regGroup, const char* highLow, const ConstraintHandle* h) override {
        return record(h, "ROFFSET " + offset(in, offsetPs, validPs, before, clock, highLow) +
                             " reg=" + str(regGroup));
    }
    bool cb_troffset(const char* pad, bool in, double offsetPs, const double* validPs, bool before,
                     const char* clock, const char* regGroup, const char* highLow,
                     const ConstraintHandle* h) override {
        return record(h, "TROFFSET pad=" + str(pad) + " " +
                             offset(in, offsetPs, validPs, before, clock, highLow) +
                             " reg=" + str(regGroup));
    }
    bool cb_tspec_maxdelay(const char* tsid, bool hasFrom, bool hasTo,
                           const std::vector<const char*>& groups, const char* linkTsid,
                           bool multiply, double valueOrFactor, bool isTime, int priority,
                           bool dataPathOnly, const ConstraintHandle* h) override {
        return record(h, "MAXDELAY " + str(tsid) + " from=" + flag(hasFrom) + " to=" + flag(hasTo) +
                             " " + list(groups) + " " +
                             delay(linkTsid, multiply, valueOrFactor, isTime) +
                             " prio=" + prio(priority) + " dpo=" + flag(dataPathOnly));
    }
    bool cb_tspec_period(const char* tsid, const char* group, const char* linkTsid, bool multiply,
                         double valueOrFactor, bool isTime, bool phasePositive, double phasePs,
                         bool dutyLow, double dutyTimePs, double dutyPercent,
                         const double* inputJitterPs, int priority,
                         const ConstraintHandle* h) override {
        return record(h, "PERIOD " + str(tsid) + " group=" + str(group) + " " +
                             delay(linkTsid, multiply, valueOrFactor, isTime) +
                             " phase=" + (phasePositive ? "+" : "-") + num(phasePs) +
                             " duty=" + (dutyLow ? "LOW/" : "HIGH/") + num(dutyTimePs) + "/" +
                             num(dutyPercent) + "% jitter=" + opt(inputJitterPs) +
                             " prio=" + prio(priority));
    }
    bool cb_tspec_tig(const char* tsid, bool hasFrom, bool hasTo,
                      const std::vector<const char*>& groups, int priority,
                      const ConstraintHandle* h) override {
        return record(h, "TIG " + str(tsid) + " from=" + flag(hasFrom) + " to=" + flag(hasTo) +
                             " " + list(groups) + " prio=" + prio(priority));
    }
    bool cb_tspec_drop_spec(const char* tsid, const ConstraintHandle* h) override {
        return record(h, "DROP_SPEC " + str(tsid));
    }
    bool cb_timegrp(const char* name,
                    const std::vector<std::pair<const char*, ParserEdge>>& includes,
                    const std::vector<const char*>& excludes, const ConstraintHandle* h) override {
        std::string in = "[";
        for (std::size_t i = 0; i < includes.size(); ++i)
            in +=
                (i ? "," : "") + std::string(edgeName(includes[i].second)) + str(includes[i].first);
        return record(h, "TIMEGRP " + str(name) + " in=" + in + "] ex=" + list(excludes));
    }

    static std::string delay(const char* link, bool multiply, double value, bool isTime) {
        if (link != nullptr)
            return std::string("link=") + link + (multiply ? "*" : "/") + num(value);
        return "value=" + num(value) + (isTime ? "ps" : "ps(freq)");
    }
    static std::string offset(bool in, double offsetPs, const double* validPs, bool before,
                              const char* clock, const char* highLow) {
        return std::string(in ? "IN " : "OUT ") + num(offsetPs) + " valid=" + opt(validPs) +
               (before ? " BEFORE " : " AFTER ") + str(clock) + " hl=" + str(highLow);
    }

private:
    bool record(const ConstraintHandle* h, std::string text) {
        calls.push_back(std::move(text));
        handles.push_back(h != nullptr ? *h : ConstraintHandle());
        return answer;
    }
};

class RecordingNetParser : public NetConstraintParser {
public:
    std::vector<std::string> calls;
    std::vector<RecordedError> errors;
    bool answer = true;

    void clear() {
        calls.clear();
        errors.clear();
    }
    std::string result(const char* text) {
        clear();
        const bool failed = parse(text);
        if (!failed && calls.size() == 1 && errors.empty())
            return calls[0];
        return summary(failed, calls, errors, false);
    }

    bool cb_error(int code, const char* token) override {
        errors.push_back({code, 0, str(token)});
        return true;
    }
    bool cb_offset(bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                   const char* regGroup, const char* highLow) override {
        return record(
            "OFFSET " +
            RecordingLogicalParser::offset(in, offsetPs, validPs, before, clock, highLow) +
            " reg=" + str(regGroup));
    }
    bool cb_period(double periodPs, bool dutyLow, double dutyTimePs, double dutyPercent,
                   const double* inputJitterPs) override {
        return record("PERIOD " + num(periodPs) + " duty=" + (dutyLow ? "LOW/" : "HIGH/") +
                      num(dutyTimePs) + "/" + num(dutyPercent) + "% jitter=" + opt(inputJitterPs));
    }
    bool cb_maxdelay(double delayPs) override { return record("MAXDELAY " + num(delayPs)); }
    bool cb_maxskew(double skewPs) override { return record("MAXSKEW " + num(skewPs)); }
    bool cb_portpair(const char* constraintName, double valuePs, const char* kind,
                     const char* group) override {
        return record("PORTPAIR " + str(constraintName) + " " + num(valuePs) +
                      " kind=" + str(kind) + " group=" + str(group));
    }

private:
    bool record(std::string text) {
        calls.push_back(std::move(text));
        return answer;
    }
};

} // namespace tsd_test
