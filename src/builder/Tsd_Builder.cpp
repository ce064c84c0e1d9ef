// The builder: construction, the intake of properties and their processing
// into objects of the design.
#include "tsd/Tsd_Builder.h"

#include "internal/Tsd_NameIndex.h"
#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_Report.h"
#include "internal/Tsd_StoredProps.h"
#include "tsd/Tsd_Parsers.h"

#include <cctype>
#include <climits>
#include <cstring>
#include <initializer_list>
#include <string>
#include <string_view>

using tsd_detail::equalsNoCase;
using tsd_detail::orEmpty;
using tsd_detail::startsWithNoCase;

namespace {

short saturatingAdd(short count, long n) {
    long sum = static_cast<long>(count) + n;
    if (sum > SHRT_MAX)
        return SHRT_MAX;
    if (sum < SHRT_MIN)
        return SHRT_MIN;
    return static_cast<short>(sum);
}

// The ten reference properties and what they make.
const char* const kGroupRefProps[] = {"TS_TNM", "TS_TPTHRU", "TS_TPSYNC", "TS_TIG", "TS_CLKGRP"};
const char* const kNetRefProps[] = {"TS_OFFSET", "TS_PERIOD", "TS_MAXDELAY", "TS_MAXSKEW",
                                    "TS_FEEDBACK"};

template <size_t N>
bool oneOf(const char* name, const char* const (&names)[N]) {
    for (const char* candidate : names)
        if (equalsNoCase(name, candidate))
            return true;
    return false;
}

// The texts one after the other, in one allocation: every property the
// build parses is put together this way.
std::string joined(std::initializer_list<std::string_view> parts) {
    std::size_t size = 0;
    for (std::string_view part : parts)
        size += part.size();
    std::string text;
    text.reserve(size);
    for (std::string_view part : parts)
        text.append(part.data(), part.size());
    return text;
}

// A defined name as the parser must see it: written as every name in
// constraint text is, so that it reads back as one name.
std::string nameForText(const char* name) {
    std::string text;
    tsd_detail::appendConstraintName(text, name);
    return text;
}

// The caret line under an echoed "name=value" for a bad token at text column
// `column`, where the name starts at column `prefix`: the text holds the name
// as `written`, the echo as it is.
std::string caretLine(int column, int prefix, const std::string& written, const char* name) {
    int spaces = column - prefix;
    const int writtenLength = static_cast<int>(written.size());
    const int nameLength = static_cast<int>(std::strlen(name));
    if (column >= prefix + writtenLength)
        spaces -= writtenLength - nameLength;
    else if (writtenLength != nameLength && column > prefix)
        spaces -= 1; // inside the quotes
    return std::string(static_cast<size_t>(spaces > 0 ? spaces : 0), ' ') + "^";
}

// Whether a TS property's value holds the OFFSET keyword, standing after a
// ':' or white space (or at the start) and before '=', ':' or white space.
bool hasOffsetKeyword(const char* value) {
    const size_t length = std::strlen(value);
    for (size_t i = 0; i + 6 <= length; ++i) {
        // Only an 'o' can begin the keyword: a cheap test before the full one.
        if ((value[i] | 0x20) != 'o' || !startsWithNoCase(value + i, "OFFSET", 6))
            continue;
        if (i + 6 >= length)
            return false;
        char before = i == 0 ? ':' : value[i - 1];
        char after = value[i + 6];
        bool beforeOk = before == ':' || std::isspace(static_cast<unsigned char>(before));
        bool afterOk =
            after == '=' || after == ':' || std::isspace(static_cast<unsigned char>(after));
        if (beforeOk && afterOk)
            return true;
        i += 5;
    }
    return false;
}

} // namespace

Tsd_Builder::Tsd_Builder(bool createDesign) {
    if (createDesign) {
        m_ownedDesign = std::make_unique<Tsd_Design>();
        m_design = m_ownedDesign.get();
    }
    m_specGroupParser = std::make_unique<Tsd_SpecGroupParser>(this);
    m_netParser = std::make_unique<Tsd_NetParser>(this);
}

