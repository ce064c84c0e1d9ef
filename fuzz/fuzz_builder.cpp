// Fuzz target of the whole library: lines of properties are fed to a
// builder, the design it hands out is written back, dumped, queried and
// trimmed. Whatever the properties, nothing may crash, leak, hang or end in a
// fatal message: those are for broken invariants, never for bad input.
//
// One property per line: "g NAME=VALUE" (TIMEGRP), "s NAME=VALUE" (spec),
// "r ELEMENT NAME=VALUE" (reference property), "x ELEMENT" (withdraw the
// element's references before trimming).
#include "tsd/Tsd.h"

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

namespace {

class ElementRef : public Tsd_Ref {
public:
    explicit ElementRef(std::string element) : element(std::move(element)) {}
    bool isEqual(const Tsd_Ref* other) const override {
        auto* ref = dynamic_cast<const ElementRef*>(other);
        return ref != nullptr && ref->element == element;
    }
    std::string element;
};

// Any fatal message is a fault here.
class AbortOnFatal : public MessageSink {
public:
    void deliver(const MessageRecord& record) override {
        if (record.severity == MessageSeverity::Fatal)
            std::abort();
    }
};

bool mentionsDropSpec(const std::string& line) {
    // Dropping a spec is the user builder's to handle; the base builder ends
    // the run on it by design.
    std::string upper;
    for (char c : line)
        upper += static_cast<char>(c >= 'a' && c <= 'z' ? c - 32 : c);
    return upper.find("DROP_SPEC") != std::string::npos;
}

void splitNameValue(const std::string& text, std::string& name, std::string& value) {
    size_t eq = text.find('=');
    name = text.substr(0, eq);
    value = eq == std::string::npos ? "" : text.substr(eq + 1);
}

void writeBack(Tsd_Design* design, const std::vector<ElementRef*>& refs) {
    Tsd_Annotator annotator(design);
    const char* name = nullptr;
    const char* value = nullptr;
    const char* scope = nullptr;
    while (annotator.getNextGroupProp(name, value)) {
    }
    while (annotator.getNextSpecProp(name, value, scope)) {
    }
    for (ElementRef* ref : refs)
        annotator.getRefProp(ref, name, value, scope);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static AbortOnFatal sink;
    static ScopedMessageSink useSink(&sink);

    std::string input(reinterpret_cast<const char*>(data), size);
    std::istringstream lines(input);
    std::string line;
    auto builder = std::make_unique<Tsd_Builder>();
    std::vector<ElementRef*> refs; // owned by the objects that took them
    std::vector<std::string> withdrawn;
    while (std::getline(lines, line)) {
        if (line.size() < 2 || line[1] != ' ' || mentionsDropSpec(line))
            continue;
        std::string rest = line.substr(2), name, value;
        switch (line[0]) {
        case 'g':
            splitNameValue(rest, name, value);
            builder->addUserGroupProp(name.c_str(), value.c_str());
            break;
        case 's':
            splitNameValue(rest, name, value);
            builder->addSpecProp(name.c_str(), value.c_str());
            break;
        case 'r': {
            size_t blank = rest.find(' ');
            if (blank == std::string::npos)
                break;
            splitNameValue(rest.substr(blank + 1), name, value);
            auto ref = std::make_unique<ElementRef>(rest.substr(0, blank));
            if (builder->addRefProp(ref.get(), name.c_str(), value.c_str()))
                refs.push_back(ref.release());
            break;
        }
        case 'x':
            withdrawn.push_back(rest);
            break;
        default:
            break;
        }
    }

    std::ostringstream dumps;
    DumpStream stream(dumps);
    std::unique_ptr<Tsd_Design> design(builder->buildTSDesign());
    builder->dump(stream, 0);
    builder.reset();
    if (design == nullptr)
        return 0;

    writeBack(design.get(), refs);
    design->dump(stream, 1);
    Tsd_BaseObjListIter groups(design->getGroupList());
    while (Tsd_BaseObj* obj = groups.next()) {
        Tsd_BaseObjList holders;
        design->getGroupHolders(obj->getGroup(), &holders);
    }

    for (auto it = refs.begin(); it != refs.end();) {
        bool withdraw = false;
        for (const std::string& element : withdrawn)
            withdraw = withdraw || (*it)->element == element;
        if (withdraw) {
            (*it)->trim();
            it = refs.erase(it);
        } else {
            ++it;
        }
    }
    design->trim();
    design->trim();
    writeBack(design.get(), refs);
    design->dump(stream, 0);
    return 0;
}
