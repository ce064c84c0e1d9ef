// A tour of the foundation: time values in constraint form, name quoting,
// reference records with an owner, and messages through a custom sink.
#include "tsd/Tsd.h"

#include <cstdio>
#include <string>

namespace {

// A netlist element as a reference record.
class NetRef : public Tsd_Ref {
public:
    explicit NetRef(std::string name) : m_name(std::move(name)) {}
    bool isEqual(const Tsd_Ref* other) const override {
        auto* net = dynamic_cast<const NetRef*>(other);
        return net != nullptr && net->m_name == m_name;
    }

private:
    std::string m_name;
};

// A stand-in for a group that tools attach references to.
class DemoGroup : public Tsd_BaseObj {
public:
    ~DemoGroup() override { m_refs.deleteAllRefs(); }
    Tsd_RefList* getRefList() override { return &m_refs; }
    bool getProp(const char*& name, const char*& value) const override {
        name = "TS_TNM";
        value = "clk_ffs";
        return true;
    }

private:
    Tsd_RefList m_refs;
};

class PrintingSink : public MessageSink {
public:
    void deliver(const MessageRecord& r) override {
        std::printf("  [%s] %s", messageSeverityName(r.severity), r.text.c_str());
    }
};

} // namespace

int main() {
    std::printf("Time values in constraint form:\n");
    Tsd_TimeValue period(10, Tsd_TimeValue::UNITS_NS);
    std::printf("  %s", period.getString(":"));
    period.changeUnits(Tsd_TimeValue::UNITS_MHZ);
    std::printf("  is  %s\n", period.getString(":"));
    std::printf("  2.5 ns in ps: %s\n",
                formatNumber(Tsd_TimeValue(2.5, Tsd_TimeValue::UNITS_NS).getPicoSeconds()));

    std::printf("Names as written in constraint text:\n");
    for (const char* name : {"clk", "9ns", "/top/u1", "*grp", "//x"})
        std::printf("  %-8s -> %s\n", name, Tsd_Util::getAnnoName(name));

    std::printf("Reference records:\n");
    DemoGroup group;
    (new NetRef("ff1"))->setOwner(&group);
    auto* second = new NetRef("ff2");
    second->setOwner(&group);
    std::printf("  group %s holds references\n", group.getUserString());
    second->trim();
    std::printf("  after trimming one: single reference %s\n",
                group.getRefList()->getSingleRef() != nullptr ? "left" : "not left");

    std::printf("Messages through a custom sink:\n");
    PrintingSink sink;
    ScopedMessageSink use(&sink);
    Tsd_StaticBuf buffer(16, 8);
    buffer.copy("PERIOD:clk:10:nS");
    buffer.dumpStats();
    return 0;
}
