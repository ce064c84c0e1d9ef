// Property files: one property per line, read into records and written back.
//
//   group <name> = <value>
//   spec  <name> = <value>
//   ref   <element> <name> = <value>
//
// Names and elements are bare words or double-quoted strings (with \" and \\);
// the value is the rest of the line after the "=", blanks trimmed at both
// ends. Blank lines and lines whose first non-blank character is '#' are
// ignored.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace tsd_cli {

enum class PropKind { Group, Spec, Ref };

// The keyword that begins a line of this kind.
const char* propKeyword(PropKind kind);

struct PropLine {
    PropKind kind = PropKind::Group;
    std::string file;    // as shown in messages
    int line = 0;        // 1-based
    std::string element; // refs only
    std::string name;
    std::string value;
};

enum class LineStatus { Blank, Property, Malformed };

// Reads one line (without its end-of-line; a trailing carriage return is
// dropped). On Property `prop` holds kind, element, name and value; on
// Malformed `error` says what is wrong. `prop.file` and `prop.line` are left
// alone.
LineStatus parsePropLine(std::string_view text, PropLine& prop, std::string& error);

// A name or element as written in a property file: bare when it reads back
// as itself, else in double quotes with '"' and '\' escaped.
std::string quoteWord(std::string_view word);

// Text in double quotes, as messages show names.
std::string inQuotes(std::string_view text);

// One property line, without end-of-line, that reads back as the same
// element, name and value. The value must not have leading or trailing
// blanks.
std::string formatPropLine(PropKind kind, std::string_view element, std::string_view name,
                           std::string_view value);

// The words of a constraint value, split at blanks, ':', '=' and ';' outside
// quotes, with the quotes removed. Good enough to find which line names a
// group or a TSid.
std::vector<std::string> valueWords(std::string_view value);

} // namespace tsd_cli
