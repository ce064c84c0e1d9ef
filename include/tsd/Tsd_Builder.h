// The library's entry point: a builder takes constraint properties, builds
// one Tsd_Design from them, resolves every cross reference and reports every
// inconsistency. Subclass it (a "user builder") to answer lookups from your
// own netlist, to allow redefinitions, or to bring your own design.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "tsd/Tsd_BaseObj.h"
#include "tsd/Tsd_Design.h"
#include "tsd/Tsd_Groups.h"
#include "tsd/Tsd_Specs.h"

class Tsd_SpecGroupParser;
class Tsd_NetParser;

namespace tsd_detail {
class StoredProps;
} // namespace tsd_detail

// A stored property: name and value, copied.
struct Tsd_Prop {
    Tsd_String name;
    Tsd_String value;
};

// A pending record: the missing TSid of a link, or the missing register
// group of a net offset, and the spec that waits for it (not owned).
struct Tsd_Pend {
    Tsd_String name;
    Tsd_Spec* spec = nullptr;
};

// Growable arrays of the records above; they own their records, and a
// consumed record leaves a null entry.
using DARRAY_Tsd_PropPtr = std::vector<std::unique_ptr<Tsd_Prop>>;
using DARRAY_Tsd_PendPtr = std::vector<std::unique_ptr<Tsd_Pend>>;

class Tsd_Builder {
public:
    // With true the builder creates its design and owns it until a build
    // succeeds; with false a user builder supplies one with initBaseBuilder.
    explicit Tsd_Builder(bool createDesign = true);

    // Stores a TIMEGRP definition for the build. False for a null name.
    bool addUserGroupProp(const char* name, const char* value);
    // Stores an OFFSET, ENABLE, DISABLE, TS... or TIMEGRP... property for the
    // build; false (and nothing stored) for any other name.
    bool addSpecProp(const char* name, const char* value);
    // Processes a reference property at once; true when an object now owns
    // `ref`. The builder never deletes references.
    bool addRefProp(Tsd_Ref* ref, const char* name, const char* value);
    // One of the ten TS_* reference property names, in any case.
    static bool isRefProp(const char* name);

    // Processes everything stored and resolves what is pending. Returns the
    // design (the caller then owns it) or null when any error was counted.
    // A builder serves one build.
    Tsd_Design* buildTSDesign();
    void dump(DumpStream& stream, short indent) const;

    short getNumError() const { return m_numError; }
    short getNumWarning() const { return m_numWarning; }

protected:
    // The lookup hooks, in this order. Defaults look in the design and report
    // wrong or missing names (Tsd_Builder.cpp).
    virtual Tsd_TermGroup* getTermGroupForSpec(const char* name);
    virtual Tsd_PredefGroup* getPredefGroupForGroup(const char* name);
    virtual Tsd_ThruGroup* getThruGroupForSpec(const char* name);
    virtual Tsd_ClkGroup* getClkGroupForSpec(const char* netName);
    virtual Tsd_TermGroup* getTermGroupForNetOffset(const char* name);
    virtual bool allowUserGroupOverride(Tsd_UserGroup* existing, const char* newValue);
    virtual bool allowEndpointSpecOverride(Tsd_EndpointSpec* existing, const char* newValue);

public:
    virtual ~Tsd_Builder();
    Tsd_Builder(const Tsd_Builder&) = delete;
    Tsd_Builder& operator=(const Tsd_Builder&) = delete;

protected:
    // For a builder constructed with false: the design to fill (not owned).
    void initBaseBuilder(Tsd_Design* design);
    Tsd_Design* getDesign() const { return m_design; }

    // The prefix of parse messages (a "%z" argument); null sets it empty.
    void setContext(std::unique_ptr<char16_t[]> context);
    void setContext(const char16_t* context);
    const char16_t* getContext() const;

    // Add to the counters; they stop at their largest and smallest values.
    void addError(short n);
    void addWarning(short n);

    Tsd_BaseObjList* getUnresolvedGroupList() { return &m_unresolvedGroups; }
    Tsd_UserGroup* processGroupProp(const char* name, const char* value);
    Tsd_Spec* processSpecProp(const char* name, const char* value);

    void validateUserGroups();
    void resolvePendingLinks();
    void resolvePendingOffsets();
    void installTIGs();

private:
    friend class Tsd_SpecGroupParser;
    friend class Tsd_NetParser;

    Tsd_Design& design();
    void countError() { addError(1); }
    void addErrorCount(int n);

    // Runs `process` over stored properties under a context made from
    // `context`, then frees them.
    template <class Result>
    void processStoredProps(std::unique_ptr<tsd_detail::StoredProps>& props, const char* context,
                            Result (Tsd_Builder::*process)(const char*, const char*));
    bool initUserGroupFromProp(Tsd_UserGroup* group, const char* value);
    Tsd_Spec* buildSpecFromProp(const char* name, const char* value);
    // Removes the pending-link record of `spec`, if it has one; `newest`
    // says that spec was the last one parsed.
    void dropPendingLink(const Tsd_Spec* spec, bool newest);
    Tsd_Spec* buildNetSpecFromProp(const char* name, const char* value);
    Tsd_Group* getSimpleGroup(const char* name, const char* value);

    Tsd_UserGroup* findUnresolvedGroupByName(const char* name) const;
    // The slot of that placeholder in the list of unresolved groups, or -1.
    int findUnresolvedSlot(const char* name) const;
    Tsd_EndpointSpec* getEndpointSpecForLink(const char* tsid);
    const char16_t* getObjUserId(Tsd_BaseObj* obj);

    Tsd_Design* m_design = nullptr;
    // Holds the design while the builder owns it: from construction with
    // true until a build succeeds.
    std::unique_ptr<Tsd_Design> m_ownedDesign;
    std::unique_ptr<Tsd_SpecGroupParser> m_specGroupParser;
    std::unique_ptr<Tsd_NetParser> m_netParser;
    // The context, made from m_contextFormat and the property's name and
    // value when it is first asked for: most properties never need theirs.
    mutable std::u16string m_context;
    mutable const char* m_contextFormat = nullptr;
    const char* m_contextName = nullptr;
    const char* m_contextValue = nullptr;
    std::unique_ptr<char16_t[]> m_objUserId;
    short m_numError = 0;
    short m_numWarning = 0;
    Tsd_BaseObjList m_unresolvedGroups{10};
    // Finds placeholders by name; made on first use.
    mutable std::unique_ptr<tsd_detail::NameIndex> m_unresolvedIndex;
    std::unique_ptr<tsd_detail::StoredProps> m_specProps;
    std::unique_ptr<tsd_detail::StoredProps> m_groupProps;
    // Pending records by value; a consumed one keeps its place with no spec.
    std::vector<Tsd_Pend> m_pendingLinks;
    // Where each spec's pending link record stands in m_pendingLinks; made
    // when a record other than the newest is first dropped.
    std::unique_ptr<Tsd_SlotIndex> m_pendingLinkSlot;
    Tsd_String m_pendingLinkTSid;
    std::vector<Tsd_Pend> m_pendingRegGroups;
    Tsd_String m_pendingRegGroupName;
    bool m_built = false;
};
