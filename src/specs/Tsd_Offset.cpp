// OFFSET specifications: global, group-based and net-level.
#include "tsd/Tsd_Specs.h"

#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_PropBuffers.h"
#include "internal/Tsd_Report.h"
#include "tsd/Tsd_StaticBuf.h"

#include <string>

using tsd_detail::dumpLine;
using tsd_detail::dumpTime;
using tsd_detail::orEmpty;
using tsd_detail::propTime;

namespace {

// Words for the four edges, RISING to TRANSLO; anything else has none. The
// clock edge is written with the words the parser reads it from.
using EdgeWords = const char* const[4];
const EdgeWords kClockEdgeWords = {"HIGH", "LOW", "TRANSHI", "TRANSLO"};
const EdgeWords kRegEdgeWords = {"RISING", "FALLING", "TRANSHI", "TRANSLO"};
const EdgeWords kDumpEdgeWords = {"Rising", "Falling", "Transparent High", "Transparent Low"};

const char* edgeWord(Tsd_UserGroup::Edge edge, const EdgeWords& words) {
    return edge >= Tsd_UserGroup::EDGE_RISING && edge <= Tsd_UserGroup::EDGE_TRANSLO ? words[edge]
                                                                                     : "";
}

std::unique_ptr<Tsd_TimeValue> copyOf(const std::unique_ptr<Tsd_TimeValue>& value) {
    return value != nullptr ? std::make_unique<Tsd_TimeValue>(*value) : nullptr;
}

// "   <label>: <name>" or "   <label> unset".
void dumpGroup(DumpStream& stream, short indent, const char* label, const Tsd_Group* group) {
    if (group != nullptr)
        dumpLine(stream, indent, std::string("   ") + label + ": " + orEmpty(group->getName()));
    else
        dumpLine(stream, indent, std::string("   ") + label + " unset");
}

void dumpEdge(DumpStream& stream, short indent, const char* label, Tsd_UserGroup::Edge edge) {
    if (edge != Tsd_UserGroup::EDGE_ANY)
        dumpLine(stream, indent,
                 std::string("   ") + label + ": " + edgeWord(edge, kDumpEdgeWords));
    else
        dumpLine(stream, indent, std::string("   ") + label + " unset");
}

// A group's name as written in the offset text. An offset without its
// clock pad or pad group (the parsers never store one) writes "".
std::string annoName(const Tsd_Group* group) {
    return Tsd_Util::getAnnoName(group != nullptr ? group->getName() : nullptr);
}

bool handOutSpecProp(const char* propName, const std::string& text, const char*& name,
                     const char*& value) {
    return tsd_detail::specPropBuffers().set(propName, text.c_str(), name, value);
}

} // namespace

// --- Tsd_Offset ------------------------------------------------------------

Tsd_Offset::Tsd_Offset() : Tsd_Spec(nullptr) {}

Tsd_Offset::Tsd_Offset(const Tsd_Offset& other)
    : Tsd_Spec(other), m_offsetValue(copyOf(other.m_offsetValue)), m_clockPad(other.m_clockPad),
      m_regGroup(other.m_regGroup), m_dataValid(copyOf(other.m_dataValid)),
      m_before(other.m_before), m_in(other.m_in), m_refClockEdge(other.m_refClockEdge),
      m_regGroupEdge(other.m_regGroupEdge), m_referencePin(other.m_referencePin) {}

Tsd_Offset::~Tsd_Offset() = default;

Tsd_TimeValue Tsd_Offset::getOffsetValue() const {
    return m_offsetValue != nullptr ? *m_offsetValue : Tsd_TimeValue();
}

void Tsd_Offset::setOffsetValue(const Tsd_TimeValue& value) {
    m_offsetValue = std::make_unique<Tsd_TimeValue>(value);
}

void Tsd_Offset::removeOffsetValue() {
    m_offsetValue.reset();
}

Tsd_TimeValue Tsd_Offset::getDataValidValue() const {
    return m_dataValid != nullptr ? *m_dataValid : Tsd_TimeValue();
}

void Tsd_Offset::setDataValid(const Tsd_TimeValue& value) {
    m_dataValid = std::make_unique<Tsd_TimeValue>(value);
}

void Tsd_Offset::clearDataValid() {
    m_dataValid.reset();
}

