// The design container: typed lists with trash lists, finds and the dump.
#include "tsd/Tsd_Design.h"

#include "internal/Tsd_NameIndex.h"
#include "internal/Tsd_Once.h"
#include "internal/Tsd_Report.h"

#include <utility>
#include <vector>

namespace {

using tsd_detail::NameIndex;

const char* kGlobalTIGName = "global";

// The key of an element of a typed list: the name (or TSid) of what the
// list's downcast gives; an element it refuses is foreign.
template <class T, T* (Tsd_BaseObj::*Cast)(), class Keyed, const char* (Keyed::*Key)() const>
const char* keyOf(Tsd_BaseObj* obj, bool& foreign) {
    T* typed = (obj->*Cast)();
    foreign = typed == nullptr;
    return typed != nullptr ? (typed->*Key)() : nullptr;
}

// An index for a list and one for its trash.
struct IndexPair {
    explicit IndexPair(NameIndex::KeyOf keyOf) : active(keyOf), trash(keyOf) {}
    NameIndex active;
    NameIndex trash;
};

} // namespace

struct Tsd_Design::FindIndexes {
    IndexPair groups{keyOf<Tsd_Group, &Tsd_BaseObj::getGroup, Tsd_Group, &Tsd_Group::getName>};
    IndexPair clockGroups{
        keyOf<Tsd_ClkGroup, &Tsd_BaseObj::getClkGroup, Tsd_Group, &Tsd_Group::getName>};
    IndexPair tigGroups{
        keyOf<Tsd_TIGGroup, &Tsd_BaseObj::getTIGGroup, Tsd_Group, &Tsd_Group::getName>};
    IndexPair endpointSpecs{
        keyOf<Tsd_EndpointSpec, &Tsd_BaseObj::getEndpointSpec, Tsd_Spec, &Tsd_Spec::getTSid>};
};

Tsd_Design::FindIndexes& Tsd_Design::findIndexes() const {
    if (m_findIndexes == nullptr)
        m_findIndexes = std::make_unique<FindIndexes>();
    return *m_findIndexes;
}

void Tsd_Design::reportObjTrashed(Tsd_BaseObj* /*obj*/, TrimReason /*reason*/) {}

Tsd_Design::Tsd_Design(const char* refType) : m_refType(refType) {}

Tsd_Design::~Tsd_Design() {
    // Every object dies exactly once, in list order, pair by pair. An object
    // that a caller added twice (the add operations do not check) is
    // deleted at its first occurrence only.
    std::vector<Tsd_BaseObj*> objects;
    for (ListPair* pair : {&m_groups, &m_clockGroups, &m_tigGroups, &m_endpointSpecs,
                           &m_offsetSpecs, &m_netSpecs, &m_pathControls, &m_portSpecs})
        for (Tsd_BaseObjList* list : {&pair->active, &pair->trash})
            for (int i = 0; i < list->getCount(); ++i)
                if (Tsd_BaseObj* obj = list->getAt(i))
                    objects.push_back(obj);
    tsd_detail::FirstSeen<Tsd_BaseObj> firstSeen(objects);
    for (Tsd_BaseObj* obj : objects)
        if (firstSeen(obj))
            delete obj;
}

bool Tsd_Design::moveToTrash(ListPair& pair, Tsd_BaseObj* obj) {
    // A null argument would otherwise "remove" the first hole of the list.
    if (obj == nullptr || !pair.active.removeObj(obj))
        return false;
    pair.trash.addObj(obj);
    return true;
}

void Tsd_Design::moveToTrashAt(ListPair& pair, Tsd_BaseObj* obj, int slot) {
    pair.active.setAt(slot, nullptr);
    pair.trash.addObj(obj);
}

bool Tsd_Design::inTrash(const ListPair& pair, const Tsd_BaseObj* obj) {
    // A large trash asked about a few times is scanned: an index of it
    // costs more than that. Once the scans have cost twice its size, its
    // index answers.
    const Tsd_BaseObjList& trash = pair.trash;
    const int count = trash.getCount();
    if (obj == nullptr || count <= 32 || pair.trashScanned >= 2 * static_cast<std::int64_t>(count))
        return trash.contains(obj);
    int slot = 0;
    while (slot < count && trash.getAt(slot) != obj)
        ++slot;
    pair.trashScanned += slot + 1;
    return slot < count;
}

