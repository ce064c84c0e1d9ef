// The timing-specification database of one design: it owns every group and
// specification in eight typed lists, each with a trash list. Trashed
// objects stay valid until the design is destroyed.
#pragma once

#include <cstdint>
#include <memory>

#include "tsd/Tsd_BaseObj.h"
#include "tsd/Tsd_Groups.h"
#include "tsd/Tsd_Specs.h"

class Tsd_Design {
public:
    // Why trimming trashed an object.
    enum TrimReason : std::int32_t {
        TRIM_NO_REFERENCES = 0,
        TRIM_EMPTY_USER_GROUP = 1,
        TRIM_PATH_ENDPOINT = 2,
        TRIM_PATH_THRU = 3,
        TRIM_PERIOD_GROUP = 4,
        TRIM_TIG_OF_TRASHED_SPEC = 5,
        TRIM_CLOCK_GROUP = 6,
        TRIM_REG_GROUP = 7,
        TRIM_PAD_GROUP = 8,
        TRIM_NONE = 9,
    };

protected:
    // Called once for every object that trim() moves to trash, right after
    // the move. The base does nothing; derive to log or count removals. It
    // must leave the design as it is: trim plans its cascade ahead.
    virtual void reportObjTrashed(Tsd_BaseObj* obj, TrimReason reason);

public:
    explicit Tsd_Design(const char* refType = nullptr);
    // Deletes every object of every list and trash list, once each.
    virtual ~Tsd_Design();
    virtual void dump(DumpStream& stream, short indent) const;

    Tsd_Design(const Tsd_Design&) = delete;
    Tsd_Design& operator=(const Tsd_Design&) = delete;

    const char* getRefType() const { return m_refType.get(); }

    // Per list: add (takes ownership; null is ignored), the active list, the
    // trash list, move to trash (false when not in the active list) and
    // is-trashed (false for null).
    void addGroup(Tsd_Group* group);
    Tsd_BaseObjList* getGroupList() { return &m_groups.active; }
    Tsd_BaseObjList* getGroupTrash() { return &m_groups.trash; }
    bool moveGroupToTrash(Tsd_Group* group);
    bool isGroupTrashed(const Tsd_Group* group) const;

    void addClockGroup(Tsd_ClkGroup* group);
    Tsd_BaseObjList* getClockGroupList() { return &m_clockGroups.active; }
    Tsd_BaseObjList* getClockGroupTrash() { return &m_clockGroups.trash; }
    bool moveClockGroupToTrash(Tsd_ClkGroup* group);
    bool isClockGroupTrashed(const Tsd_ClkGroup* group) const;

    void addTIGGroup(Tsd_TIGGroup* group);
    Tsd_BaseObjList* getTIGGroupList() { return &m_tigGroups.active; }
    Tsd_BaseObjList* getTIGGroupTrash() { return &m_tigGroups.trash; }
    bool moveTIGGroupToTrash(Tsd_TIGGroup* group);
    bool isTIGGroupTrashed(const Tsd_TIGGroup* group) const;

    void addEndpointSpec(Tsd_EndpointSpec* spec);
    Tsd_BaseObjList* getEndpointSpecList() { return &m_endpointSpecs.active; }
    Tsd_BaseObjList* getEndpointSpecTrash() { return &m_endpointSpecs.trash; }
    bool moveEndpointSpecToTrash(Tsd_EndpointSpec* spec);
    bool isEndpointSpecTrashed(const Tsd_EndpointSpec* spec) const;

    void addOffsetSpec(Tsd_Offset* spec);
    Tsd_BaseObjList* getOffsetSpecList() { return &m_offsetSpecs.active; }
    Tsd_BaseObjList* getOffsetSpecTrash() { return &m_offsetSpecs.trash; }
    bool moveOffsetSpecToTrash(Tsd_Offset* spec);
    bool isOffsetSpecTrashed(const Tsd_Offset* spec) const;

