// The group bases, the predefined-group keywords and the five reference
// groups.
#include "tsd/Tsd_Groups.h"

#include "internal/Tsd_NameIndex.h"
#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_Report.h"

#include <cstring>

using tsd_detail::dumpLine;

namespace {

struct PredefKeyword {
    const char* text;
    Tsd_PredefGroup::PredefType type;
};

// In the order in which convertStringToPredefType tries them.
const PredefKeyword kPredefKeywords[] = {
    {"FFS", Tsd_PredefGroup::PREDEF_FFS},   {"LATCHES", Tsd_PredefGroup::PREDEF_LATCHES},
    {"PADS", Tsd_PredefGroup::PREDEF_PADS}, {"RAMS", Tsd_PredefGroup::PREDEF_RAMS},
    {"PPS", Tsd_PredefGroup::PREDEF_PPS},   {"OTHER", Tsd_PredefGroup::PREDEF_OTHER},
};

// The keywords that may begin a TNM pattern, in the order they are tried.
// OTHER is not one of them.
const PredefKeyword kPatternKeywords[] = {
    {"FFS", Tsd_PredefGroup::PREDEF_FFS},   {"RAMS", Tsd_PredefGroup::PREDEF_RAMS},
    {"PADS", Tsd_PredefGroup::PREDEF_PADS}, {"LATCHES", Tsd_PredefGroup::PREDEF_LATCHES},
    {"PPS", Tsd_PredefGroup::PREDEF_PPS},
};

} // namespace

// --- Tsd_Group -------------------------------------------------------------

Tsd_Group::Tsd_Group(const char* name) : m_name(name) {}

Tsd_Group::Tsd_Group(const Tsd_Group& other) : Tsd_BaseObj(other), m_name(other.m_name) {}

Tsd_Group::~Tsd_Group() = default;

void Tsd_Group::setName(const char* name) {
    m_name.set(name);
    // The design's lookups by name catch up with the change.
    tsd_detail::noteNameChange();
}

void Tsd_Group::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, tsd_detail::nameLine(getName()));
}

// --- Tsd_PredefGroup -------------------------------------------------------

const char* Tsd_PredefGroup::convertPredefTypeToString(PredefType type) {
    for (const PredefKeyword& keyword : kPredefKeywords)
        if (keyword.type == type)
            return keyword.text;
    return nullptr;
}

Tsd_PredefGroup::PredefType Tsd_PredefGroup::convertStringToPredefType(const char* text) {
    if (text == nullptr)
        return PREDEF_NONE;
    for (const PredefKeyword& keyword : kPredefKeywords)
        if (tsd_detail::equalsNoCase(text, keyword.text))
            return keyword.type;
    return PREDEF_NONE;
}

// --- Tsd_TNMGroup ----------------------------------------------------------

Tsd_TNMGroup::Tsd_TNMGroup(const char* name) : Tsd_PredefGroup(name) {}

Tsd_TNMGroup::~Tsd_TNMGroup() {
    m_refs.deleteAllRefs();
}

bool Tsd_TNMGroup::getProp(const char*& name, const char*& value) const {
    return tsd_detail::refGroupProp("TS_TNM", getName(), name, value);
}

void Tsd_TNMGroup::dump(DumpStream& stream, short indent) const {
    tsd_detail::dumpRefGroup(stream, indent, "Tsd_TNMGroup", getName(), m_refs);
}

Tsd_PredefGroup::PredefType Tsd_TNMGroup::getPredefTypeForPattern() const {
    const char* name = getName();
    if (name == nullptr)
        return PREDEF_NONE;
    for (const PredefKeyword& keyword : kPatternKeywords) {
        size_t length = std::strlen(keyword.text);
        if (!tsd_detail::startsWithNoCase(name, keyword.text, length))
            continue;
        const char* rest = name + length;
        if (*rest == 0)
            return keyword.type;
        while (*rest != 0 && std::strchr(" \t\n\v\f\r", *rest) != nullptr)
            ++rest;
        return *rest == '(' ? keyword.type : PREDEF_NONE;
    }
    return PREDEF_NONE;
}

bool Tsd_TNMGroup::isSimpleWildcardPattern() const {
    if (getPredefTypeForPattern() == PREDEF_NONE)
        return false;
    return std::strchr(getName(), '(') == nullptr;
}

// --- Tsd_SyncGroup ---------------------------------------------------------

Tsd_SyncGroup::Tsd_SyncGroup(const char* name) : Tsd_TermGroup(name) {}

Tsd_SyncGroup::~Tsd_SyncGroup() {
    m_refs.deleteAllRefs();
}

bool Tsd_SyncGroup::getProp(const char*& name, const char*& value) const {
    return tsd_detail::refGroupProp("TS_TPSYNC", getName(), name, value);
}

void Tsd_SyncGroup::dump(DumpStream& stream, short indent) const {
    tsd_detail::dumpRefGroup(stream, indent, "Tsd_SyncGroup", getName(), m_refs);
}

// --- Tsd_ThruGroup ---------------------------------------------------------

Tsd_ThruGroup::Tsd_ThruGroup(const char* name) : Tsd_Group(name) {}

Tsd_ThruGroup::~Tsd_ThruGroup() {
    m_refs.deleteAllRefs();
}

bool Tsd_ThruGroup::getProp(const char*& name, const char*& value) const {
    return tsd_detail::refGroupProp("TS_TPTHRU", getName(), name, value);
}

void Tsd_ThruGroup::dump(DumpStream& stream, short indent) const {
    tsd_detail::dumpRefGroup(stream, indent, "Tsd_ThruGroup", getName(), m_refs);
}

// --- Tsd_TIGGroup ----------------------------------------------------------

Tsd_TIGGroup::Tsd_TIGGroup(const char* name)
    : Tsd_Group(name != nullptr && *name != 0 ? name : "global") {}

Tsd_TIGGroup::~Tsd_TIGGroup() {
    m_refs.deleteAllRefs();
}

bool Tsd_TIGGroup::getProp(const char*& name, const char*& value) const {
    return tsd_detail::refGroupProp("TS_TIG", getName(), name, value);
}

const char* Tsd_TIGGroup::getTIGid() const {
    const char* name = getName();
    // A name emptied after construction means what an empty name means to
    // the constructor: the global TIG, not a TIG for the TSid "".
    if (name == nullptr || *name == 0 || tsd_detail::equalsNoCase(name, "global"))
        return nullptr;
    return name;
}

void Tsd_TIGGroup::dump(DumpStream& stream, short indent) const {
    tsd_detail::dumpRefGroup(stream, indent, "Tsd_TIGGroup", getName(), m_refs);
}

// --- Tsd_ClkGroup ----------------------------------------------------------

Tsd_ClkGroup::Tsd_ClkGroup(const char* name) : Tsd_Group(name) {}

Tsd_ClkGroup::~Tsd_ClkGroup() {
    m_refs.deleteAllRefs();
}

bool Tsd_ClkGroup::getProp(const char*& name, const char*& value) const {
    return tsd_detail::refGroupProp("TS_CLKGRP", getName(), name, value);
}

void Tsd_ClkGroup::dump(DumpStream& stream, short indent) const {
    tsd_detail::dumpRefGroup(stream, indent, "Tsd_ClkGroup", getName(), m_refs);
}
