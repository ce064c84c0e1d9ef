// Words for the objects of a design, shared by the commands and the graph.
#pragma once

#include "tsd/Tsd.h"

#include <string>

namespace tsd_cli {

// The class of an object as people say it: "user group", "TNM group",
// "delay path", "offset", ...
const char* objectClass(Tsd_BaseObj* obj);

// What names the object: a group's name, a spec's TSid, a path control's
// delay name, or, for objects without any, their canonical "name=value".
std::string objectName(Tsd_BaseObj* obj);

// The object's canonical property, copied (the library's buffer is reused).
struct ObjectProp {
    bool ok = false;
    std::string name;
    std::string value;
};
ObjectProp objectProp(const Tsd_BaseObj* obj);

struct TrimReasonText {
    const char* key;         // e.g. "no_references"
    const char* explanation; // e.g. "no references left"
};
TrimReasonText trimReasonText(Tsd_Design::TrimReason reason);

} // namespace tsd_cli