void Tsd_Builder::initBaseBuilder(Tsd_Design* design) {
    if (m_design != nullptr)
        TSD_MSG().fatal(2, "Cannot init base builder or re-init derived builder.\n");
    m_design = design;
}

Tsd_Design& Tsd_Builder::design() {
    // A builder constructed without a design must be given one first.
    if (m_design == nullptr)
        TSD_MSG().fatal(2, "Tsd_Builder has no design: call initBaseBuilder() first.\n");
    return *m_design;
}

void Tsd_Builder::setContext(std::unique_ptr<char16_t[]> context) {
    setContext(context.get());
}

void Tsd_Builder::setContext(const char16_t* context) {
    m_contextFormat = nullptr;
    if (context == nullptr)
        m_context.clear();
    else
        m_context = context;
}

const char16_t* Tsd_Builder::getContext() const {
    if (m_contextFormat != nullptr) {
        std::unique_ptr<char16_t[]> context =
            translateMessage("TSDatabase", m_contextFormat, m_contextName, m_contextValue);
        m_contextFormat = nullptr;
        if (context == nullptr)
            m_context.clear();
        else
            m_context = context.get();
    }
    return m_context.c_str();
}

void Tsd_Builder::addError(short n) {
    m_numError = saturatingAdd(m_numError, n);
}

void Tsd_Builder::addWarning(short n) {
    m_numWarning = saturatingAdd(m_numWarning, n);
}

void Tsd_Builder::addErrorCount(int n) {
    m_numError = saturatingAdd(m_numError, n);
}

bool Tsd_Builder::addUserGroupProp(const char* name, const char* value) {
    if (name == nullptr)
        return false;
    if (m_groupProps == nullptr)
        m_groupProps = std::make_unique<tsd_detail::StoredProps>();
    m_groupProps->add(name, orEmpty(value));
    return true;
}

bool Tsd_Builder::addSpecProp(const char* name, const char* value) {
    if (name == nullptr)
        return false;
    bool known = equalsNoCase(name, "OFFSET") || equalsNoCase(name, "ENABLE") ||
                 equalsNoCase(name, "DISABLE") || startsWithNoCase(name, "TS") ||
                 startsWithNoCase(name, "TIMEGRP");
    if (!known)
        return false;
    if (m_specProps == nullptr)
        m_specProps = std::make_unique<tsd_detail::StoredProps>();
    m_specProps->add(name, orEmpty(value));
    return true;
}

bool Tsd_Builder::isRefProp(const char* name) {
    // A cheap test of the "TS_" prefix first.
    if (name == nullptr || (name[0] != 'T' && name[0] != 't') ||
        (name[1] != 'S' && name[1] != 's') || name[2] != '_')
        return false;
    return oneOf(name, kGroupRefProps) || oneOf(name, kNetRefProps);
}

bool Tsd_Builder::addRefProp(Tsd_Ref* ref, const char* name, const char* value) {
    if (ref == nullptr || name == nullptr)
        return false;
    value = orEmpty(value);
    if (ref->getOwner() != nullptr) {
        // getUserString's buffer is shared: copy before formatting.
        std::string owner = ref->getUserString();
        TSD_MSG().fatal(2,
                        "Already-owned referenced passed to Tsd_Builder::addRefProp(). The "
                        "reference is already owned by object %s, and is being added to %s=%s.\n",
                        owner.c_str(), name, value);
    }
    if (oneOf(name, kGroupRefProps)) {
        Tsd_Group* group = getSimpleGroup(name, value);
        if (group == nullptr)
            return false;
        ref->setOwner(group);
        return true;
    }
    if (oneOf(name, kNetRefProps)) {
        Tsd_Spec* spec = buildNetSpecFromProp(name, value);
        if (spec == nullptr)
            return false;
        if (Tsd_NetOffset* offset = spec->getNetOffset())
            design().addOffsetSpec(offset);
        else if (Tsd_NetTiming* net = spec->getNetTiming())
            design().addNetSpec(net);
        else if (Tsd_PortTiming* port = spec->getPortTiming())
            design().addPortTiming(port);
        else
            TSD_MSG().fatal(2, "Non-net spec %s=%s\n", name, value);
        ref->setOwner(spec);
        return true;
    }
    return false;
}

