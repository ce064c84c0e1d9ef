#include "tsd/Tsd_BaseObj.h"

#include "internal/Tsd_Report.h"
#include "tsd/Tsd_StaticBuf.h"

#include <cstring>
#include <string>

Tsd_BaseObj::~Tsd_BaseObj() = default;

Tsd_RefList* Tsd_BaseObj::getRefList() {
    return nullptr;
}
Tsd_Group* Tsd_BaseObj::getGroup() {
    return nullptr;
}
Tsd_TermGroup* Tsd_BaseObj::getTermGroup() {
    return nullptr;
}
Tsd_PredefGroup* Tsd_BaseObj::getPredefGroup() {
    return nullptr;
}
Tsd_TNMGroup* Tsd_BaseObj::getTNMGroup() {
    return nullptr;
}
Tsd_UserGroup* Tsd_BaseObj::getUserGroup() {
    return nullptr;
}
Tsd_SyncGroup* Tsd_BaseObj::getSyncGroup() {
    return nullptr;
}
Tsd_ThruGroup* Tsd_BaseObj::getThruGroup() {
    return nullptr;
}
Tsd_TIGGroup* Tsd_BaseObj::getTIGGroup() {
    return nullptr;
}
Tsd_ClkGroup* Tsd_BaseObj::getClkGroup() {
    return nullptr;
}
Tsd_Spec* Tsd_BaseObj::getSpec() {
    return nullptr;
}
Tsd_EndpointSpec* Tsd_BaseObj::getEndpointSpec() {
    return nullptr;
}
Tsd_DelayPath* Tsd_BaseObj::getDelayPath() {
    return nullptr;
}
Tsd_Period* Tsd_BaseObj::getPeriod() {
    return nullptr;
}
Tsd_NetTiming* Tsd_BaseObj::getNetTiming() {
    return nullptr;
}
Tsd_Offset* Tsd_BaseObj::getOffset() {
    return nullptr;
}
Tsd_NetOffset* Tsd_BaseObj::getNetOffset() {
    return nullptr;
}
Tsd_GroupOffset* Tsd_BaseObj::getGroupOffset() {
    return nullptr;
}
Tsd_PathControl* Tsd_BaseObj::getPathControl() {
    return nullptr;
}
Tsd_PortTiming* Tsd_BaseObj::getPortTiming() {
    return nullptr;
}

bool Tsd_BaseObj::getProp(const char*& name, const char*& value) const {
    name = nullptr;
    value = nullptr;
    return false;
}

const char* Tsd_BaseObj::getUserString() const {
    static Tsd_StaticBuf buffer(50, 30);
    const char* name = nullptr;
    const char* value = nullptr;
    std::string text;
    if (!getProp(name, value)) {
        text = "no property for object";
    } else {
        if (name == nullptr)
            name = "";
        // Reference holders' names all begin with "TS_": "TS_TNM" reads "TNM".
        if (refOwner())
            name += std::strlen(name) < 3 ? std::strlen(name) : 3;
        text = name;
        text += '=';
        text += value != nullptr ? value : "";
        for (char& c : text)
            if (c == ':')
                c = ' ';
    }
    buffer.copy(text.c_str());
    return buffer.getBuffer();
}

const char* Tsd_BaseObj::getTIGid() const {
    TSD_MSG().internalError("getTIGid() called on non-TIG object!\n");
    return nullptr;
}

void Tsd_BaseObj::dump(DumpStream& /*stream*/, short /*indent*/) const {}

bool Tsd_BaseObj::refOwner() const {
    // getRefList hands out the mutable list; asking for it changes nothing.
    return const_cast<Tsd_BaseObj*>(this)->getRefList() != nullptr;
}

void Tsd_BaseObj::addRef(Tsd_Ref* ref) {
    Tsd_RefList* list = getRefList();
    if (list == nullptr)
        TSD_MSG().fatal(2, "addRef() called on non-reference object.\n");
    list->addRef(ref);
}

void Tsd_BaseObj::trimRef(Tsd_Ref* ref, bool /*report*/) {
    Tsd_RefList* list = getRefList();
    if (list == nullptr)
        TSD_MSG().fatal(2, "trimRef() called on non-reference object.\n");
    if (ref == nullptr || !list->removeRef(ref))
        TSD_MSG().fatal(2, "trimRef() called for reference not held.\n");
}
