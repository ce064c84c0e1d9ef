// Groups: named sets of design elements that timing specifications talk
// about. The five reference groups (TNM, TPSYNC, TPTHRU, TIG, clock) own the
// reference records that tie design objects to them; user groups are TIMEGRP
// definitions built from other groups.
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "tsd/Tsd_BaseObj.h"

class Tsd_Group : public Tsd_BaseObj {
public:
    ~Tsd_Group() override;

    Tsd_Group* getGroup() override { return this; }
    // One line: "name = <name>", or "unnamed".
    void dump(DumpStream& stream, short indent) const override;

    const char* getName() const { return m_name.get(); }
    void setName(const char* name);

protected:
    explicit Tsd_Group(const char* name);
    Tsd_Group(const Tsd_Group& other);

private:
    Tsd_String m_name;
};

// Groups that can start or end a path, carry a period, or be an offset's
// register or pad group.
class Tsd_TermGroup : public Tsd_Group {
public:
    Tsd_TermGroup* getTermGroup() override { return this; }

protected:
    explicit Tsd_TermGroup(const char* name) : Tsd_Group(name) {}
    Tsd_TermGroup(const Tsd_TermGroup& other) = default;
};

// Groups that a user group may include.
class Tsd_PredefGroup : public Tsd_TermGroup {
public:
    enum PredefType : std::int32_t {
        PREDEF_FFS = 0,
        PREDEF_LATCHES = 1,
        PREDEF_PADS = 2,
        PREDEF_RAMS = 3,
        PREDEF_PPS = 4,
        PREDEF_OTHER = 5,
        PREDEF_NONE = 6,
    };

    Tsd_PredefGroup* getPredefGroup() override { return this; }

    // "FFS", "LATCHES", "PADS", "RAMS", "PPS", "OTHER"; null for anything else.
    static const char* convertPredefTypeToString(PredefType type);
    // The keyword, compared without regard to case; PREDEF_NONE otherwise.
    static PredefType convertStringToPredefType(const char* text);

protected:
    explicit Tsd_PredefGroup(const char* name) : Tsd_TermGroup(name) {}
    Tsd_PredefGroup(const Tsd_PredefGroup& other) = default;
};

// The group a TNM property names ("TS_TNM"). Its name may itself be a
// predefined-group pattern such as FFS(data*).
class Tsd_TNMGroup : public Tsd_PredefGroup {
public:
    explicit Tsd_TNMGroup(const char* name);
    ~Tsd_TNMGroup() override;
    Tsd_TNMGroup(const Tsd_TNMGroup&) = delete;
    Tsd_TNMGroup& operator=(const Tsd_TNMGroup&) = delete;

    Tsd_RefList* getRefList() override { return &m_refs; }
    Tsd_TNMGroup* getTNMGroup() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

    PredefType getPredefTypeForPattern() const;
    // A bare keyword such as FFS or pads, with no parenthesised pattern.
    bool isSimpleWildcardPattern() const;

private:
    Tsd_RefList m_refs{10};
};

// The group a TPSYNC property names ("TS_TPSYNC").
class Tsd_SyncGroup : public Tsd_TermGroup {
public:
    explicit Tsd_SyncGroup(const char* name);
    ~Tsd_SyncGroup() override;
    Tsd_SyncGroup(const Tsd_SyncGroup&) = delete;
    Tsd_SyncGroup& operator=(const Tsd_SyncGroup&) = delete;

    Tsd_RefList* getRefList() override { return &m_refs; }
    Tsd_SyncGroup* getSyncGroup() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

private:
    Tsd_RefList m_refs{10};
};

// The group a TPTHRU property names ("TS_TPTHRU"): a THRU point of a path.
class Tsd_ThruGroup : public Tsd_Group {
public:
    explicit Tsd_ThruGroup(const char* name);
    ~Tsd_ThruGroup() override;
    Tsd_ThruGroup(const Tsd_ThruGroup&) = delete;
    Tsd_ThruGroup& operator=(const Tsd_ThruGroup&) = delete;

    Tsd_RefList* getRefList() override { return &m_refs; }
    Tsd_ThruGroup* getThruGroup() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

private:
    Tsd_RefList m_refs{10};
};

// The elements a TIG directive ("TS_TIG") names, for the TSid that is the
// group's name, or for every specification when the name is "global".
class Tsd_TIGGroup : public Tsd_Group {
public:
    // A null or empty name becomes "global".
    explicit Tsd_TIGGroup(const char* name);
    ~Tsd_TIGGroup() override;
    Tsd_TIGGroup(const Tsd_TIGGroup&) = delete;
    Tsd_TIGGroup& operator=(const Tsd_TIGGroup&) = delete;

    Tsd_RefList* getRefList() override { return &m_refs; }
    Tsd_TIGGroup* getTIGGroup() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    // The TSid this TIG applies to; null for the global TIG.
    const char* getTIGid() const override;
    void dump(DumpStream& stream, short indent) const override;

private:
    Tsd_RefList m_refs{10};
};

