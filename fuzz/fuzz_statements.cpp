// Fuzz target of the statement-file reader and writer. Whatever the text:
// reading neither crashes nor hangs; writing every record back with its own
// value gives the text unchanged; a text written with other values, or with
// records dropped, reads back as the records that were written and is a
// fixpoint of the writer; every record goes to a property line and to a
// statement and reads back from both.
#include "Hints.h"
#include "PropFile.h"
#include "Statements.h"

#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

using namespace tsd_cli;

namespace {

void require(bool condition) {
    if (!condition)
        std::abort();
}

std::vector<RecordOutput> ownValues(const StatementFile& file) {
    std::vector<RecordOutput> outputs;
    for (const StatementRecord& record : file.records)
        outputs.push_back(RecordOutput::canonical(record.prop.value));
    return outputs;
}

// Another value for each record, as a canonical value would differ from
// what was written; its first word is new, so no keyword moves to the start
// of a line.
std::string otherValue(std::string_view text, const StatementRecord& record) {
    const std::string& value = record.prop.value;
    switch (record.form) {
    case ValueForm::Constraint:
        return "z " + value;
    case ValueForm::Name:
        return "z" + value;
    case ValueForm::OffsetBody: {
        std::string_view body = text.substr(record.valueBegin, record.valueEnd - record.valueBegin);
        if (value.size() < body.size() ||
            value.compare(value.size() - body.size(), body.size(), body) != 0)
            return value;
        return value.substr(0, value.size() - body.size()) + "z " + std::string(body);
    }
    case ValueForm::Implied:
        return value;
    }
    return value;
}

void checkRewrite(const std::string& text, const StatementFile& file) {
    std::vector<RecordOutput> outputs;
    for (const StatementRecord& record : file.records)
        outputs.push_back(RecordOutput::canonical(otherValue(text, record)));
    std::string written = writeStatements(text, file, outputs);
    StatementFile again = readStatements(written);
    require(again.records.size() == file.records.size());
    require(again.errors.size() == file.errors.size());
    for (std::size_t i = 0; i < file.records.size(); ++i) {
        const PropRecord& before = file.records[i].prop;
        const PropRecord& after = again.records[i].prop;
        require(after.kind == before.kind && after.element == before.element &&
                after.name == before.name && again.records[i].form == file.records[i].form);
        std::string rendered;
        if (file.records[i].form == ValueForm::Name &&
            renderValue(file.records[i], outputs[i].value, rendered))
            require(after.value == outputs[i].value);
    }
    require(writeStatements(written, again, outputs) == written);
}

void checkDrops(const std::string& text, const StatementFile& file, std::uint8_t pattern) {
    std::vector<RecordOutput> outputs;
    std::vector<PropRecord> kept;
    for (std::size_t i = 0; i < file.records.size(); ++i) {
        if ((pattern >> (i % 8)) & 1) {
            outputs.push_back(RecordOutput::drop());
        } else {
            outputs.push_back(RecordOutput::canonical(file.records[i].prop.value));
            kept.push_back(file.records[i].prop);
        }
    }
    std::string written = writeStatements(text, file, outputs);
    StatementFile again = readStatements(written);
    require(again.records.size() == kept.size());
    for (std::size_t i = 0; i < kept.size(); ++i)
        require(again.records[i].prop == kept[i]);
    require(writeStatements(written, again, ownValues(again)) == written);
}

bool hasControl(const std::string& text) {
    for (char c : text)
        if ((static_cast<unsigned char>(c) < 0x20 && c != '\t') || c == 0x7f)
            return true;
    return false;
}

void checkConversions(const StatementFile& file) {
    std::string props = statementsToProps(file);
    std::size_t start = 0;
    for (const StatementRecord& record : file.records) {
        std::size_t end = props.find('\n', start);
        std::string line = props.substr(start, end - start);
        start = end + 1;
        const PropRecord& prop = record.prop;
        if (hasControl(prop.element) || hasControl(prop.name) || hasControl(prop.value))
            continue;
        PropFields parsed;
        std::string error;
        require(parsePropLine(line, parsed, error) == LineStatus::Property);
        bool name = record.form == ValueForm::Name;
        require(parsed.kind == prop.kind && parsed.element.str() == prop.element &&
                parsed.name.str() == prop.name &&
                (name ? refValueName(parsed.value) : parsed.value) == prop.value);
        std::string statement;
        if (propToStatement(prop, statement, error))
            require(readStatements(statement).records.size() == 1);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string text(reinterpret_cast<const char*>(data), size);
    StatementFile file = readStatements(text);
    require(writeStatements(text, file, ownValues(file)) == text);
    // In a file with errors a missing ';' joins statements, so what the
    // writer removes can change how the rest reads: only run it there.
    if (file.errors.empty()) {
        checkRewrite(text, file);
        checkDrops(text, file, size > 0 ? data[0] : 0x55);
    } else {
        writeStatements(text, file,
                        std::vector<RecordOutput>(file.records.size(), RecordOutput::drop()));
    }
    checkConversions(file);

    std::vector<std::string> names;
    for (const StatementRecord& record : file.records)
        names.push_back(record.prop.value);
    for (const StatementRecord& record : file.records)
        if (std::optional<std::string> close = closestName(record.prop.name, names))
            require(*close != record.prop.name);
    detectFormat(text);
    return 0;
}
