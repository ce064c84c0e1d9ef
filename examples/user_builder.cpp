// A toolchain program's view of the library: its own reference records for
// netlist elements, its own design (which logs what trimming removes) and a
// user builder that lets a later TIMESPEC replace an earlier one.
#include "tsd/Tsd.h"

#include <cstdio>
#include <memory>
#include <string>
#include <vector>

namespace {

// A netlist element that carries a reference property.
class NetlistRef : public Tsd_Ref {
public:
    explicit NetlistRef(std::string element) : m_element(std::move(element)) {}
    bool isEqual(const Tsd_Ref* other) const override {
        auto* ref = dynamic_cast<const NetlistRef*>(other);
        return ref != nullptr && ref->m_element == m_element;
    }
    const std::string& element() const { return m_element; }

private:
    std::string m_element;
};

const char* reasonText(Tsd_Design::TrimReason reason) {
    switch (reason) {
    case Tsd_Design::TRIM_NO_REFERENCES:
        return "no references left";
    case Tsd_Design::TRIM_EMPTY_USER_GROUP:
        return "every included group is gone";
    case Tsd_Design::TRIM_PATH_ENDPOINT:
        return "a FROM or TO group is gone";
    case Tsd_Design::TRIM_PATH_THRU:
        return "a THRU group is gone";
    case Tsd_Design::TRIM_PERIOD_GROUP:
        return "its period group is gone";
    case Tsd_Design::TRIM_TIG_OF_TRASHED_SPEC:
        return "the spec it ignores is gone";
    case Tsd_Design::TRIM_CLOCK_GROUP:
        return "its clock group is gone";
    case Tsd_Design::TRIM_REG_GROUP:
        return "its register group is gone";
    case Tsd_Design::TRIM_PAD_GROUP:
        return "its pad group is gone";
    case Tsd_Design::TRIM_NONE:
        break;
    }
    return "?";
}

// A design that says what trimming removes.
class LoggingDesign : public Tsd_Design {
protected:
    void reportObjTrashed(Tsd_BaseObj* obj, TrimReason reason) override {
        std::string what = obj->getUserString(); // copy: the buffer is shared
        std::printf("  trashed %-40s (%s)\n", what.c_str(), reasonText(reason));
    }
};

// A user builder that fills the program's own design and lets a later
// TIMESPEC of the same TSid replace the earlier one.
class ProgramBuilder : public Tsd_Builder {
public:
    explicit ProgramBuilder(Tsd_Design* design) : Tsd_Builder(false) { initBaseBuilder(design); }

protected:
    bool allowEndpointSpecOverride(Tsd_EndpointSpec* existing, const char* newValue) override {
        std::printf("  note: %s redefined as %s\n", existing->getTSid(), newValue);
        return true;
    }
};

class StderrLines : public MessageSink {
public:
    void deliver(const MessageRecord& r) override {
        std::fprintf(stderr, "%s: %s", messageSeverityName(r.severity), r.text.c_str());
    }
};

void printProperties(Tsd_Design& design, const std::vector<NetlistRef*>& refs) {
    Tsd_Annotator annotator(&design);
    const char* name = nullptr;
    const char* value = nullptr;
    while (annotator.getNextGroupProp(name, value))
        std::printf("  group %s = %s\n", name, value);
    while (annotator.getNextSpecProp(name, value))
        std::printf("  spec  %s = %s\n", name, value);
    for (NetlistRef* ref : refs)
        if (annotator.getRefProp(ref, name, value))
            std::printf("  ref   %s %s = %s\n", ref->element().c_str(), name, value);
}

} // namespace

int main() {
    StderrLines sink;
    ScopedMessageSink useSink(&sink);

    LoggingDesign design;
    std::vector<NetlistRef*> refs; // owned by the objects they help define
    {
        ProgramBuilder builder(&design);
        struct {
            const char* element;
            const char* name;
            const char* value;
        } netlist[] = {
            {"u1/q_reg", "TS_TNM", "data_ffs"}, {"u2/q_reg", "TS_TNM", "data_ffs"},
            {"u3/q_reg", "TS_TNM", "ctrl_ffs"}, {"clk_bufg", "TS_CLKGRP", "clk"},
            {"din<0>", "TS_TNM", "in_pads"},    {"u3/q_reg", "TS_TIG", "TS03"},
        };
        for (const auto& prop : netlist) {
            auto ref = std::make_unique<NetlistRef>(prop.element);
            if (builder.addRefProp(ref.get(), prop.name, prop.value))
                refs.push_back(ref.release());
        }
        builder.addUserGroupProp("all_ffs", "data_ffs:RISING:ctrl_ffs");
        builder.addSpecProp("TS01", "PERIOD all_ffs 10 ns HIGH 50%");
        builder.addSpecProp("TS02", "FROM in_pads TO data_ffs TS01 / 2");
        builder.addSpecProp("TS03", "FROM ctrl_ffs TO data_ffs 4 ns");
        builder.addSpecProp("TS03", "FROM ctrl_ffs TO data_ffs 5 ns");
        builder.addSpecProp("OFFSET", "IN 2 ns VALID 3 ns BEFORE clk");

        std::printf("Building:\n");
        if (builder.buildTSDesign() == nullptr) {
            std::printf("build failed with %d error(s)\n", builder.getNumError());
            return 1;
        }
    }

    std::printf("Canonical properties:\n");
    printProperties(design, refs);

    // The netlist loses the control register: withdraw its references.
    std::printf("Removing u3/q_reg and trimming:\n");
    for (auto it = refs.begin(); it != refs.end();) {
        if ((*it)->element() == "u3/q_reg") {
            (*it)->trim();
            it = refs.erase(it);
        } else {
            ++it;
        }
    }
    design.trim();

    std::printf("Canonical properties after trimming:\n");
    printProperties(design, refs);
    return 0;
}