void Tsd_Design::addGroup(Tsd_Group* group) {
    m_groups.active.addObj(group);
}
bool Tsd_Design::moveGroupToTrash(Tsd_Group* group) {
    return moveToTrash(m_groups, group);
}
bool Tsd_Design::isGroupTrashed(const Tsd_Group* group) const {
    return inTrash(m_groups, group);
}

void Tsd_Design::addClockGroup(Tsd_ClkGroup* group) {
    m_clockGroups.active.addObj(group);
}
bool Tsd_Design::moveClockGroupToTrash(Tsd_ClkGroup* group) {
    return moveToTrash(m_clockGroups, group);
}
bool Tsd_Design::isClockGroupTrashed(const Tsd_ClkGroup* group) const {
    return inTrash(m_clockGroups, group);
}

void Tsd_Design::addTIGGroup(Tsd_TIGGroup* group) {
    m_tigGroups.active.addObj(group);
}
bool Tsd_Design::moveTIGGroupToTrash(Tsd_TIGGroup* group) {
    return moveToTrash(m_tigGroups, group);
}
bool Tsd_Design::isTIGGroupTrashed(const Tsd_TIGGroup* group) const {
    return inTrash(m_tigGroups, group);
}

void Tsd_Design::addEndpointSpec(Tsd_EndpointSpec* spec) {
    m_endpointSpecs.active.addObj(spec);
}
bool Tsd_Design::moveEndpointSpecToTrash(Tsd_EndpointSpec* spec) {
    return moveToTrash(m_endpointSpecs, spec);
}
bool Tsd_Design::isEndpointSpecTrashed(const Tsd_EndpointSpec* spec) const {
    return inTrash(m_endpointSpecs, spec);
}

void Tsd_Design::addOffsetSpec(Tsd_Offset* spec) {
    m_offsetSpecs.active.addObj(spec);
}
bool Tsd_Design::moveOffsetSpecToTrash(Tsd_Offset* spec) {
    return moveToTrash(m_offsetSpecs, spec);
}
bool Tsd_Design::isOffsetSpecTrashed(const Tsd_Offset* spec) const {
    return inTrash(m_offsetSpecs, spec);
}

void Tsd_Design::addNetSpec(Tsd_NetTiming* spec) {
    m_netSpecs.active.addObj(spec);
}
bool Tsd_Design::moveNetSpecToTrash(Tsd_NetTiming* spec) {
    return moveToTrash(m_netSpecs, spec);
}
bool Tsd_Design::isNetSpecTrashed(const Tsd_NetTiming* spec) const {
    return inTrash(m_netSpecs, spec);
}

void Tsd_Design::addPathControl(Tsd_PathControl* spec) {
    m_pathControls.active.addObj(spec);
}
bool Tsd_Design::movePathControlToTrash(Tsd_PathControl* spec) {
    return moveToTrash(m_pathControls, spec);
}
bool Tsd_Design::isPathControlTrashed(const Tsd_PathControl* spec) const {
    return inTrash(m_pathControls, spec);
}

void Tsd_Design::addPortTiming(Tsd_PortTiming* spec) {
    m_portSpecs.active.addObj(spec);
}
bool Tsd_Design::movePortTimingToTrash(Tsd_PortTiming* spec) {
    return moveToTrash(m_portSpecs, spec);
}
bool Tsd_Design::isPortTimingTrashed(const Tsd_PortTiming* spec) const {
    return inTrash(m_portSpecs, spec);
}