const char* Tsd_Offset::getSharedString() const {
    static Tsd_StaticBuf buffer(32, 16);
    std::string text = m_in ? "IN:" : "OUT:";
    if (m_offsetValue != nullptr)
        text += propTime(*m_offsetValue);
    if (m_dataValid != nullptr) {
        text += ":VALID:";
        text += propTime(*m_dataValid);
    }
    text += m_before ? ":BEFORE:" : ":AFTER:";
    text += annoName(m_clockPad);
    if (m_referencePin != nullptr) {
        text += ":REFERENCE_PIN:";
        text += annoName(m_referencePin);
    }
    if (m_regGroup != nullptr) {
        text += ":TIMEGRP:";
        text += annoName(m_regGroup);
    }
    if (m_refClockEdge != Tsd_UserGroup::EDGE_ANY) {
        text += ':';
        text += edgeWord(m_refClockEdge, kClockEdgeWords);
    }
    if (m_regGroupEdge != Tsd_UserGroup::EDGE_ANY) {
        text += ':';
        text += edgeWord(m_regGroupEdge, kRegEdgeWords);
    }
    buffer.copy(text.c_str());
    return buffer.getBuffer();
}

bool Tsd_Offset::getProp(const char*& name, const char*& value) const {
    return handOutSpecProp("OFFSET", getSharedString(), name, value);
}

void Tsd_Offset::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, "Tsd_Offset");
    if (m_offsetValue != nullptr)
        dumpLine(stream, indent, "   offset value: " + dumpTime(*m_offsetValue));
    else
        dumpLine(stream, indent, "   offset value unset");
    dumpLine(stream, indent, m_before ? "   BEFORE" : "   AFTER");
    dumpLine(stream, indent, m_in ? "   IN" : "   OUT");
    dumpGroup(stream, indent, "clock group", m_clockPad);
    dumpGroup(stream, indent, "register group", m_regGroup);
    dumpGroup(stream, indent, "reference pin group", m_referencePin);
    if (m_dataValid != nullptr)
        dumpLine(stream, indent, "   data valid: " + dumpTime(*m_dataValid));
    else
        dumpLine(stream, indent, "   data valid unset");
    dumpEdge(stream, indent, "reference clock edge", m_refClockEdge);
    dumpEdge(stream, indent, "register group edge", m_regGroupEdge);
    tsd_detail::dumpScope(stream, indent, getScope());
}

// --- Tsd_GroupOffset -------------------------------------------------------

Tsd_GroupOffset::Tsd_GroupOffset() = default;

Tsd_GroupOffset::Tsd_GroupOffset(const Tsd_GroupOffset& other)
    : Tsd_Offset(other), m_padGroup(other.m_padGroup) {}

Tsd_GroupOffset::~Tsd_GroupOffset() = default;

bool Tsd_GroupOffset::getProp(const char*& name, const char*& value) const {
    std::string text = "TIMEGRP:" + annoName(m_padGroup) + ":OFFSET=";
    text += getSharedString();
    return handOutSpecProp("TS_GROUP_BASED_OFFSET", text, name, value);
}

const char* Tsd_GroupOffset::getUserString() const {
    static Tsd_StaticBuf buffer(50, 30);
    const char* name = nullptr;
    const char* value = nullptr;
    std::string text;
    if (getProp(name, value))
        text = orEmpty(value);
    for (char& c : text)
        if (c == ':')
            c = ' ';
    buffer.copy(text.c_str());
    return buffer.getBuffer();
}

void Tsd_GroupOffset::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, "Tsd_GroupOffset");
    dumpGroup(stream, indent, "pad group", m_padGroup);
    Tsd_Offset::dump(stream, static_cast<short>(indent + 1));
}

// --- Tsd_NetOffset ---------------------------------------------------------

Tsd_NetOffset::Tsd_NetOffset() = default;

Tsd_NetOffset::~Tsd_NetOffset() {
    m_refs.deleteAllRefs();
}

bool Tsd_NetOffset::getProp(const char*& name, const char*& value) const {
    return handOutSpecProp("TS_OFFSET", getSharedString(), name, value);
}

void Tsd_NetOffset::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, "Tsd_NetOffset");
    tsd_detail::dumpRefs(stream, indent, m_refs);
    Tsd_Offset::dump(stream, static_cast<short>(indent + 1));
}
