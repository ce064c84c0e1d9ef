// The builder's lookup hooks: how the parser adaptors find the groups,
// clock nets and specifications that a constraint names.
#include "tsd/Tsd_Builder.h"

#include "internal/Tsd_NameIndex.h"
#include "internal/Tsd_Report.h"

#include <string>

Tsd_UserGroup* Tsd_Builder::findUnresolvedGroupByName(const char* name) const {
    const int slot = findUnresolvedSlot(name);
    return slot >= 0 ? m_unresolvedGroups.getAt(slot)->getUserGroup() : nullptr;
}

int Tsd_Builder::findUnresolvedSlot(const char* name) const {
    // Most groups are defined before they are named, or soon after.
    if (name == nullptr || m_unresolvedGroups.isEmpty())
        return -1;
    if (m_unresolvedIndex == nullptr) {
        // Whatever else a user builder puts in the list is passed over.
        m_unresolvedIndex = std::make_unique<tsd_detail::NameIndex>(
            [](Tsd_BaseObj* obj, bool& /*foreign*/) -> const char* {
                Tsd_UserGroup* group = obj->getUserGroup();
                return group != nullptr ? group->getName() : nullptr;
            });
    }
    return m_unresolvedIndex->find(m_unresolvedGroups, name).slot;
}

const char16_t* Tsd_Builder::getObjUserId(Tsd_BaseObj* obj) {
    const char* description = "an unknown object";
    if (obj == nullptr)
        description = "an unknown object";
    else if (obj->getUserGroup() != nullptr)
        description = "a user group";
    else if (obj->getTNMGroup() != nullptr)
        description = "a TNM group";
    else if (obj->getThruGroup() != nullptr)
        description = "a TPTHRU group";
    else if (obj->getSyncGroup() != nullptr)
        description = "a TPSYNC group";
    else if (obj->getTIGGroup() != nullptr)
        description = "a TIG directive";
    else if (obj->getClkGroup() != nullptr)
        description = "an OFFSET clock pad";
    m_objUserId = translateMessage("TSDatabase", description);
    return m_objUserId.get();
}

Tsd_EndpointSpec* Tsd_Builder::getEndpointSpecForLink(const char* tsid) {
    if (Tsd_EndpointSpec* spec = design().findEndpointSpecByTSid(tsid, false))
        return spec;
    m_pendingLinkTSid.set(tsid);
    return nullptr;
}

Tsd_TermGroup* Tsd_Builder::getTermGroupForSpec(const char* name) {
    if (name == nullptr)
        return nullptr;
    Tsd_Group* found = design().findGroupByUserName(name, false);
    if (found == nullptr) {
        TSD_MSG().error("%zNo TNM, TPSYNC or user group named \"%s\" is defined.\n", getContext(),
                        name);
        countError();
        return nullptr;
    }
    if (Tsd_TermGroup* term = found->getTermGroup())
        return term;
    TSD_MSG().error(
        "%zGroup \"%s\" is %z, which is not the correct type: a TNM, TPSYNC, user group "
        "or predefined group name (such as FFS or RAMS) is required here.\n",
        getContext(), name, getObjUserId(found));
    countError();
    return nullptr;
}

Tsd_PredefGroup* Tsd_Builder::getPredefGroupForGroup(const char* name) {
    if (name == nullptr)
        return nullptr;
    if (Tsd_UserGroup* placeholder = findUnresolvedGroupByName(name))
        return placeholder;
    Tsd_Group* found = design().findGroupByUserName(name, false);
    if (found == nullptr) {
        // A forward reference: defined later, or reported as never defined.
        auto* placeholder = new Tsd_UserGroup(name);
        m_unresolvedGroups.addObj(placeholder);
        return placeholder;
    }
    if (Tsd_PredefGroup* predef = found->getPredefGroup())
        return predef;
    TSD_MSG().error("%zGroup \"%s\" is %z, which is not the correct type: a TNM, user group or "
                    "predefined group name (such as FFS or RAMS) is required here.\n",
                    getContext(), name, getObjUserId(found));
    countError();
    return nullptr;
}

Tsd_ThruGroup* Tsd_Builder::getThruGroupForSpec(const char* name) {
    if (name == nullptr)
        return nullptr;
    Tsd_Group* found = design().findGroupByUserName(name, false);
    if (found == nullptr) {
        TSD_MSG().error("%zNo TPTHRU group named \"%s\" is defined.\n", getContext(), name);
        countError();
        return nullptr;
    }
    if (Tsd_ThruGroup* thru = found->getThruGroup())
        return thru;
    TSD_MSG().error(
        "%zGroup \"%s\" is %z, which is not the correct type: a TPTHRU group is required here.\n",
        getContext(), name, getObjUserId(found));
    countError();
    return nullptr;
}

Tsd_ClkGroup* Tsd_Builder::getClkGroupForSpec(const char* netName) {
    if (netName == nullptr)
        return nullptr;
    if (Tsd_ClkGroup* clock = design().findClockGroupByNetName(netName, false))
        return clock;
    auto* clock = new Tsd_ClkGroup(netName);
    design().addClockGroup(clock);
    return clock;
}

Tsd_TermGroup* Tsd_Builder::getTermGroupForNetOffset(const char* name) {
    if (name == nullptr)
        return nullptr;
    if (Tsd_Group* found = design().findGroupByUserName(name, false)) {
        if (Tsd_TermGroup* term = found->getTermGroup())
            return term;
    }
    m_pendingRegGroupName.set(name);
    return nullptr;
}

bool Tsd_Builder::allowUserGroupOverride(Tsd_UserGroup* existing, const char* newValue) {
    const char* name = existing->getName();
    std::string original = existing->getUserString();
    TSD_MSG().error("Second group definition found for group \"%s\":\noriginal definition: %s\nnew "
                    "definition: %s=%s\n",
                    name, original.c_str(), name, newValue);
    countError();
    return false;
}

bool Tsd_Builder::allowEndpointSpecOverride(Tsd_EndpointSpec* existing, const char* newValue) {
    const char* tsid = existing->getTSid();
    std::string original = existing->getUserString();
    TSD_MSG().error(
        "Second spec definition found for TSid \"%s\":\noriginal definition: %s\nnew definition: "
        "%s=%s\n",
        tsid, original.c_str(), tsid, newValue);
    countError();
    return false;
}