Tsd_Group* Tsd_Builder::getSimpleGroup(const char* name, const char* value) {
    Tsd_Design& d = design();
    if (equalsNoCase(name, "TS_TIG")) {
        if (Tsd_TIGGroup* tig = d.findTIGByTSid(value, false))
            return tig;
        auto* tig = new Tsd_TIGGroup(value);
        d.addTIGGroup(tig);
        return tig;
    }
    if (equalsNoCase(name, "TS_CLKGRP")) {
        if (Tsd_ClkGroup* clock = d.findClockGroupByNetName(value, false)) {
            if (!clock->getRefList()->isEmpty())
                MessageManager::debugTrace("Multiple references for %s=%s\n", name, value);
            return clock;
        }
        auto* clock = new Tsd_ClkGroup(value);
        d.addClockGroup(clock);
        return clock;
    }
    // The three kinds kept in the group list: the class a found group must
    // have, how to make one, and the name of the kind for the clash error.
    struct GroupKind {
        const char* prop;
        const char* what;
        Tsd_Group* (*typed)(Tsd_Group*);
        Tsd_Group* (*make)(const char*);
    };
    static const GroupKind kinds[] = {
        {"TS_TNM", "a TNM group", [](Tsd_Group* g) -> Tsd_Group* { return g->getTNMGroup(); },
         [](const char* n) -> Tsd_Group* { return new Tsd_TNMGroup(n); }},
        {"TS_TPTHRU", "a TPTHRU group",
         [](Tsd_Group* g) -> Tsd_Group* { return g->getThruGroup(); },
         [](const char* n) -> Tsd_Group* { return new Tsd_ThruGroup(n); }},
        {"TS_TPSYNC", "a TPSYNC group",
         [](Tsd_Group* g) -> Tsd_Group* { return g->getSyncGroup(); },
         [](const char* n) -> Tsd_Group* { return new Tsd_SyncGroup(n); }},
    };
    for (const GroupKind& kind : kinds) {
        if (!equalsNoCase(name, kind.prop))
            continue;
        Tsd_Group* found = d.findGroupByUserName(value, false);
        if (found == nullptr) {
            Tsd_Group* created = kind.make(value);
            d.addGroup(created);
            return created;
        }
        if (Tsd_Group* typed = kind.typed(found))
            return typed;
        std::string format = std::string("The identifier \"%s\" is used for both ") + kind.what +
                             " and %z. Group identifiers must be unique.\n";
        TSD_MSG().error(format.c_str(), value, getObjUserId(found));
        countError();
        return nullptr;
    }
    return nullptr;
}

Tsd_UserGroup* Tsd_Builder::processGroupProp(const char* name, const char* value) {
    Tsd_Design& d = design();
    value = orEmpty(value);
    bool inDesign = false;
    const int placeholderSlot = findUnresolvedSlot(name);
    const std::uint32_t unresolvedShape = tsd_detail::NameIndex::shapeOf(m_unresolvedGroups);
    Tsd_UserGroup* group =
        placeholderSlot >= 0 ? m_unresolvedGroups.getAt(placeholderSlot)->getUserGroup() : nullptr;
    if (group == nullptr) {
        Tsd_Group* found = d.findGroupByUserName(name, false);
        if (found != nullptr) {
            group = found->getUserGroup();
            if (group == nullptr) {
                TSD_MSG().error("The identifier \"%s\" is used for both a user group and %z. Group "
                                "identifiers must be unique.\n",
                                name, getObjUserId(found));
                countError();
                return nullptr;
            }
            if (!allowUserGroupOverride(group, value))
                return nullptr;
            group->clearDef();
            inDesign = true;
        } else {
            group = new Tsd_UserGroup(name);
        }
    }
    bool defined = initUserGroupFromProp(group, value);
    if (!inDesign) {
        // A placeholder becomes the defined group itself, so groups that
        // already include it keep pointing at the right object. Where the
        // list kept its layout the placeholder still stands where it was
        // found, as the first slot holding it; a new group stands nowhere.
        if (placeholderSlot >= 0) {
            if (tsd_detail::NameIndex::shapeOf(m_unresolvedGroups) == unresolvedShape &&
                m_unresolvedGroups.getAt(placeholderSlot) == group)
                m_unresolvedGroups.setAt(placeholderSlot, nullptr);
            else
                m_unresolvedGroups.removeObj(group);
        }
        d.addGroup(group);
    }
    return defined ? group : nullptr;
}

