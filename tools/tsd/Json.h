// A JSON document written as it goes, into a string, laid out the way the
// tool has always written it: two blanks per level, one member or element
// per line, "key": value, empty containers as {} and [], invalid UTF-8
// replaced by U+FFFD.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace tsd_cli {

// `text` as a JSON string, quotes included, appended to `out`: '"' and '\'
// escaped, control characters as \b \t \n \f \r or \u00xx, each maximal
// invalid UTF-8 sequence replaced by one U+FFFD.
void appendJsonString(std::string& out, std::string_view text);

class JsonWriter {
public:
    explicit JsonWriter(std::string& out) : m_out(out) {}

    // Inside an object, key() comes before each member's value.
    JsonWriter& key(std::string_view name);

    JsonWriter& beginObject() { return open('{'); }
    JsonWriter& endObject() { return close('}'); }
    JsonWriter& beginArray() { return open('['); }
    JsonWriter& endArray() { return close(']'); }
    JsonWriter& string(std::string_view text);
    JsonWriter& number(long long value);
    JsonWriter& boolean(bool value);
    JsonWriter& null();

    // Shorthands for a member: key and value.
    JsonWriter& member(std::string_view name, std::string_view text) {
        return key(name).string(text);
    }
    JsonWriter& member(std::string_view name, const char* text) { return key(name).string(text); }
    JsonWriter& member(std::string_view name, int value) { return key(name).number(value); }
    // An array of strings.
    JsonWriter& strings(const std::vector<std::string>& texts);

    // Ends the document with an end-of-line.
    void finish() { m_out += '\n'; }

private:
    // Before a value: the separator and indent of an element, unless a key
    // was just written.
    void beforeValue();
    void newLine();
    JsonWriter& open(char bracket);
    JsonWriter& close(char bracket);

    std::string& m_out;
    // Per open container: whether it has a child yet.
    std::vector<bool> m_hasChild;
    bool m_afterKey = false;
};

} // namespace tsd_cli
