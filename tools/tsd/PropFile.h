// Property files: one property per line, read into records and written back.
//
//   group <name> = <value>
//   spec  <name> = <value>
//   ref   <element> <name> = <value>
//
// Names and elements are bare words or double-quoted strings (with \" and \\);
// the value is the rest of the line after the "=", blanks trimmed at both
// ends; a reference value that is one quoted string stands for the name
// inside (refValueName). Blank lines and lines whose first non-blank
// character is '#' are ignored.
//
// Whatever the input format, what reaches the builder is a StoredProp: a
// compact record whose texts are spans of its file's text, kept once in a
// PropStore, or of the store's arena for texts that are not in the file as
// they are (a name whose escapes were undone).
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace tsd_cli {

enum class PropKind : std::uint8_t { Group, Spec, Ref };

// The keyword that begins a line of this kind.
const char* propKeyword(PropKind kind);

// A name or element as it stands in a line: the characters of a bare word
// or between the quotes; `escaped` when \" or \\ sequences are still in it.
struct Word {
    std::string_view text;
    bool escaped = false;

    // The name itself, escapes undone.
    std::string str() const;
};

// One property line as read, its texts views into the line.
struct PropFields {
    PropKind kind = PropKind::Group;
    Word element; // refs only
    Word name;
    std::string_view value;
};

enum class LineStatus { Blank, Property, Malformed };

// Reads one line (without its end-of-line; a trailing carriage return is
// dropped). On Property `prop` holds kind, element, name and value; on
// Malformed `error` says what is wrong. Allocates nothing for a good line.
LineStatus parsePropLine(std::string_view text, PropFields& prop, std::string& error);

// `length` bytes at `offset` of the record's file text, or of the arena.
struct TextSpan {
    std::uint32_t offset = 0;
    std::uint32_t length = 0;
};

// One property handed to the builder, from a line of a property file or from
// any other form of input that names the same three kinds of property. A
// span that lies in the file's text also says where that text stands, so a
// writer can replace it in place.
struct StoredProp {
    enum Field : std::uint8_t { Element = 1, Name = 2, Value = 4 };

    TextSpan element; // refs only
    TextSpan name;
    TextSpan value;
    std::uint32_t file = 0;   // index into PropStore::fileName/fileText
    std::uint32_t line = 0;   // 1-based
    std::uint32_t column = 0; // 1-based; 0: the record stands for its whole line
    PropKind kind = PropKind::Group;
    std::uint8_t inArena = 0; // the Fields whose span is in the arena
};

// The text of every file read, once, an arena for texts that are not in a
// file as they stand, and the records read from them in input order.
class PropStore {
public:
    // Files and the arena are addressed by 32-bit offsets.
    static constexpr std::size_t kMaxText = 0xFFFFFFFFu;

    // Keeps a file's text; its index. The caller keeps the total of all
    // texts at most kMaxText.
    std::uint32_t addFile(std::string displayName, std::string text);
    std::size_t fileCount() const { return m_files.size(); }
    const std::string& fileName(std::uint32_t file) const { return m_files[file].name; }
    std::string_view fileText(std::uint32_t file) const { return m_files[file].text; }

    // The span of `part`, which must lie inside the text of `file`.
    TextSpan spanIn(std::uint32_t file, std::string_view part) const;
    // Copies `text` into the arena.
    TextSpan keep(std::string_view text);

    // Appends a record; its index.
    std::size_t add(const StoredProp& record);
    // Appends a record whose texts are copied into the arena (for records
    // made rather than read).
    std::size_t add(PropKind kind, std::uint32_t file, std::uint32_t line, std::string_view element,
                    std::string_view name, std::string_view value);
    void reserve(std::size_t records) { m_records.reserve(records); }

    const std::vector<StoredProp>& records() const { return m_records; }
    const StoredProp& operator[](std::size_t index) const { return m_records[index]; }
    std::size_t size() const { return m_records.size(); }

    std::string_view element(const StoredProp& record) const {
        return text(record, record.element, StoredProp::Element);
    }
    std::string_view name(const StoredProp& record) const {
        return text(record, record.name, StoredProp::Name);
    }
    std::string_view value(const StoredProp& record) const {
        return text(record, record.value, StoredProp::Value);
    }
    const std::string& fileName(const StoredProp& record) const { return fileName(record.file); }

private:
    struct File {
        std::string name;
        std::string text;
    };

    std::string_view text(const StoredProp& record, TextSpan span, StoredProp::Field field) const {
        std::string_view base =
            (record.inArena & field) != 0 ? std::string_view(m_arena) : fileText(record.file);
        return base.substr(span.offset, span.length);
    }

    std::vector<File> m_files;
    std::string m_arena;
    std::vector<StoredProp> m_records;
};

// A name or element as written in a property file: bare when it reads back
// as itself, else in double quotes with '"' and '\' escaped.
std::string quoteWord(std::string_view word);
void appendQuotedWord(std::string& out, std::string_view word);

// Text in double quotes, as messages show names.
std::string inQuotes(std::string_view text);

// A reference value as a property line must hold it to read back as the
// same name: quoted (in `scratch`) when blanks would be trimmed from it or
// its first quote would be taken for a quoted name, else the value itself.
std::string_view refValueText(std::string_view value, std::string& scratch);

// One property line, without end-of-line, that reads back as the same
// element, name and value. The value must not have leading or trailing
// blanks.
std::string formatPropLine(PropKind kind, std::string_view element, std::string_view name,
                           std::string_view value);
// The same line and its end-of-line, appended to `out`.
void appendPropLine(std::string& out, PropKind kind, std::string_view element,
                    std::string_view name, std::string_view value);

// The words of a constraint value, split at blanks, ':', '=' and ';' outside
// quotes, with the quotes removed. Good enough to find which line names a
// group or a TSid.
std::vector<std::string> valueWords(std::string_view value);

} // namespace tsd_cli