bool Tsd_Builder::initUserGroupFromProp(Tsd_UserGroup* group, const char* value) {
    const char* name = orEmpty(group->getName());
    const std::string written = nameForText(name);
    const std::string text = joined({"TIMEGRP ", written, "=", value, " ;"});
    m_specGroupParser->setNewGroup(group);
    m_specGroupParser->clearError();
    if (m_specGroupParser->parse(text.c_str())) {
        const int prefix = 9; // "TIMEGRP " and the column count from 1
        int offset = m_specGroupParser->getBadOffset();
        const char* token = m_specGroupParser->getBadToken();
        if (offset >= prefix && token != nullptr)
            TSD_MSG().error("%zEncountered bad token \"%s\" in TIMEGRP:\n%s=%s\n%s\n", getContext(),
                            token, name, value, caretLine(offset, prefix, written, name).c_str());
        else if (token != nullptr)
            TSD_MSG().error("%zEncountered bad token \"%s\" in TIMEGRP.\n", getContext(), token);
        else
            TSD_MSG().error("%zUnable to parse TIMEGRP definition.\n", getContext());
        countError();
        return false;
    }
    return m_specGroupParser->getNewGroup() != nullptr;
}

Tsd_Spec* Tsd_Builder::processSpecProp(const char* name, const char* value) {
    Tsd_Design& d = design();
    value = orEmpty(value);
    Tsd_Spec* spec = buildSpecFromProp(name, value);
    if (spec == nullptr)
        return nullptr;
    if (Tsd_EndpointSpec* endpoint = spec->getEndpointSpec()) {
        Tsd_EndpointSpec* existing = d.findEndpointSpecByTSid(endpoint->getTSid(), false);
        if (existing != nullptr) {
            if (!allowEndpointSpecOverride(existing, value)) {
                // The refused spec may already wait for a link: that record
                // goes with it.
                dropPendingLink(spec, true);
                delete spec;
                return nullptr;
            }
            // The displaced spec goes to the trash, where pointers to it stay
            // valid and the design deletes it in the end.
            d.moveEndpointSpecToTrash(existing);
            dropPendingLink(existing, false);
        }
        d.addEndpointSpec(endpoint);
    } else if (Tsd_Offset* offset = spec->getOffset()) {
        d.addOffsetSpec(offset);
    } else if (Tsd_PathControl* control = spec->getPathControl()) {
        d.addPathControl(control);
    }
    return spec;
}

void Tsd_Builder::dropPendingLink(const Tsd_Spec* spec, bool newest) {
    // The record's entry is cleared rather than erased: every reader skips
    // cleared entries, and the positions of the others stay valid.
    if (newest) {
        // Its record, if any, is the last one made.
        if (!m_pendingLinks.empty() && m_pendingLinks.back().spec == spec) {
            if (m_pendingLinkSlot != nullptr)
                m_pendingLinkSlot->remove(spec, static_cast<int>(m_pendingLinks.size() - 1));
            m_pendingLinks.back() = Tsd_Pend();
        }
        return;
    }
    if (m_pendingLinkSlot == nullptr) {
        m_pendingLinkSlot = std::make_unique<Tsd_SlotIndex>();
        for (std::size_t i = 0; i < m_pendingLinks.size(); ++i)
            if (m_pendingLinks[i].spec != nullptr)
                m_pendingLinkSlot->add(m_pendingLinks[i].spec, static_cast<int>(i));
    }
    const int slot = m_pendingLinkSlot->first(spec);
    if (slot < 0)
        return;
    m_pendingLinks[static_cast<std::size_t>(slot)] = Tsd_Pend();
    m_pendingLinkSlot->remove(spec, slot);
}

