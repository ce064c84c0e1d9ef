// The smallest useful program on an installed tsd: build a design from a few
// constraint properties and print them back in canonical form.
#include <tsd/Tsd.h>

#include <cstdio>
#include <memory>
#include <string>

namespace {

// A netlist element that carries a reference property.
class Element : public Tsd_Ref {
public:
    explicit Element(std::string name) : m_name(std::move(name)) {}
    bool isEqual(const Tsd_Ref* other) const override {
        auto* element = dynamic_cast<const Element*>(other);
        return element != nullptr && element->m_name == m_name;
    }

private:
    std::string m_name;
};

} // namespace

int main() {
    Tsd_Builder builder;
    auto reg = std::make_unique<Element>("u1/q_reg");
    if (!builder.addRefProp(reg.get(), "TS_TNM", "regs"))
        return 1;
    Element* kept = reg.release(); // the TNM group owns it now
    builder.addUserGroupProp("all_regs", "regs");
    builder.addSpecProp("TS01", "PERIOD all_regs 10 ns HIGH 50%");

    std::unique_ptr<Tsd_Design> design(builder.buildTSDesign());
    if (design == nullptr)
        return 1;

    Tsd_Annotator annotator(design.get());
    const char* name = nullptr;
    const char* value = nullptr;
    while (annotator.getNextGroupProp(name, value))
        std::printf("TIMEGRP %s=%s\n", name, value);
    while (annotator.getNextSpecProp(name, value))
        std::printf("TIMESPEC %s=%s\n", name, value);
    if (annotator.getRefProp(kept, name, value))
        std::printf("u1/q_reg %s=%s\n", name, value);
    return 0;
}
