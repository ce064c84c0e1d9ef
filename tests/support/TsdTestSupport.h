// Helpers shared by the tests: a sink that captures every message (and turns
// a fatal message into an exception, so fatal paths stay in the process), a
// reference record and a reference holder for tests of the foundation, and
// dump capture.
#pragma once

#include "tsd/Tsd.h"

#include <sstream>
#include <stdexcept>
#include <string>
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
        for (const MessageRecord& r : records) {
            out += messageSeverityName(r.severity);
            out += ": ";
            out += r.text;
        }
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

// The text of one fatal message raised by `body`; fails the test otherwise.
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

    // Expose the protected helpers of Tsd_Ref for tests.
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

template <class Obj>
std::string dumpText(const Obj& obj, short indent = 0) {
    std::ostringstream out;
    DumpStream stream(out);
    obj.dump(stream, indent);
    return out.str();
}

// An object's property as two copied strings; "<no property>" as the name
// when getProp returns false.
struct Prop {
    std::string name;
    std::string value;
    bool operator==(const Prop& other) const { return name == other.name && value == other.value; }
};

inline Prop propOf(const Tsd_BaseObj& obj) {
    const char* name = nullptr;
    const char* value = nullptr;
    if (!obj.getProp(name, value))
        return {"<no property>", ""};
    return {name != nullptr ? name : "<null>", value != nullptr ? value : "<null>"};
}

inline std::ostream& operator<<(std::ostream& out, const Prop& prop) {
    return out << prop.name << " = " << prop.value;
}

} // namespace tsd_test
