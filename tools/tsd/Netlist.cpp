#include "Netlist.h"

#include "Hints.h"
#include "Session.h"

#include "tsd/host/DumpStream.h"

namespace tsd_cli {

namespace {

const char* originWord(Origin origin) {
    switch (origin) {
    case Origin::Architecture:
        return "the architecture";
    case Origin::DesignNet:
        return "a net of the design";
    case Origin::Netlist:
        return "the netlist";
    }
    return "?";
}

std::string indentOf(short indent) {
    return std::string(static_cast<std::size_t>(indent) * 3, ' ');
}

// Every keyword begins with one of these letters: most names need no more.
bool mayBePredefined(const char* name) {
    switch (name[0]) {
    case 'F':
    case 'f':
    case 'L':
    case 'l':
    case 'P':
    case 'p':
    case 'R':
    case 'r':
        return true;
    default:
        return false;
    }
}

bool isPredefinedName(const char* name) {
    if (!mayBePredefined(name))
        return false;
    // The library's rule for TNM names: a keyword alone or KEYWORD(pattern).
    Tsd_TNMGroup probe(name);
    return probe.getPredefTypeForPattern() != Tsd_PredefGroup::PREDEF_NONE;
}

// "TS" in any case begins a TSid.
bool looksLikeTSid(std::string_view word) {
    return word.size() > 2 && (word[0] == 'T' || word[0] == 't') &&
           (word[1] == 'S' || word[1] == 's');
}

// Words after which a TSid-like word is a group or a clock, not a link.
bool namesAGroup(std::string_view keyword) {
    for (const char* word : {"FROM", "THRU", "TO", "PERIOD", "TIMEGRP", "BEFORE", "AFTER"})
        if (equalsNoCase(keyword, word))
            return true;
    return false;
}

// The errors about names that are not defined, by what they name: a marker
// before the quoted name and the text right after it.
struct MissingPattern {
    std::string_view before;
    std::string_view after;
    NameKind kind;
};

constexpr MissingPattern kMissing[] = {
    {"No TNM, TPSYNC or user group named \"", "\" is defined.", NameKind::Group},
    {"No TPTHRU group named \"", "\" is defined.", NameKind::Group},
    {"A group named \"", "\" was referenced in one or more TIMEGRP definitions, but was never",
     NameKind::Group},
    {"Group \"",
     "\" is used as the register group in one or more OFFSET specifications. This "
     "group is not defined",
     NameKind::Group},
    {"The following spec(s) referenced the Tsd_ClkGroup \"", "\", but no such TS_CLKGRP",
     NameKind::ClockNet},
    {"is defined in terms of a specification with TSid \"", "\", which does not exist.",
     NameKind::TSid},
    {"One or more TIG directives were specified for a specification with TSid \"",
     "\", which does not exist.", NameKind::TSid},
};

// The notes of names taken from the netlist: "NAME" and this tail. A
// misspelt name deserves a hint there as much as in an error.
std::string takenTail(NameKind kind) {
    static const char* const kWhat[] = {"a group", "a clock net", "a specification"};
    return std::string("\" is taken as ") + kWhat[static_cast<int>(kind)] + " of the netlist";
}

bool takenName(std::string_view text, NameKind& kind, std::string_view& name) {
    for (NameKind each : {NameKind::Group, NameKind::ClockNet, NameKind::TSid}) {
        std::string tail = takenTail(each);
        if (text.size() > tail.size() && text[0] == '"' &&
            text.substr(text.size() - tail.size()) == tail) {
            kind = each;
            name = text.substr(1, text.size() - tail.size() - 1);
            return true;
        }
    }
    return false;
}

bool missingName(std::string_view text, NameKind& kind, std::string_view& name) {
    std::string_view line = text.substr(0, text.find('\n'));
    for (const MissingPattern& pattern : kMissing) {
        std::size_t start = line.find(pattern.before);
        if (start == std::string_view::npos)
            continue;
        start += pattern.before.size();
        std::size_t end = line.rfind(pattern.after);
        if (end == std::string_view::npos || end < start)
            continue;
        kind = pattern.kind;
        name = line.substr(start, end - start);
        return true;
    }
    return false;
}

} // namespace

void SuppliedRef::dump(DumpStream& stream, short indent) const {
    std::string line = indentOf(indent) + "SuppliedRef " + originWord(m_origin);
    stream << line.c_str() << DumpStream::endl;
}

SuppliedGroup::SuppliedGroup(const char* name, Origin origin)
    : Tsd_PredefGroup(name), m_refs(1), m_origin(origin) {}

SuppliedGroup::~SuppliedGroup() {
    m_refs.deleteAllRefs();
}

void SuppliedGroup::dump(DumpStream& stream, short indent) const {
    std::string line = indentOf(indent) + "SuppliedGroup";
    stream << line.c_str() << DumpStream::endl;
    line = indentOf(static_cast<short>(indent + 1)) + "name = " + getName();
    stream << line.c_str() << DumpStream::endl;
    line = indentOf(indent) + "   references:";
    stream << line.c_str() << DumpStream::endl;
    Tsd_RefListIter iter(&m_refs);
    while (Tsd_Ref* ref = iter.next())
        ref->dump(stream, static_cast<short>(indent + 2));
}

SuppliedSpec::SuppliedSpec(const char* tsid) : Tsd_DelayPath(tsid), m_refs(1) {
    setDelayValue(Tsd_TimeValue(0.0, Tsd_TimeValue::UNITS_NS));
}

SuppliedSpec::~SuppliedSpec() {
    m_refs.deleteAllRefs();
}

Tsd_TermGroup* CliBuilder::getTermGroupForSpec(const char* name) {
    if (Tsd_PredefGroup* group = m_standIn->termGroup(name))
        return group;
    return Tsd_Builder::getTermGroupForSpec(name);
}

Tsd_PredefGroup* CliBuilder::getPredefGroupForGroup(const char* name) {
    if (Tsd_PredefGroup* group = m_standIn->termGroup(name))
        return group;
    return Tsd_Builder::getPredefGroupForGroup(name);
}

Tsd_ThruGroup* CliBuilder::getThruGroupForSpec(const char* name) {
    if (Tsd_ThruGroup* group = m_standIn->thruGroup(name))
        return group;
    return Tsd_Builder::getThruGroupForSpec(name);
}

Tsd_ClkGroup* CliBuilder::getClkGroupForSpec(const char* netName) {
    Tsd_ClkGroup* group = Tsd_Builder::getClkGroupForSpec(netName);
    m_standIn->clockGroupAsked(group);
    return group;
}

Tsd_TermGroup* CliBuilder::getTermGroupForNetOffset(const char* name) {
    Tsd_TermGroup* group = Tsd_Builder::getTermGroupForNetOffset(name);
    if (group == nullptr)
        m_standIn->regGroupPending(name);
    return group;
}

void NetlistStandIn::addDesignNet(std::string_view net) {
    if (m_designNets.emplace(net).second)
        m_designNetOrder.emplace_back(net);
}

bool NetlistStandIn::isDefinedByGroupRecord(const std::string& name) {
    if (!m_groupRecordNames) {
        m_groupRecordNames = std::make_unique<std::unordered_set<std::string>>();
        const PropStore& store = m_session.store();
        for (const StoredProp& record : store.records())
            if (record.kind == PropKind::Group)
                m_groupRecordNames->emplace(store.name(record));
    }
    return m_groupRecordNames->count(name) != 0;
}

void NetlistStandIn::supply(Tsd_BaseObj* obj, Origin origin) {
    (new SuppliedRef(origin))->setOwner(obj); // the owner deletes it
}

void NetlistStandIn::takeFromNetlist(NameKind kind, const char* name, std::ptrdiff_t record) {
    ++m_assumed;
    m_session.addNote("\"" + std::string(name) + takenTail(kind), record);
}

SuppliedGroup* NetlistStandIn::supplyGroup(const char* name, std::ptrdiff_t record) {
    bool predefined = isPredefinedName(name);
    if ((!predefined && !m_assume) || isDefinedByGroupRecord(name))
        return nullptr; // a definition may come later
    Origin origin = predefined ? Origin::Architecture : Origin::Netlist;
    if (!predefined)
        takeFromNetlist(NameKind::Group, name, record);
    auto* group = new SuppliedGroup(name, origin);
    m_session.design().addGroup(group);
    supply(group, origin);
    return group;
}

Tsd_PredefGroup* NetlistStandIn::termGroup(const char* name) {
    // Asked while the stored groups and specs are processed: every
    // reference is in, so a TNM group of the name has won already.
    if (name == nullptr || !m_session.m_building || (!m_assume && !mayBePredefined(name)))
        return nullptr;
    if (m_session.design().findGroupByUserName(name, false) != nullptr)
        return nullptr;
    return supplyGroup(name, -1);
}

Tsd_ThruGroup* NetlistStandIn::thruGroup(const char* name) {
    if (name == nullptr || !m_assume || !m_session.m_building)
        return nullptr;
    Tsd_Design& design = m_session.design();
    if (design.findGroupByUserName(name, false) != nullptr || isDefinedByGroupRecord(name))
        return nullptr;
    takeFromNetlist(NameKind::Group, name, -1);
    auto* group = new Tsd_ThruGroup(name);
    design.addGroup(group);
    supply(group, Origin::Netlist);
    return group;
}

void NetlistStandIn::clockGroupAsked(Tsd_ClkGroup* group) {
    if (group == nullptr || !group->getRefList()->isEmpty() || group->getName() == nullptr)
        return;
    if (!m_session.m_building) {
        // A TS_CLKGRP record may still come: decided before the build.
        std::string name(group->getName());
        if (m_intakeClocks.find(name) == m_intakeClocks.end())
            m_intakeClocks.emplace(std::move(name), m_session.m_currentRecord);
        return;
    }
    bool designNet = m_designNets.count(group->getName()) != 0;
    if (!designNet && !m_assume)
        return;
    if (!designNet)
        takeFromNetlist(NameKind::ClockNet, group->getName(), -1);
    supply(group, designNet ? Origin::DesignNet : Origin::Netlist);
}

void NetlistStandIn::regGroupPending(const char* name) {
    if (name != nullptr)
        m_intakeRegGroups.emplace_back(name, m_session.m_currentRecord);
}

void NetlistStandIn::beforeBuild() {
    Tsd_Design& design = m_session.design();
    // Clock groups made for net-level specs that no TS_CLKGRP record took.
    Tsd_BaseObjListIter clocks(design.getClockGroupList());
    while (Tsd_BaseObj* obj = clocks.next()) {
        Tsd_ClkGroup* clock = obj->getClkGroup();
        if (clock == nullptr || !clock->getRefList()->isEmpty() || clock->getName() == nullptr)
            continue;
        bool designNet = m_designNets.count(clock->getName()) != 0;
        if (!designNet && !m_assume)
            continue;
        if (!designNet) {
            auto first = m_intakeClocks.find(clock->getName());
            takeFromNetlist(NameKind::ClockNet, clock->getName(),
                            first != m_intakeClocks.end() ? first->second : -1);
        }
        supply(clock, designNet ? Origin::DesignNet : Origin::Netlist);
    }
    m_intakeClocks.clear();
    // Register groups of net offsets: the build looks them up by name.
    for (const auto& [name, record] : m_intakeRegGroups)
        if (design.findGroupByUserName(name.c_str(), false) == nullptr)
            supplyGroup(name.c_str(), record);
    m_intakeRegGroups.clear();
    if (m_assume)
        supplyTSids();
}

// A TSid that a spec links to or a TIG directive ignores must exist when the
// build resolves them: each TSid-like word that no spec record defines gets
// a stand-in now; afterBuild keeps the ones that were used.
void NetlistStandIn::supplyTSids() {
    const PropStore& store = m_session.store();
    Tsd_Design& design = m_session.design();
    std::unordered_set<std::string> defined;
    for (const StoredProp& record : store.records())
        if (record.kind == PropKind::Spec && looksLikeTSid(store.name(record)))
            defined.emplace(store.name(record));
    auto candidate = [&](std::string word, std::size_t record) {
        if (defined.count(word) != 0 || design.findEndpointSpecByTSid(word.c_str(), false))
            return;
        auto* spec = new SuppliedSpec(word.c_str());
        design.addEndpointSpec(spec);
        supply(spec, Origin::Netlist);
        m_tsids.emplace_back(spec, record);
        defined.emplace(std::move(word));
    };
    for (std::size_t i = 0; i < store.size(); ++i) {
        const StoredProp& record = store[i];
        if (record.kind == PropKind::Ref) {
            if (equalsNoCase(store.name(record), "TS_TIG") && looksLikeTSid(store.value(record)))
                candidate(std::string(store.value(record)), i);
            continue;
        }
        if (record.kind != PropKind::Spec)
            continue;
        std::vector<std::string> words = valueWords(store.value(record));
        for (std::size_t w = 0; w < words.size(); ++w) {
            std::string word = words[w].substr(0, words[w].find_first_of("*/"));
            if (looksLikeTSid(word) && (w == 0 || !namesAGroup(words[w - 1])))
                candidate(std::move(word), i);
        }
    }
}

void NetlistStandIn::afterBuild() {
    if (m_tsids.empty())
        return;
    Tsd_Design& design = m_session.design();
    std::unordered_set<const Tsd_EndpointSpec*> linked;
    Tsd_BaseObjListIter specs(design.getEndpointSpecList());
    while (Tsd_BaseObj* obj = specs.next())
        if (Tsd_EndpointSpec* spec = obj->getEndpointSpec())
            linked.insert(spec->getLinkedSpec());
    for (const auto& [spec, record] : m_tsids) {
        if (linked.count(spec) != 0 || spec->getIgnoreGroup() != nullptr)
            takeFromNetlist(NameKind::TSid, spec->getTSid(), static_cast<std::ptrdiff_t>(record));
        else
            design.moveEndpointSpecToTrash(spec); // a group's name after all
    }
    m_tsids.clear();
}

// Names taken from the netlist are no hints: they are as uncertain as the
// name that missed.
bool takenFromNetlist(Tsd_BaseObj* obj) {
    Tsd_RefList* refs = obj->getRefList();
    auto* supplied = refs != nullptr ? dynamic_cast<SuppliedRef*>(refs->getSingleRef()) : nullptr;
    return supplied != nullptr && supplied->origin() == Origin::Netlist;
}

std::vector<std::string> NetlistStandIn::namesOf(NameKind kind) {
    std::vector<std::string> names;
    Tsd_Design& design = m_session.design();
    auto addAll = [&names](Tsd_BaseObjList* list, auto accept) {
        Tsd_BaseObjListIter iter(list);
        while (Tsd_BaseObj* obj = iter.next())
            if (const char* name = accept(obj))
                names.emplace_back(name);
    };
    switch (kind) {
    case NameKind::Group:
        addAll(design.getGroupList(), [](Tsd_BaseObj* obj) -> const char* {
            Tsd_Group* group = obj->getGroup();
            return group != nullptr && !takenFromNetlist(obj) ? group->getName() : nullptr;
        });
        for (const char* keyword : {"FFS", "LATCHES", "PADS", "RAMS", "PPS"})
            names.emplace_back(keyword);
        break;
    case NameKind::ClockNet:
        addAll(design.getClockGroupList(), [](Tsd_BaseObj* obj) -> const char* {
            Tsd_ClkGroup* clock = obj->getClkGroup();
            bool defined = clock != nullptr && !clock->getRefList()->isEmpty();
            return defined && !takenFromNetlist(obj) ? clock->getName() : nullptr;
        });
        names.insert(names.end(), m_designNetOrder.begin(), m_designNetOrder.end());
        break;
    case NameKind::TSid: {
        // What the files define, whether or not it was built.
        const PropStore& store = m_session.store();
        for (const StoredProp& record : store.records())
            if (record.kind == PropKind::Spec && looksLikeTSid(store.name(record)))
                names.emplace_back(store.name(record));
        break;
    }
    }
    return names;
}

void NetlistStandIn::explainMissingNames(std::vector<Diagnostic>& diags) {
    // Only a file without the netlist's reference records is worth checking
    // as if the netlist were there.
    bool optionTold = m_assume || m_session.store().fileCount() == m_session.m_propFilesRead;
    for (Diagnostic& diag : diags) {
        NameKind kind = NameKind::Group;
        std::string_view name;
        bool missing = diag.severity == Severity::Error && missingName(diag.text, kind, name);
        if (!missing && !(diag.severity == Severity::Note && takenName(diag.text, kind, name)))
            continue;
        std::string close = hint({kind}, name);
        if (!close.empty())
            diag.details.push_back("   " + close);
        if (missing && !optionTold) {
            diag.details.emplace_back("   (with --assume-netlist, names that the files use but "
                                      "never define are taken as defined by the netlist)");
            optionTold = true;
        }
    }
}

std::string NetlistStandIn::hint(std::initializer_list<NameKind> kinds, std::string_view name) {
    for (NameKind kind : kinds) {
        std::unique_ptr<NameHints>& hints = m_hints[static_cast<int>(kind)];
        if (!hints)
            hints = std::make_unique<NameHints>(namesOf(kind));
        std::string close = hints->didYouMean(name);
        if (!close.empty())
            return close;
    }
    return std::string();
}

} // namespace tsd_cli