// A clock group, named by a clock net ("TS_CLKGRP").
class Tsd_ClkGroup : public Tsd_Group {
public:
    explicit Tsd_ClkGroup(const char* name);
    ~Tsd_ClkGroup() override;
    Tsd_ClkGroup(const Tsd_ClkGroup&) = delete;
    Tsd_ClkGroup& operator=(const Tsd_ClkGroup&) = delete;

    Tsd_RefList* getRefList() override { return &m_refs; }
    Tsd_ClkGroup* getClkGroup() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

private:
    Tsd_RefList m_refs{10};
};

class Tsd_GroupRef;
class Tsd_UserGroupIter;

namespace tsd_detail {
class UserGroupMarks;
} // namespace tsd_detail

// A TIMEGRP definition: the union of its included members (each optionally
// restricted to one edge) minus the union of its excluded members. It owns
// its member entries, not the member groups.
class Tsd_UserGroup : public Tsd_PredefGroup {
public:
    enum Edge : std::int32_t {
        EDGE_RISING = 0,
        EDGE_FALLING = 1,
        EDGE_TRANSHI = 2,
        EDGE_TRANSLO = 3,
        EDGE_ANY = 4,
    };

    explicit Tsd_UserGroup(const char* name);
    // Copies the name and the member entries; the members are shared.
    Tsd_UserGroup(const Tsd_UserGroup& other);
    Tsd_UserGroup& operator=(const Tsd_UserGroup&) = delete;
    ~Tsd_UserGroup() override;

    Tsd_UserGroup* getUserGroup() override { return this; }
    // Name and the canonical TIMEGRP value, e.g. FFS:RISING:clkgrp:EXCEPT:slow.
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

    void addGroup(Tsd_PredefGroup* group, Edge edge, bool exclude);
    // Removes every entry for `group` from one list; true if any was removed.
    bool removeGroup(Tsd_PredefGroup* group, bool exclude);
    // Deletes every member entry; the name stays.
    void clearDef();
    // Counts (and, when asked, reports) the circular definitions reachable
    // from this group through included and excluded members.
    int checkInExcludes(bool report);

private:
    friend class Tsd_UserGroupIter;
    friend class Tsd_Design;
    friend class tsd_detail::UserGroupMarks;

    // One member entry; a removed entry keeps its place with a null member.
    struct Member {
        Tsd_PredefGroup* group;
        Edge edge;
    };
    // The entries of one member list, held by value: most user groups have
    // one or two members, and the first is stored without an allocation.
    class MemberList {
    public:
        MemberList() = default;
        MemberList(const MemberList&) = delete;
        MemberList& operator=(const MemberList&) = delete;

        std::int32_t count() const { return m_count; }
        Member& at(std::int32_t i) { return data()[i]; }
        const Member& at(std::int32_t i) const { return data()[i]; }
        void append(const Member& member);
        void clear();

    private:
        Member* data() { return m_heap != nullptr ? m_heap.get() : &m_one; }
        const Member* data() const { return m_heap != nullptr ? m_heap.get() : &m_one; }

        std::unique_ptr<Member[]> m_heap; // once more than one entry was held
        Member m_one{nullptr, EDGE_ANY};
        std::int32_t m_count = 0;
        std::int32_t m_capacity = 1;
    };

    // Removes every entry whose member is one of `members`, which is sorted
    // by address; one pass however many members go.
    void removeMembers(const std::vector<const Tsd_PredefGroup*>& members, bool exclude);

    MemberList m_includes;
    std::unique_ptr<MemberList> m_excludes; // made by the first exclusion
    // A number that a pass over many groups keeps here, tagged with that
    // pass; read only through its holder.
    mutable std::uint64_t m_markTag = 0;
    mutable std::uint32_t m_markValue = 0;
};

using DARRAY_Tsd_UserGroupPtr = Tsd_DArray<Tsd_UserGroup>;

// One member entry of a user group. Its accessors are not named getGroup,
// which is the type query of every object.
class Tsd_GroupRef : public Tsd_BaseObj {
public:
    Tsd_GroupRef(Tsd_PredefGroup* group, Tsd_UserGroup::Edge edge) : m_group(group), m_edge(edge) {}

    Tsd_PredefGroup* getMember() const { return m_group; }
    Tsd_UserGroup::Edge getEdge() const { return m_edge; }

private:
    Tsd_PredefGroup* m_group;
    Tsd_UserGroup::Edge m_edge;
};

// Walks the included or the excluded members of a user group; several may
// walk one group at once.
class Tsd_UserGroupIter {
public:
    Tsd_UserGroupIter(const Tsd_UserGroup* group, bool excludes);

    // The next member and its edge; null at the end (an entry without a
    // member also ends the walk).
    Tsd_PredefGroup* next(Tsd_UserGroup::Edge& edge);

private:
    const Tsd_UserGroup::MemberList* m_list;
    std::int32_t m_index = 0;
};
