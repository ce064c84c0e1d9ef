// Text pieces shared by the dumps and properties of groups and
// specifications: dump lines, time values in dump form, and the property and
// dump of the five reference groups, which differ only in their words.
#pragma once

#include "tsd/Tsd_BaseObj.h"
#include "tsd/Tsd_Specs.h"

#include <cstddef>
#include <string>

class DumpStream;

namespace tsd_detail {

// The text, or "" for null: for texts that go on into a std::string.
inline const char* orEmpty(const char* text) {
    return text != nullptr ? text : "";
}

// Keywords compare without regard to case (ASCII only, whatever the locale).
bool equalsNoCase(const char* a, const char* b);
// True when `text` begins with the `length` characters of `keyword`.
bool startsWithNoCase(const char* text, const char* keyword, size_t length);
// True when `text` begins with the whole of `prefix`.
bool startsWithNoCase(const char* text, const char* prefix);

// Appends a name as constraint text writes it, so that it reads back as the
// same name wherever a name stands: bare, or in quotes (appendQuoted) when
// its first character could not begin a bare name (not a letter, digit or
// one of "$&_-<>", or "/" alone or before "/"), when it would not read as one
// word, or when it is an edge keyword or EXCEPT, which a member list would
// read as a keyword. A null or empty name is written as "".
void appendConstraintName(std::string& out, const char* name);

// Appends the TSid of a link as constraint text writes it: bare when it
// reads back as a link (a word that begins with "TS" and holds no "*" or
// "/"), quoted otherwise.
void appendLinkTSid(std::string& out, const char* tsid);

// One dump line: the indentation of `level`, the text, the end of line.
void dumpLine(DumpStream& stream, int level, const std::string& text);

// The name line of a group's dump: "name = <name>", or "unnamed".
std::string nameLine(const char* name);

// A time value as dumps write it: number, blank, unit word ("10 nS"). The
// result is a copy, so it survives later calls of getString.
std::string dumpTime(const Tsd_TimeValue& value);

// A time value as properties write it ("10:nS"), copied out of the buffer.
std::string propTime(const Tsd_TimeValue& value);

// The duty-cycle and input-jitter part of a period's property text:
// ":HIGH:" or ":LOW:" and the time or the percent when a duty cycle is set,
// then ":INPUT_JITTER:" and the jitter when one is set.
void appendDutyAndJitter(std::string& text, const Tsd_TimeValue* dutyValue, double dutyPercent,
                         bool high, const Tsd_TimeValue* inputJitter);

// `percent` of `period` as a time: in the period's unit, or in nS when the
// period is a frequency.
Tsd_TimeValue percentOfPeriod(double percent, const Tsd_TimeValue& period);

// The two duty-cycle lines of a period's dump: absolute, then percent.
void dumpDutyCycle(DumpStream& stream, short indent, const Tsd_TimeValue* dutyValue,
                   double dutyPercent, bool high);

// The property of a reference group: its reference-property name and its
// own name (empty when null), in the group property buffers.
bool refGroupProp(const char* propName, const char* groupName, const char*& name,
                  const char*& value);

// The dump of a reference group: class name, name, then its references.
void dumpRefGroup(DumpStream& stream, short indent, const char* className, const char* groupName,
                  const Tsd_RefList& refs);

// "   references:" at `indent`, then each held reference at indent + 2.
void dumpRefs(DumpStream& stream, short indent, const Tsd_RefList& refs);

// "   constraint scope: <scope>" when a scope is set.
void dumpScope(DumpStream& stream, short indent, const char* scope);

} // namespace tsd_detail
