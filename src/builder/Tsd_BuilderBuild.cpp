// The build: processing the stored properties, resolving what stayed
// pending, and handing out the design when no error was counted.
#include "tsd/Tsd_Builder.h"

#include "internal/Tsd_NameIndex.h"
#include "internal/Tsd_Report.h"
#include "tsd/Tsd_Parsers.h"

#include <cstring>
#include <string>

namespace {

// The getUserString of each holder, copied at once: the text lives in a
// buffer that the next getUserString overwrites.
std::vector<std::string> userStrings(const Tsd_BaseObjList& list) {
    std::vector<std::string> out;
    Tsd_BaseObjListIter iter(&list);
    while (Tsd_BaseObj* obj = iter.next())
        out.emplace_back(obj->getUserString());
    return out;
}

} // namespace

Tsd_Design* Tsd_Builder::buildTSDesign() {
    // A builder serves one build; a second call would hand the same design
    // out twice.
    if (m_built)
        TSD_MSG().fatal(2, "buildTSDesign() called more than once on one Tsd_Builder.\n");
    m_built = true;
    design();

    // 1. Group properties, in the order added.
    processStoredProps(m_groupProps,
                       "Processing TIMEGRP definition \"%s=%s\": ", &Tsd_Builder::processGroupProp);

    // 2. Groups that were named but never defined.
    Tsd_BaseObjListIter unresolved(&m_unresolvedGroups);
    while (Tsd_BaseObj* obj = unresolved.next()) {
        TSD_MSG().error("A group named \"%s\" was referenced in one or more TIMEGRP definitions, "
                        "but was never defined by a TIMEGRP or TNM property.\n",
                        obj->getUserGroup()->getName());
        countError();
    }

    // 3. Circular group definitions.
    validateUserGroups();

    // 4. Spec properties, in the order added.
    processStoredProps(m_specProps,
                       "Processing TIMESPEC definition \"%s=%s\": ", &Tsd_Builder::processSpecProp);

    // 5 to 7. What stayed pending.
    resolvePendingOffsets();
    resolvePendingLinks();
    installTIGs();

    if (m_numError != 0)
        return nullptr;
    // From here on the caller owns the design.
    m_ownedDesign.release();
    return m_design;
}

template <class Result>
void Tsd_Builder::processStoredProps(std::unique_ptr<DARRAY_Tsd_PropPtr>& props,
                                     const char* context,
                                     Result (Tsd_Builder::*process)(const char*, const char*)) {
    if (props == nullptr)
        return;
    // Each message names the definition it comes from through the context.
    for (std::unique_ptr<Tsd_Prop>& prop : *props) {
        setContext(translateMessage("TSDatabase", context, prop->name.get(), prop->value.get()));
        (this->*process)(prop->name.get(), prop->value.get());
        prop.reset();
    }
    props.reset();
    setContext(nullptr);
}

void Tsd_Builder::validateUserGroups() {
    Tsd_BaseObjListIter iter(design().getGroupList());
    while (Tsd_BaseObj* obj = iter.next())
        if (Tsd_UserGroup* group = obj->getUserGroup())
            addErrorCount(group->checkInExcludes(true));
}

void Tsd_Builder::resolvePendingOffsets() {
    Tsd_Design& d = design();
    const bool referenceMode =
        d.getRefType() != nullptr && std::strcmp(d.getRefType(), "MM_TSREF") == 0;
    for (std::unique_ptr<Tsd_Pend>& pend : m_pendingRegGroups) {
        if (pend == nullptr)
            continue;
        const char* name = pend->name.get();
        Tsd_Offset* offset = pend->spec->getOffset();
        Tsd_Group* found = d.findGroupByUserName(name, false);
        if (found != nullptr) {
            if (Tsd_TermGroup* term = found->getTermGroup()) {
                offset->setRegGroup(term);
                pend.reset();
            } else {
                TSD_MSG().error("Group \"%s\" is used as the register group in one or more OFFSET "
                                "specifications. This group is %z, which is not the correct type: "
                                "a TNM, TPSYNC or user group name is required here.\n",
                                name, getObjUserId(found));
                countError();
            }
        } else if (referenceMode) {
            // The tool's references define the group: make it, silently.
            auto* tnm = new Tsd_TNMGroup(name);
            d.addGroup(tnm);
            offset->setRegGroup(tnm);
        } else {
            TSD_MSG().error("Group \"%s\" is used as the register group in one or more OFFSET "
                            "specifications. This group is not defined by a TIMEGRP, TNM or "
                            "TPSYNC property.\n",
                            name);
            countError();
        }
    }
    if (referenceMode)
        return;

    // Clock groups that a spec named but no TS_CLKGRP property defined.
    Tsd_BaseObjListIter clocks(d.getClockGroupList());
    while (Tsd_BaseObj* obj = clocks.next()) {
        Tsd_ClkGroup* clock = obj->getClkGroup();
        if (clock == nullptr || !clock->getRefList()->isEmpty())
            continue;
        Tsd_BaseObjList holders;
        d.getGroupHolders(clock, &holders);
        Message msg = TSD_MSG();
        msg.error("The following spec(s) referenced the Tsd_ClkGroup \"%s\", but no such TS_CLKGRP "
                  "reference property was added to the builder:\n",
                  clock->getName());
        for (const std::string& holder : userStrings(holders))
            msg.status("   %s\n", holder.c_str());
        countError();
    }
}

