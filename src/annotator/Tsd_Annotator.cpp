#include "tsd/Tsd_Annotator.h"

#include "internal/Tsd_Report.h"
#include "tsd/Tsd_Design.h"

namespace {

// The next object of `iter` that holds no references (those are written
// per reference through getRefProp); null at the end.
Tsd_BaseObj* nextWithoutRefs(Tsd_BaseObjListIter& iter) {
    while (Tsd_BaseObj* obj = iter.next())
        if (!obj->refOwner())
            return obj;
    return nullptr;
}

Tsd_Design& requireDesign(Tsd_Design* design) {
    if (design == nullptr)
        TSD_MSG().fatal(2, "NULL design in Tsd_Annotator.\n");
    return *design;
}

} // namespace

Tsd_Annotator::Tsd_Annotator(Tsd_Design* design)
    : m_design(&requireDesign(design)),
      m_groupIter(std::make_unique<Tsd_BaseObjListIter>(design->getGroupList())),
      m_endpointSpecIter(std::make_unique<Tsd_BaseObjListIter>(design->getEndpointSpecList())),
      m_offsetSpecIter(std::make_unique<Tsd_BaseObjListIter>(design->getOffsetSpecList())),
      m_pathControlIter(std::make_unique<Tsd_BaseObjListIter>(design->getPathControlList())) {}

Tsd_Annotator::~Tsd_Annotator() = default;

bool Tsd_Annotator::getNextGroupProp(const char*& name, const char*& value) {
    name = nullptr;
    value = nullptr;
    Tsd_BaseObj* group = nextWithoutRefs(*m_groupIter);
    return group != nullptr && group->getProp(name, value);
}

bool Tsd_Annotator::getNextSpecProp(const char*& name, const char*& value, const char*& scope) {
    name = nullptr;
    value = nullptr;
    scope = nullptr;
    Tsd_BaseObj* spec = nullptr;
    // Endpoint specs, then offsets, then path controls; an exhausted walk is
    // dropped and the next one continues in the same call.
    for (std::unique_ptr<Tsd_BaseObjListIter>* walk : {&m_endpointSpecIter, &m_offsetSpecIter}) {
        if (spec == nullptr && *walk != nullptr) {
            spec = nextWithoutRefs(**walk);
            if (spec == nullptr)
                walk->reset();
        }
    }
    if (spec == nullptr)
        spec = m_pathControlIter->next();
    if (spec == nullptr)
        return false;
    if (!spec->getProp(name, value))
        TSD_MSG().internalError("getProp() returned FALSE on spec %s.\n", spec->getUserString());
    if (Tsd_Spec* asSpec = spec->getSpec())
        scope = asSpec->getScope();
    return true;
}

bool Tsd_Annotator::getNextSpecProp(const char*& name, const char*& value) {
    const char* scope = nullptr;
    return getNextSpecProp(name, value, scope);
}

bool Tsd_Annotator::getRefProp(Tsd_Ref* ref, const char*& name, const char*& value,
                               const char*& scope) {
    name = nullptr;
    value = nullptr;
    scope = nullptr;
    Tsd_BaseObj* owner = ref != nullptr ? ref->getOwner() : nullptr;
    if (owner == nullptr)
        return false;
    // A trashed owner means the reference's property is to be removed.
    bool trashed = false;
    if (Tsd_TIGGroup* tig = owner->getTIGGroup())
        trashed = m_design->isTIGGroupTrashed(tig);
    else if (Tsd_ClkGroup* clock = owner->getClkGroup())
        trashed = m_design->isClockGroupTrashed(clock);
    else if (Tsd_Group* group = owner->getGroup())
        trashed = m_design->isGroupTrashed(group);
    else if (Tsd_Offset* offset = owner->getOffset())
        trashed = m_design->isOffsetSpecTrashed(offset);
    else if (Tsd_NetTiming* net = owner->getNetTiming())
        trashed = m_design->isNetSpecTrashed(net);
    else if (Tsd_PortTiming* port = owner->getPortTiming())
        trashed = m_design->isPortTimingTrashed(port);
    if (trashed)
        return false;
    if (Tsd_Spec* spec = owner->getSpec())
        scope = spec->getScope();
    return owner->getProp(name, value);
}

bool Tsd_Annotator::getRefProp(Tsd_Ref* ref, const char*& name, const char*& value) {
    const char* scope = nullptr;
    return getRefProp(ref, name, value, scope);
}

void Tsd_Annotator::dump(DumpStream& stream, short indent) const {
    const char* pad = tsd_detail::indent(indent);
    stream << pad << "Tsd_Annotator" << DumpStream::endl;
    stream << pad << "   nothing interesting to report" << DumpStream::endl;
}
