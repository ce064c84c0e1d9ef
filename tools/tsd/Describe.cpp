#include "Describe.h"

#include "Netlist.h"

namespace tsd_cli {

const char* objectClass(Tsd_BaseObj* obj) {
    if (auto* supplied = dynamic_cast<SuppliedGroup*>(obj))
        return supplied->origin() == Origin::Architecture ? "predefined group" : "netlist group";
    if (dynamic_cast<SuppliedSpec*>(obj) != nullptr)
        return "netlist specification";
    if (obj->getUserGroup() != nullptr)
        return "user group";
    if (obj->getTNMGroup() != nullptr)
        return "TNM group";
    if (obj->getSyncGroup() != nullptr)
        return "TPSYNC group";
    if (obj->getThruGroup() != nullptr)
        return "TPTHRU group";
    if (obj->getTIGGroup() != nullptr)
        return "TIG directive";
    if (obj->getClkGroup() != nullptr)
        return "clock group";
    if (Tsd_DelayPath* path = obj->getDelayPath())
        return path->isIgnored() ? "ignored path" : "delay path";
    if (obj->getPeriod() != nullptr)
        return "period";
    if (obj->getGroupOffset() != nullptr)
        return "group offset";
    if (obj->getNetOffset() != nullptr)
        return "net offset";
    if (obj->getOffset() != nullptr)
        return "offset";
    if (obj->getNetTiming() != nullptr)
        return "net timing";
    if (obj->getPathControl() != nullptr)
        return "path control";
    if (obj->getPortTiming() != nullptr)
        return "port timing";
    if (obj->getGroup() != nullptr)
        return "group";
    return "object";
}

std::string objectName(Tsd_BaseObj* obj) {
    if (Tsd_Group* group = obj->getGroup())
        return group->getName() != nullptr ? group->getName() : "";
    if (Tsd_Spec* spec = obj->getSpec()) {
        if (spec->getTSid() != nullptr)
            return spec->getTSid();
        if (Tsd_PathControl* control = obj->getPathControl())
            return control->getDelayName() != nullptr ? control->getDelayName() : "";
    }
    ObjectProp prop = objectProp(obj);
    return prop.name + "=" + prop.value;
}

ObjectProp objectProp(const Tsd_BaseObj* obj) {
    ObjectProp prop;
    const char* name = nullptr;
    const char* value = nullptr;
    prop.ok = obj->getProp(name, value);
    prop.name = name != nullptr ? name : "";
    prop.value = value != nullptr ? value : "";
    return prop;
}

TrimReasonText trimReasonText(Tsd_Design::TrimReason reason) {
    switch (reason) {
    case Tsd_Design::TRIM_NO_REFERENCES:
        return {"no_references", "no references left"};
    case Tsd_Design::TRIM_EMPTY_USER_GROUP:
        return {"empty_user_group", "every included group is gone"};
    case Tsd_Design::TRIM_PATH_ENDPOINT:
        return {"path_endpoint", "its FROM or TO group is gone"};
    case Tsd_Design::TRIM_PATH_THRU:
        return {"path_thru", "a THRU group is gone"};
    case Tsd_Design::TRIM_PERIOD_GROUP:
        return {"period_group", "its period group is gone"};
    case Tsd_Design::TRIM_TIG_OF_TRASHED_SPEC:
        return {"tig_of_trashed_spec", "the specification it ignores is gone"};
    case Tsd_Design::TRIM_CLOCK_GROUP:
        return {"clock_group", "its clock group is gone"};
    case Tsd_Design::TRIM_REG_GROUP:
        return {"reg_group", "its register group is gone"};
    case Tsd_Design::TRIM_PAD_GROUP:
        return {"pad_group", "its pad group is gone"};
    case Tsd_Design::TRIM_NONE:
        break;
    }
    return {"none", "no reason"};
}

} // namespace tsd_cli
