// Parser of net-level constraint values: PERIOD, MAXDELAY, MAXSKEW, OFFSET
// and FEEDBACK, one "KEYWORD=value ;" text per call.
//
// As with LogicalConstraintParser, the whole text is read before exactly one
// callback is called, with times in picoseconds. The error codes are those
// of ConstraintErrorCode; docs/constraint-language.md describes the language.
#pragma once

#include "tsd/host/LogicalConstraintParser.h"

#include <memory>

class NetConstraintParser {
public:
    NetConstraintParser();
    virtual ~NetConstraintParser();
    NetConstraintParser(const NetConstraintParser&) = delete;
    NetConstraintParser& operator=(const NetConstraintParser&) = delete;

    // Returns true (non-zero) on FAILURE: a syntax error (reported through
    // cb_error first) or a callback that answered false (cb_error is not
    // called then). A null text is an empty text.
    bool parse(const char* text);

    // The callbacks, in this order. Pointers are valid only during the call.
    // cb_error: code from ConstraintErrorCode and the offending token as
    // written ("" when the text ends too early).
    virtual bool cb_error(int code, const char* token);
    virtual bool cb_offset(bool in, double offsetPs, const double* validPs, bool before,
                           const char* clock, const char* regGroup, const char* highLow);
    virtual bool cb_period(double periodPs, bool dutyLow, double dutyTimePs, double dutyPercent,
                           const double* inputJitterPs);
    virtual bool cb_maxdelay(double delayPs);
    virtual bool cb_maxskew(double skewPs);
    // constraintName is the keyword in capitals ("FEEDBACK"); kind is the word
    // after the value as written (any word).
    virtual bool cb_portpair(const char* constraintName, double valuePs, const char* kind,
                             const char* group);

private:
    std::unique_ptr<tsd_constraint::Reader> m_reader;
    bool m_parsing = false;
};