Tsd_Spec* Tsd_Builder::buildSpecFromProp(const char* name, const char* value) {
    std::string text;
    int prefix;
    // Columns of the echoed "name=value" line start `shift` characters
    // before the parsed text's.
    int shift = 0;
    // The name as the text holds it; the echo shows it as it is.
    std::string written = name;
    if (equalsNoCase(name, "OFFSET") || equalsNoCase(name, "ENABLE") ||
        equalsNoCase(name, "DISABLE")) {
        text = joined({name, "=", value, " ;"});
        prefix = 1;
    } else if (startsWithNoCase(name, "TS") && hasOffsetKeyword(value)) {
        text = joined({value, " ;"});
        prefix = 1;
        shift = static_cast<int>(std::strlen(name)) + 1;
    } else {
        written = nameForText(name);
        text = joined({"TIMESPEC ", written, "=", value, " ;"});
        prefix = 10;
    }
    m_specGroupParser->clearError();
    m_specGroupParser->setNewSpec(nullptr);
    m_specGroupParser->setNewGroup(nullptr);
    m_pendingLinkTSid.set(nullptr);

    bool failed = m_specGroupParser->parse2(text.c_str());
    std::unique_ptr<Tsd_Spec> spec(m_specGroupParser->getNewSpec());
    m_specGroupParser->setNewSpec(nullptr);
    if (failed) {
        // A callback may have made an object before the parse failed.
        spec.reset();
        int offset = m_specGroupParser->getBadOffset();
        const char* token = m_specGroupParser->getBadToken();
        if (offset >= prefix && token != nullptr)
            TSD_MSG().error("%zEncountered bad token \"%s\" in TIMESPEC:\n%s=%s\n%s\n",
                            getContext(), token, name, value,
                            caretLine(offset + shift, prefix, written, name).c_str());
        else if (token != nullptr)
            TSD_MSG().error("%zEncountered bad token \"%s\" in TIMESPEC.\n", getContext(), token);
        else
            TSD_MSG().error("%zUnable to parse TIMESPEC definition.\n", getContext());
        countError();
        return nullptr;
    }
    if (spec != nullptr && !m_pendingLinkTSid.isNull()) {
        Tsd_EndpointSpec* endpoint = spec->getEndpointSpec();
        if (endpoint == nullptr)
            TSD_MSG().fatal(2, "Non-endpoint spec %s has pending TSid!\n", name);
        if (m_pendingLinkSlot != nullptr)
            m_pendingLinkSlot->add(endpoint, static_cast<int>(m_pendingLinks.size()));
        m_pendingLinks.push_back(Tsd_Pend{m_pendingLinkTSid, endpoint});
        m_pendingLinkTSid.set(nullptr);
    }
    return spec.release();
}

Tsd_Spec* Tsd_Builder::buildNetSpecFromProp(const char* name, const char* value) {
    if (!oneOf(name, kNetRefProps))
        TSD_MSG().fatal(2, "Non net-spec prop %s=%s\n", name, value);
    const std::string text = joined({name + 3, "=", value, " ;"});
    m_netParser->clearError();
    m_netParser->setNewSpec(nullptr);
    m_pendingRegGroupName.set(nullptr);

    bool failed = m_netParser->parse2(text.c_str());
    std::unique_ptr<Tsd_Spec> spec(m_netParser->getNewSpec());
    m_netParser->setNewSpec(nullptr);
    if (failed) {
        spec.reset();
        if (m_netParser->getBadToken() != nullptr)
            TSD_MSG().error("%zEncountered bad token \"%s\" in specification.\n", getContext(),
                            m_netParser->getBadToken());
        else
            TSD_MSG().error("%zUnable to parse specification.\n", getContext());
        countError();
        return nullptr;
    }
    if (spec != nullptr && !m_pendingRegGroupName.isNull()) {
        Tsd_NetOffset* offset = spec->getNetOffset();
        if (offset == nullptr)
            TSD_MSG().fatal(2, "Non-net offset spec has pending reg group!\n");
        m_pendingRegGroups.push_back(Tsd_Pend{m_pendingRegGroupName, offset});
        m_pendingRegGroupName.set(nullptr);
    }
    return spec.release();
}