namespace {

// The first element of the active list (then, when asked, of the trash) whose
// key equals `key`, as a walk in list order finds it: an element of another
// class met on the way is a broken invariant.
template <class T, T* (Tsd_BaseObj::*Cast)()>
T* findIn(const Tsd_BaseObjList& active, const Tsd_BaseObjList& trash, IndexPair& indexes,
          bool includeTrash, const char* key, const char* wrongClassMessage) {
    const std::pair<const Tsd_BaseObjList*, NameIndex*> lists[] = {{&active, &indexes.active},
                                                                   {&trash, &indexes.trash}};
    for (const auto& list : lists) {
        if (list.first == &trash && !includeTrash)
            break;
        NameIndex::Hit hit = list.second->find(*list.first, key);
        if (hit.foreignBefore)
            TSD_MSG().fatal(2, "%s", wrongClassMessage);
        if (hit.slot >= 0)
            return (list.first->getAt(hit.slot)->*Cast)();
    }
    return nullptr;
}

} // namespace

Tsd_Group* Tsd_Design::findGroupByUserName(const char* name, bool includeTrash) const {
    return findIn<Tsd_Group, &Tsd_BaseObj::getGroup>(m_groups.active, m_groups.trash,
                                                     findIndexes().groups, includeTrash, name,
                                                     "Non-group object.\n");
}

Tsd_ClkGroup* Tsd_Design::findClockGroupByNetName(const char* netName, bool includeTrash) const {
    return findIn<Tsd_ClkGroup, &Tsd_BaseObj::getClkGroup>(
        m_clockGroups.active, m_clockGroups.trash, findIndexes().clockGroups, includeTrash, netName,
        "Non-clock group object.\n");
}

Tsd_TIGGroup* Tsd_Design::findTIGByTSid(const char* tsid, bool includeTrash) const {
    if (tsid == nullptr || *tsid == 0)
        tsid = kGlobalTIGName;
    return findIn<Tsd_TIGGroup, &Tsd_BaseObj::getTIGGroup>(m_tigGroups.active, m_tigGroups.trash,
                                                           findIndexes().tigGroups, includeTrash,
                                                           tsid, "Non-TIG object.\n");
}

Tsd_EndpointSpec* Tsd_Design::findEndpointSpecByTSid(const char* tsid, bool includeTrash) const {
    return findIn<Tsd_EndpointSpec, &Tsd_BaseObj::getEndpointSpec>(
        m_endpointSpecs.active, m_endpointSpecs.trash, findIndexes().endpointSpecs, includeTrash,
        tsid, "Non-endpoint spec object.\n");
}

void Tsd_Design::dumpList(DumpStream& stream, short indent, const ListPair& pair) const {
    stream << tsd_detail::indent(indent) << "active objects:" << DumpStream::endl;
    Tsd_BaseObjListIter active(&pair.active);
    while (Tsd_BaseObj* obj = active.next())
        obj->dump(stream, static_cast<short>(indent + 1));
    stream << tsd_detail::indent(indent) << "trashed objects:" << DumpStream::endl;
    Tsd_BaseObjListIter trashed(&pair.trash);
    while (Tsd_BaseObj* obj = trashed.next())
        obj->dump(stream, static_cast<short>(indent + 1));
}

void Tsd_Design::dump(DumpStream& stream, short indent) const {
    const char* pad = tsd_detail::indent(indent);
    stream << pad << "Tsd_Design" << DumpStream::endl;
    if (getRefType() != nullptr)
        stream << pad << "   design refType \"" << getRefType() << "\"" << DumpStream::endl;
    const struct {
        const char* title;
        const ListPair* pair;
    } blocks[] = {
        {"   m_groups:", &m_groups},
        {"   m_clockGroups:", &m_clockGroups},
        {"   m_tigGroups:", &m_tigGroups},
        {"   m_endpointSpecs:", &m_endpointSpecs},
        {"   m_offsetSpecs:", &m_offsetSpecs},
        {"   m_netSpecs:", &m_netSpecs},
        {"   m_pathControls:", &m_pathControls},
        {"   m_portSpecs:", &m_portSpecs},
    };
    for (const auto& block : blocks) {
        stream << pad << block.title << DumpStream::endl;
        dumpList(stream, static_cast<short>(indent + 2), *block.pair);
    }
    stream << pad
           << (m_globalTIG != nullptr ? "   global TIG is installed"
                                      : "   global TIG is not installed")
           << DumpStream::endl;
}
