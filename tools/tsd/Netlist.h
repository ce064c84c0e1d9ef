// What a toolchain program takes from the architecture and the netlist when
// it builds a design, supplied by the tool instead: the predefined groups
// (FFS, RAMS, PADS(a*), ...), the clock groups of the design's nets and,
// when asked to, every group, clock net and TSid that the files use but
// never define.
//
// A supplied object lives in the design's lists like any other, so that
// lookups, holders and the graph see it, and holds one SuppliedRef: the
// annotator writes nothing for an object that holds references (the files
// are written back as they came) and trimming never trashes it for lack of
// references, since nothing can withdraw that one.
#pragma once

#include "Diagnostics.h"
#include "Hints.h"

#include "tsd/Tsd.h"

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace tsd_cli {

class Session;

enum class Origin : std::uint8_t { Architecture, DesignNet, Netlist };

// What a name that the files use names.
enum class NameKind { Group, ClockNet, TSid };

class SuppliedRef : public Tsd_Ref {
public:
    explicit SuppliedRef(Origin origin) : m_origin(origin) {}
    Origin origin() const { return m_origin; }
    void dump(DumpStream& stream, short indent) const override;

private:
    Origin m_origin;
};

// A group that the architecture or the netlist defines: a FROM/TO, period,
// register or pad group and a member of user groups.
class SuppliedGroup : public Tsd_PredefGroup {
public:
    SuppliedGroup(const char* name, Origin origin);
    ~SuppliedGroup() override;
    SuppliedGroup(const SuppliedGroup&) = delete;
    SuppliedGroup& operator=(const SuppliedGroup&) = delete;

    Tsd_RefList* getRefList() override { return &m_refs; }
    void dump(DumpStream& stream, short indent) const override;
    Origin origin() const { return m_origin; }

private:
    Tsd_RefList m_refs;
    Origin m_origin;
};

// A specification of the netlist that links and TIG directives of the files
// name. Its delay is unknown: it stands as 0 ns.
class SuppliedSpec : public Tsd_DelayPath {
public:
    explicit SuppliedSpec(const char* tsid);
    ~SuppliedSpec() override;
    SuppliedSpec(const SuppliedSpec&) = delete;
    SuppliedSpec& operator=(const SuppliedSpec&) = delete;

    Tsd_RefList* getRefList() override { return &m_refs; }

private:
    Tsd_RefList m_refs;
};

// The tool's stand-in for the netlist and the architecture during one build.
// The builder's hooks ask it first; a null answer leaves the name to the
// builder's own lookup and its messages.
class NetlistStandIn {
public:
    explicit NetlistStandIn(Session& session) : m_session(session) {}

    void addDesignNet(std::string_view net);
    void setAssume(bool assume) { m_assume = assume; }
    bool assume() const { return m_assume; }
    // Names taken as defined by the netlist, each reported once as a note.
    int assumedCount() const { return m_assumed; }

    // The hooks' side. A group named where a term group or a member stands.
    Tsd_PredefGroup* termGroup(const char* name);
    Tsd_ThruGroup* thruGroup(const char* name);
    // A clock group that the builder found or made for a spec's clock net.
    void clockGroupAsked(Tsd_ClkGroup* group);
    // A net offset's register group that the builder left pending.
    void regGroupPending(const char* name);

    // Around Tsd_Builder::buildTSDesign: what intake left undecided, and the
    // TSids that the files link to or ignore without defining them.
    void beforeBuild();
    void afterBuild();

    // Adds to each error about a name that is not defined, and to each note
    // of a name taken from the netlist, the closest defined name; and, when
    // a file other than a property file was read, to the first such error
    // that --assume-netlist exists. Call after the diagnostics are in their
    // order.
    void explainMissingNames(std::vector<Diagnostic>& diags);
    // `did you mean "NAME"?` for the defined name of one of `kinds` closest
    // to `name`, or empty.
    std::string hint(std::initializer_list<NameKind> kinds, std::string_view name);

private:
    bool isDefinedByGroupRecord(const std::string& name);
    // A group for a name that the design lacks: the architecture's for a
    // predefined name, else the netlist's when names are assumed; null
    // when neither, or when a group record defines the name.
    SuppliedGroup* supplyGroup(const char* name, std::ptrdiff_t record);
    void supply(Tsd_BaseObj* obj, Origin origin);
    void takeFromNetlist(NameKind kind, const char* name, std::ptrdiff_t record);
    void supplyTSids();
    std::vector<std::string> namesOf(NameKind kind);

    Session& m_session;
    bool m_assume = false;
    int m_assumed = 0;
    std::unordered_set<std::string> m_designNets;
    std::vector<std::string> m_designNetOrder; // hints prefer the first named
    // Made on first need, once every record is in.
    std::unique_ptr<std::unordered_set<std::string>> m_groupRecordNames;
    // Names the hooks met while references were handed over, with the first
    // record that named them: decided before the build, when every
    // reference is in.
    std::vector<std::pair<std::string, std::ptrdiff_t>> m_intakeRegGroups;
    std::unordered_map<std::string, std::ptrdiff_t> m_intakeClocks;
    std::vector<std::pair<SuppliedSpec*, std::size_t>> m_tsids; // and the record naming it
    std::unique_ptr<NameHints> m_hints[3];                      // by NameKind, made on first need
};

} // namespace tsd_cli