void Tsd_Builder::resolvePendingLinks() {
    Tsd_Design& d = design();
    bool failed = false;
    for (std::unique_ptr<Tsd_Pend>& pend : m_pendingLinks) {
        if (pend == nullptr)
            continue;
        Tsd_EndpointSpec* waiting = pend->spec->getEndpointSpec();
        Tsd_EndpointSpec* found = d.findEndpointSpecByTSid(pend->name.get(), true);
        if (found != nullptr) {
            waiting->setLinkData(found, waiting->isLinkMultiplied(), waiting->getLinkFactor());
            pend.reset();
        } else {
            TSD_MSG().error("Specification \"%s\" is defined in terms of a specification with "
                            "TSid \"%s\", which does not exist.\n",
                            waiting->getTSid(), pend->name.get());
            countError();
            failed = true;
        }
    }
    if (failed)
        return;
    Tsd_BaseObjListIter iter(d.getEndpointSpecList());
    while (Tsd_BaseObj* obj = iter.next())
        if (Tsd_EndpointSpec* spec = obj->getEndpointSpec())
            addErrorCount(spec->checkLink(true));
}

void Tsd_Builder::installTIGs() {
    Tsd_Design& d = design();
    Tsd_BaseObjListIter iter(d.getTIGGroupList());
    while (Tsd_BaseObj* obj = iter.next()) {
        Tsd_TIGGroup* tig = obj->getTIGGroup();
        if (tig == nullptr)
            TSD_MSG().fatal(2, "Non-TIG group in list.\n");
        const char* tsid = tig->getTIGid();
        if (tsid == nullptr) {
            d.setGlobalTIG(tig);
        } else if (Tsd_EndpointSpec* spec = d.findEndpointSpecByTSid(tsid, false)) {
            spec->setIgnoreGroup(tig);
        } else {
            TSD_MSG().error("One or more TIG directives were specified for a specification with "
                            "TSid \"%s\", which does not exist.\n",
                            tsid);
            countError();
        }
    }
}

Tsd_Builder::~Tsd_Builder() {
    // 1. A design the builder still owns goes first, with its objects.
    m_ownedDesign.reset();
    // 2. The parsers.
    m_specGroupParser.reset();
    m_netParser.reset();
    // 3 to 6: the context, descriptions, stored properties and pending
    // records go with their owners.
    // 7. Placeholder groups that were never defined.
    Tsd_BaseObjListIter iter(&m_unresolvedGroups);
    while (Tsd_BaseObj* obj = iter.next())
        delete obj;
    m_unresolvedGroups.emptyList();
}

void Tsd_Builder::dump(DumpStream& stream, short indent) const {
    const char* pad = tsd_detail::indent(indent);
    stream << pad << "Tsd_Builder" << DumpStream::endl;
    stream << pad << "   unresolved groups remaining:" << DumpStream::endl;
    Tsd_BaseObjListIter unresolved(&m_unresolvedGroups);
    while (Tsd_BaseObj* obj = unresolved.next())
        obj->dump(stream, static_cast<short>(indent + 2));
    stream << pad << "   pending links remaining:" << DumpStream::endl;
    for (const std::unique_ptr<Tsd_Pend>& pend : m_pendingLinks)
        if (pend != nullptr)
            stream << pad << "      " << pend->name.get() << DumpStream::endl;
    stream << pad << "   pending reg groups remaining:" << DumpStream::endl;
    for (const std::unique_ptr<Tsd_Pend>& pend : m_pendingRegGroups)
        if (pend != nullptr)
            stream << pad << "      " << pend->name.get() << DumpStream::endl;
    if (m_ownedDesign != nullptr)
        m_ownedDesign->dump(stream, static_cast<short>(indent + 1));
    stream << pad << "   builder error count: " << static_cast<std::int32_t>(m_numError)
           << DumpStream::endl;
    stream << pad << "   builder warning count: " << static_cast<std::int32_t>(m_numWarning)
           << DumpStream::endl;
}
