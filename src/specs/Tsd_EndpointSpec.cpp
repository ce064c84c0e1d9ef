// The specification base, endpoint specifications and TSid links.
#include "tsd/Tsd_Specs.h"

#include "internal/Tsd_LinkGraph.h"
#include "internal/Tsd_NameIndex.h"
#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_Report.h"
#include "tsd/Tsd_StaticBuf.h"

#include <cstring>
#include <string>
#include <unordered_set>
#include <vector>

using tsd_detail::dumpLine;
using tsd_detail::orEmpty;

// --- Tsd_Spec --------------------------------------------------------------

Tsd_Spec::Tsd_Spec(const char* tsid) : m_tsid(tsid) {}

Tsd_Spec::Tsd_Spec(const Tsd_Spec& other)
    : Tsd_BaseObj(other), m_tsid(other.m_tsid), m_scope(other.m_scope) {}

Tsd_Spec::~Tsd_Spec() = default;

void Tsd_Spec::setTSid(const char* tsid) {
    m_tsid.set(tsid);
    // The design's lookups by TSid catch up with the change.
    tsd_detail::noteNameChange();
}

// --- Tsd_EndpointSpec ------------------------------------------------------

Tsd_EndpointSpec::Tsd_EndpointSpec(const char* tsid)
    : Tsd_Spec(tsid), m_priority(-1), m_ignoreGroup(nullptr) {
    if (tsid == nullptr)
        TSD_MSG().fatal(2, "Tsd_EndpointSpec with NULL TSid\n");
}

Tsd_EndpointSpec::Tsd_EndpointSpec(const Tsd_EndpointSpec& other)
    : Tsd_Spec(other), m_delayOrLink(other.m_delayOrLink), m_priority(other.m_priority),
      m_ignoreGroup(other.m_ignoreGroup), m_priorityWrittenAsNone(other.m_priorityWrittenAsNone) {}

Tsd_EndpointSpec::~Tsd_EndpointSpec() = default;

bool Tsd_EndpointSpec::isIgnored() const {
    return false;
}

Tsd_TimeValue Tsd_EndpointSpec::getDelayValue() const {
    // The chain is walked iteratively, and a spec met twice ends it: a
    // caller that skipped checkLink() gets a clear message, not a stack
    // overflow.
    std::vector<const Tsd_EndpointSpec*> chain;
    std::unordered_set<const Tsd_EndpointSpec*> seen;
    const Tsd_EndpointSpec* current = this;
    while (current->delay() == nullptr) {
        if (current->link() == nullptr || current->link()->spec == nullptr)
            TSD_MSG().fatal(2, "Unresolved link or ignored spec in getDelayValue() on spec %s\n",
                            current->getTSid());
        if (!seen.insert(current).second)
            TSD_MSG().fatal(2, "Circular TSid link in getDelayValue() on spec %s\n", getTSid());
        chain.push_back(current);
        current = current->link()->spec;
    }
    // Apply the links from the end of the chain back to this spec, as the
    // value is defined: each spec scales the value of the one it links to.
    Tsd_TimeValue value = *current->delay();
    for (auto it = chain.rbegin(); it != chain.rend(); ++it) {
        const LinkData& link = *(*it)->link();
        if (link.multiply) {
            value.value *= link.factor;
        } else {
            if (link.factor == 0.0)
                TSD_MSG().fatal(2, "Divide by zero in spec %s\n", (*it)->getTSid());
            value.value /= link.factor;
        }
    }
    return value;
}

void Tsd_EndpointSpec::setDelayValue(const Tsd_TimeValue& delay) {
    m_delayOrLink = delay;
}

void Tsd_EndpointSpec::setLinkData(Tsd_EndpointSpec* spec, bool multiply, double factor) {
    m_delayOrLink = LinkData{spec, multiply, factor};
}

Tsd_EndpointSpec* Tsd_EndpointSpec::getLinkedSpec() const {
    return link() != nullptr ? link()->spec : nullptr;
}

bool Tsd_EndpointSpec::isLinkMultiplied() const {
    return link() != nullptr && link()->multiply;
}

double Tsd_EndpointSpec::getLinkFactor() const {
    return link() != nullptr ? link()->factor : 0.0;
}

