// Helpers shared by the tests: a sink that captures every message (and turns
// a fatal message into an exception, so fatal paths stay in the process),
// reference records and holders, a design that records what trim reports,
// object texts (property and dump), and golden files.
#pragma once

#include "tsd/Tsd.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace tsd_test {

struct FatalMessage : std::runtime_error {
    explicit FatalMessage(const MessageRecord& r)
        : std::runtime_error(r.text), code(r.fatalCode), text(r.text) {}
    int code;
    std::string text;
};

class CapturingSink : public MessageSink {
public:
    void deliver(const MessageRecord& record) override {
        records.push_back(record);
        if (record.severity == MessageSeverity::Fatal)
            throw FatalMessage(record);
    }

    // Texts of one severity, in order.
    std::vector<std::string> texts(MessageSeverity severity) const {
        std::vector<std::string> out;
        for (const MessageRecord& r : records)
            if (r.severity == severity)
                out.push_back(r.text);
        return out;
    }
    std::vector<std::string> errors() const { return texts(MessageSeverity::Error); }
    std::vector<std::string> statuses() const { return texts(MessageSeverity::Status); }

    // Every message as "severity: text", in order: one string to compare.
    std::string transcript() const {
        std::string out;
        for (const MessageRecord& r : records)
            out += std::string(messageSeverityName(r.severity)) + ": " + r.text;
        return out;
    }

    void clear() { records.clear(); }

    std::vector<MessageRecord> records;
};

// Installs a CapturingSink for the lifetime of the object.
class MessageCapture {
public:
    MessageCapture() : m_guard(&sink) {}
    CapturingSink sink;

private:
    ScopedMessageSink m_guard;
};

// The text of one fatal message raised by `body`, with its code when asked.
template <class F>
std::string fatalText(F&& body, int* code = nullptr) {
    try {
        body();
    } catch (const FatalMessage& fatal) {
        if (code != nullptr)
            *code = fatal.code;
        return fatal.text;
    }
    return "<no fatal message>";
}

// A reference record standing for a named design element.
class NamedRef : public Tsd_Ref {
public:
    explicit NamedRef(std::string name, int* destroyed = nullptr)
        : m_name(std::move(name)), m_destroyed(destroyed) {}
    ~NamedRef() override {
        if (m_destroyed != nullptr)
            ++*m_destroyed;
    }
    bool isEqual(const Tsd_Ref* other) const override {
        auto* named = dynamic_cast<const NamedRef*>(other);
        return named != nullptr && named->m_name == m_name;
    }
    const std::string& name() const { return m_name; }

    // The protected helpers of Tsd_Ref.
    NamedRef* duplicate() const {
        auto* copy = new NamedRef(*this);
        copyTo(copy);
        return copy;
    }
    bool redundant(const Tsd_Ref* other) const { return isRedundant(other); }

private:
    NamedRef(const NamedRef& other)
        : Tsd_Ref(other), m_name(other.m_name), m_destroyed(other.m_destroyed) {}

    std::string m_name;
    int* m_destroyed;
};

// Gives `holder` a fresh reference record and returns it.
inline NamedRef* attachRef(Tsd_BaseObj* holder, const std::string& element = "elem",
                           int* destroyed = nullptr) {
    auto* ref = new NamedRef(element, destroyed);
    ref->setOwner(holder);
    return ref;
}

// A design that records what trim() reports.
class RecordingDesign : public Tsd_Design {
public:
    using Tsd_Design::Tsd_Design;

    std::vector<std::pair<Tsd_BaseObj*, TrimReason>> trashed;

protected:
    void reportObjTrashed(Tsd_BaseObj* obj, TrimReason reason) override {
        trashed.emplace_back(obj, reason);
    }
};

inline Tsd_TimeValue ns(double value) {
    return Tsd_TimeValue(value, Tsd_TimeValue::UNITS_NS);
}

// What a walk of a list yields, in order.
inline std::vector<Tsd_BaseObj*> objects(const Tsd_BaseObjList* list) {
    std::vector<Tsd_BaseObj*> out;
    Tsd_BaseObjListIter iter(list);
    while (Tsd_BaseObj* obj = iter.next())
        out.push_back(obj);
    return out;
}

template <class Obj>
std::string dumpText(const Obj& obj, short indent = 0) {
    std::ostringstream out;
    DumpStream stream(out);
    obj.dump(stream, indent);
    return out.str();
}

// "NAME = VALUE" of an object's property, "<no property>", or the fatal
// message that asking for it raised.
inline std::string propText(const Tsd_BaseObj& obj) {
    MessageCapture capture;
    std::string text = "<no property>";
    std::string fatal = fatalText([&] {
        const char* name = nullptr;
        const char* value = nullptr;
        if (obj.getProp(name, value))
            text = std::string(name != nullptr ? name : "<null>") + " = " +
                   (value != nullptr ? value : "<null>");
    });
    return fatal != "<no fatal message>" ? "fatal: " + fatal : text;
}

// The property, then the dump: what a golden file of objects shows.
inline std::string describe(const Tsd_BaseObj& obj) {
    return propText(obj) + "\n" + dumpText(obj, 1);
}

inline std::string readFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// Compares `actual` with the golden file `name` (under tests/); with
// TSD_UPDATE_GOLDEN set in the environment, rewrites the file instead.
inline void expectGolden(const std::string& name, const std::string& actual) {
    const std::string path = std::string(TSD_TEST_SOURCE_DIR) + "/" + name;
    if (std::getenv("TSD_UPDATE_GOLDEN") != nullptr) {
        std::ofstream(path, std::ios::binary) << actual;
        return;
    }
    EXPECT_EQ(actual, readFile(path)) << "golden file " << name;
}

// Control characters and backslashes of a case written as \xNN and \\.
inline std::string escape(const std::string& text) {
    static const char digits[] = "0123456789abcdef";
    std::string out;
    for (char c : text) {
        const auto u = static_cast<unsigned char>(c);
        if (c == '\\')
            out += "\\\\";
        else if (u < 0x20 || u == 0x7f)
            out += std::string("\\x") + digits[u >> 4] + digits[u & 15];
        else
            out += c;
    }
    return out;
}

inline std::string unescape(const std::string& text) {
    std::string out;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '\\' && i + 1 < text.size() && text[i + 1] == '\\') {
            out += '\\';
            ++i;
        } else if (text[i] == '\\' && text[i + 1] == 'x' && i + 3 < text.size()) {
            out += static_cast<char>(std::stoi(text.substr(i + 2, 2), nullptr, 16));
            i += 3;
        } else {
            out += text[i];
        }
    }
    return out;
}

// A cases file under tests/: one input per line, each followed by a line
// "  => " and what `result` gives for it; '#' lines and blank lines stand
// as they are. The expectations are compared as a golden file.
template <class F>
void expectCases(const std::string& name, F&& result) {
    std::istringstream in(readFile(std::string(TSD_TEST_SOURCE_DIR) + "/" + name));
    std::string out, line;
    while (std::getline(in, line)) {
        if (line.rfind("  => ", 0) == 0)
            continue;
        out += line + "\n";
        if (!line.empty() && line[0] != '#')
            out += "  => " + escape(result(unescape(line))) + "\n";
    }
    expectGolden(name, out);
}

} // namespace tsd_test
