// Helpers for builder tests: a builder that exposes its protected parts, and
// a property set that can be built, written back and built again.
#pragma once

#include "TsdTestSupport.h"

#include "tsd/Tsd_Builder.h"

#include <memory>
#include <string>
#include <vector>

namespace tsd_test {

// A builder whose protected operations tests may call, and which may bring
// its own design and allow later definitions to replace earlier ones.
class OpenBuilder : public Tsd_Builder {
public:
    using Tsd_Builder::addError;
    using Tsd_Builder::addWarning;
    using Tsd_Builder::getContext;
    using Tsd_Builder::initBaseBuilder;
    using Tsd_Builder::resolvePendingLinks;
    using Tsd_Builder::setContext;
    using Tsd_Builder::validateUserGroups;
    explicit OpenBuilder(bool createDesign = true) : Tsd_Builder(createDesign) {}
    OpenBuilder(Tsd_Design* design, bool allowOverride)
        : Tsd_Builder(false), m_allowOverride(allowOverride) {
        initBaseBuilder(design);
    }

protected:
    bool allowUserGroupOverride(Tsd_UserGroup* existing, const char* value) override {
        return m_allowOverride || Tsd_Builder::allowUserGroupOverride(existing, value);
    }
    bool allowEndpointSpecOverride(Tsd_EndpointSpec* existing, const char* value) override {
        return m_allowOverride || Tsd_Builder::allowEndpointSpecOverride(existing, value);
    }

private:
    bool m_allowOverride = false;
};

using NameValue = std::pair<std::string, std::string>;

struct RefProp {
    std::string element, name, value;
    bool operator==(const RefProp& o) const {
        return element == o.element && name == o.name && value == o.value;
    }
};

struct PropSet {
    std::vector<NameValue> groups;
    std::vector<NameValue> specs;
    std::vector<RefProp> refs;

    bool operator==(const PropSet& o) const {
        return groups == o.groups && specs == o.specs && refs == o.refs;
    }
    // One property a line, as a scenario file writes them.
    std::string text() const {
        std::string out;
        for (const auto& g : groups)
            out += "group " + g.first + " = " + g.second + "\n";
        for (const auto& s : specs)
            out += "spec " + s.first + " = " + s.second + "\n";
        for (const RefProp& r : refs)
            out += "ref " + r.element + " " + r.name + " = " + r.value + "\n";
        return out;
    }
};

inline std::ostream& operator<<(std::ostream& os, const PropSet& set) {
    return os << set.text();
}

// The outcome of building a property set: the design (owned here) and the
// references handed over, in order.
struct Built {
    std::unique_ptr<Tsd_Design> design;
    std::vector<std::pair<std::string, NamedRef*>> refs;
    short errors = 0;
    std::vector<std::unique_ptr<NamedRef>> refused; // references no object took

    // Everything the design writes back, through the annotator.
    PropSet writeBack() const {
        PropSet out;
        Tsd_Annotator annotator(design.get());
        const char* name = nullptr;
        const char* value = nullptr;
        while (annotator.getNextGroupProp(name, value))
            out.groups.emplace_back(name, value);
        while (annotator.getNextSpecProp(name, value))
            out.specs.emplace_back(name, value);
        for (const auto& ref : refs)
            if (annotator.getRefProp(ref.second, name, value))
                out.refs.push_back({ref.first, name, value});
        return out;
    }
};

// Feeds references first (they are processed at once), then groups and specs.
// A design the builder was given stays with the caller when the build fails.
inline Built build(const PropSet& set, Tsd_Builder& builder) {
    Built built;
    for (const RefProp& r : set.refs) {
        auto ref = std::make_unique<NamedRef>(r.element);
        if (builder.addRefProp(ref.get(), r.name.c_str(), r.value.c_str()))
            built.refs.emplace_back(r.element, ref.release());
        else
            built.refused.push_back(std::move(ref));
    }
    for (const auto& g : set.groups)
        builder.addUserGroupProp(g.first.c_str(), g.second.c_str());
    for (const auto& s : set.specs)
        builder.addSpecProp(s.first.c_str(), s.second.c_str());
    built.design.reset(builder.buildTSDesign());
    built.errors = builder.getNumError();
    return built;
}

inline Built build(const PropSet& set) {
    Tsd_Builder builder;
    return build(set, builder);
}

} // namespace tsd_test