int Tsd_EndpointSpec::checkLink(bool report) const {
    if (delay() != nullptr)
        return 0;
    int count = 0;
    Tsd_BaseObjList visited(10); // in the order visited, for the listing
    std::unordered_set<const Tsd_BaseObj*> visitedSet;
    const Tsd_EndpointSpec* current = this;
    for (;;) {
        if (current->isIgnored()) {
            if (current == this)
                return count;
            if (report)
                tsd_detail::reportIgnoredLink(this, current);
            return count + 1;
        }
        const LinkData* link = current->getLinkData();
        if (link == nullptr || link->spec == nullptr)
            TSD_MSG().fatal(2, "NULL link in spec %s.\n", current->getTSid());
        // The list only records addresses; nothing is changed through it.
        visited.addObj(const_cast<Tsd_EndpointSpec*>(current));
        visitedSet.insert(current);
        if (tsd_detail::dividesByZero(current)) {
            if (report)
                tsd_detail::reportZeroDivisor(current);
            ++count;
        }
        if (visitedSet.count(link->spec) != 0) {
            if (report) {
                Message msg = TSD_MSG();
                msg.error("Specification \"%s\" is defined in terms of a circular TSid link, as "
                          "follows:\n",
                          getTSid());
                Tsd_BaseObjListIter iter(&visited);
                while (Tsd_BaseObj* obj = iter.next()) {
                    const Tsd_EndpointSpec* spec = obj->getEndpointSpec();
                    msg.status("   %s is defined as %s\n", spec->getTSid(),
                               formatLink(spec->getLinkData(), " "));
                }
            }
            return count + 1;
        }
        current = link->spec;
        if (current->delay() != nullptr)
            return count;
    }
}

const char* Tsd_EndpointSpec::getDelayPropString() const {
    static Tsd_StaticBuf buffer(16, 8);
    if (delay() != nullptr) {
        buffer.copy(delay()->getString(":"));
    } else if (link() != nullptr) {
        // A pending link writes nothing; a TSid that would not read back as
        // a link is quoted.
        const char* text = formatLink(getLinkData(), "");
        if (text == nullptr) {
            buffer.clear();
        } else {
            std::string written;
            const char* tsid = link()->spec->getTSid();
            tsd_detail::appendLinkTSid(written, tsid);
            written += text + std::strlen(tsid);
            buffer.copy(written.c_str());
        }
    } else {
        return nullptr;
    }
    return buffer.getBuffer();
}

void Tsd_EndpointSpec::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, std::string("Tsd_EndpointSpec ") + orEmpty(getTSid()));
    if (delay() != nullptr)
        dumpLine(stream, indent, "   delay: " + tsd_detail::dumpTime(*delay()));
    else
        dumpLine(stream, indent, "   delay unset");
    if (link() == nullptr) {
        dumpLine(stream, indent, "   link unset");
    } else {
        // A pending link, or one to a spec without TSid, has no text.
        const char* text = formatLink(getLinkData(), "");
        dumpLine(stream, indent,
                 text != nullptr ? std::string("   link: ") + text
                                 : std::string("   link with NULL TSid pointer"));
    }
    if (hasWrittenPriority())
        dumpLine(stream, indent, "   priority: " + std::to_string(m_priority));
    else
        dumpLine(stream, indent, "   priority unset");
    if (m_ignoreGroup != nullptr)
        dumpLine(stream, indent,
                 std::string("   holds TIG group: ") + orEmpty(m_ignoreGroup->getName()));
    else
        dumpLine(stream, indent, "   holds no TIG group");
    tsd_detail::dumpScope(stream, indent, getScope());
}

const char* formatLink(const Tsd_EndpointSpec::LinkData* link, const char* separator) {
    static Tsd_StaticBuf buffer(32, 16);
    if (link == nullptr || link->spec == nullptr || link->spec->getTSid() == nullptr)
        return nullptr;
    std::string text = link->spec->getTSid();
    text += orEmpty(separator);
    text += link->multiply ? '*' : '/';
    text += orEmpty(separator);
    text += formatNumber(link->factor);
    buffer.copy(text.c_str());
    return buffer.getBuffer();
}