    void addNetSpec(Tsd_NetTiming* spec);
    Tsd_BaseObjList* getNetSpecList() { return &m_netSpecs.active; }
    Tsd_BaseObjList* getNetSpecTrash() { return &m_netSpecs.trash; }
    bool moveNetSpecToTrash(Tsd_NetTiming* spec);
    bool isNetSpecTrashed(const Tsd_NetTiming* spec) const;

    void addPathControl(Tsd_PathControl* spec);
    Tsd_BaseObjList* getPathControlList() { return &m_pathControls.active; }
    Tsd_BaseObjList* getPathControlTrash() { return &m_pathControls.trash; }
    bool movePathControlToTrash(Tsd_PathControl* spec);
    bool isPathControlTrashed(const Tsd_PathControl* spec) const;

    void addPortTiming(Tsd_PortTiming* spec);
    Tsd_BaseObjList* getPortTimingList() { return &m_portSpecs.active; }
    Tsd_BaseObjList* getPortTimingTrash() { return &m_portSpecs.trash; }
    bool movePortTimingToTrash(Tsd_PortTiming* spec);
    bool isPortTimingTrashed(const Tsd_PortTiming* spec) const;

    // The first match in the active list, then (when asked) in the trash;
    // names and TSids compare exactly. findTIGByTSid maps null or "" to
    // "global".
    Tsd_Group* findGroupByUserName(const char* name, bool includeTrash) const;
    Tsd_ClkGroup* findClockGroupByNetName(const char* netName, bool includeTrash) const;
    Tsd_TIGGroup* findTIGByTSid(const char* tsid, bool includeTrash) const;
    Tsd_EndpointSpec* findEndpointSpecByTSid(const char* tsid, bool includeTrash) const;

    Tsd_TIGGroup* getGlobalTIG() const { return m_globalTIG; }
    void setGlobalTIG(Tsd_TIGGroup* group) { m_globalTIG = group; }

    // Moves every object that lost its meaning to trash, in cascade, then
    // unlinks surviving objects from the trash. True if anything was moved.
    bool trim();
    // Appends to `list` the active objects that use `group`.
    void getGroupHolders(Tsd_Group* group, Tsd_BaseObjList* list);

protected:
    void setRefType(const char* refType) { m_refType.set(refType); }

private:
    struct ListPair {
        Tsd_BaseObjList active{10};
        Tsd_BaseObjList trash{10};
        // How many trash slots the is-trashed queries scanned so far.
        mutable std::int64_t trashScanned = 0;
    };

    // The name indexes of the four finds, made on first use.
    struct FindIndexes;
    FindIndexes& findIndexes() const;

    // Moves obj from the active list to the trash; false if not active.
    static bool moveToTrash(ListPair& pair, Tsd_BaseObj* obj);
    // The same for an obj known to stand first at `slot` of the active list.
    static void moveToTrashAt(ListPair& pair, Tsd_BaseObj* obj, int slot);
    // Whether obj stands in the trash (false for null).
    static bool inTrash(const ListPair& pair, const Tsd_BaseObj* obj);
    void dumpList(DumpStream& stream, short indent, const ListPair& pair) const;

    int trimRefObjs(ListPair& pair);
    int trimUserGroups();
    // Every pass of trimUserGroups until one trashes nothing, computed in
    // one sweep; the same groups go in the same order.
    int trimUserGroupsToTheEnd();
    void unlinkTrash();

    ListPair m_groups;
    ListPair m_clockGroups;
    ListPair m_tigGroups;
    ListPair m_endpointSpecs;
    ListPair m_offsetSpecs;
    ListPair m_netSpecs;
    ListPair m_pathControls;
    ListPair m_portSpecs;
    Tsd_String m_refType;
    Tsd_TIGGroup* m_globalTIG = nullptr;
    mutable std::unique_ptr<FindIndexes> m_findIndexes;
};
