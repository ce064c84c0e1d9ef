// FROM/THRU/TO delay paths, timing-ignored paths and data-path-only paths.
#include "tsd/Tsd_Specs.h"

#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_PropBuffers.h"
#include "internal/Tsd_Report.h"
#include "tsd/Tsd_StaticBuf.h"

#include <string>

using tsd_detail::dumpLine;
using tsd_detail::orEmpty;

Tsd_DelayPath::Tsd_DelayPath(const char* tsid) : Tsd_EndpointSpec(tsid) {}

Tsd_DelayPath::Tsd_DelayPath(const Tsd_DelayPath& other)
    : Tsd_EndpointSpec(other), m_start(other.m_start), m_end(other.m_end),
      m_ignored(other.m_ignored), m_dataPathOnly(other.m_dataPathOnly) {
    Tsd_PathThruIter iter(&other);
    while (Tsd_ThruGroup* group = iter.next())
        m_thruGroups.addObj(group);
}

Tsd_DelayPath::~Tsd_DelayPath() = default;

void Tsd_DelayPath::addThru(Tsd_ThruGroup* group) {
    m_thruGroups.addObj(group);
}

bool Tsd_DelayPath::removeThru(Tsd_ThruGroup* group) {
    // The list would take null for its first hole and report success.
    if (group == nullptr)
        return false;
    return m_thruGroups.removeObj(group);
}

std::unique_ptr<Tsd_PathThruIter> Tsd_DelayPath::createThruIter() const {
    if (m_thruGroups.isEmpty())
        return nullptr;
    return std::make_unique<Tsd_PathThruIter>(this);
}

bool Tsd_DelayPath::getProp(const char*& name, const char*& value) const {
    std::string text;
    if (m_start != nullptr) {
        text += "FROM:";
        text += Tsd_Util::getAnnoName(m_start->getName());
        text += ':';
    }
    Tsd_PathThruIter iter(this);
    while (Tsd_ThruGroup* group = iter.next()) {
        text += "THRU:";
        text += Tsd_Util::getAnnoName(group->getName());
        text += ':';
    }
    if (m_end != nullptr) {
        text += "TO:";
        text += Tsd_Util::getAnnoName(m_end->getName());
        text += ':';
    }
    if (const char* delay = getDelayPropString())
        text += delay;
    else if (m_ignored)
        text += "TIG";
    else
        TSD_MSG().fatal(2, "Spec %s has no delay data.\n", getTSid());
    if (m_dataPathOnly)
        text += ":DATAPATHONLY";
    if (hasWrittenPriority())
        text += formatString(":PRIORITY:%ld", static_cast<long>(getPriority()));
    return tsd_detail::specPropBuffers().set(getTSid(), text.c_str(), name, value);
}

void Tsd_DelayPath::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, std::string("Tsd_DelayPath ") + orEmpty(getTSid()));
    if (m_start != nullptr)
        dumpLine(stream, indent, std::string("   start group: ") + orEmpty(m_start->getName()));
    else
        dumpLine(stream, indent, "   start group unset");
    if (m_end != nullptr)
        dumpLine(stream, indent, std::string("   end group: ") + orEmpty(m_end->getName()));
    else
        dumpLine(stream, indent, "   end group unset");
    Tsd_PathThruIter iter(this);
    while (Tsd_ThruGroup* group = iter.next())
        dumpLine(stream, indent, std::string("   thru group: ") + orEmpty(group->getName()));
    if (m_ignored)
        dumpLine(stream, indent, "   is ignored path");
    if (m_dataPathOnly)
        dumpLine(stream, indent, "   analyze data path only");
    Tsd_EndpointSpec::dump(stream, static_cast<short>(indent + 1));
}

Tsd_PathThruIter::Tsd_PathThruIter(const Tsd_DelayPath* path)
    : Tsd_BaseObjListIter(path != nullptr ? &path->m_thruGroups : nullptr) {}

Tsd_ThruGroup* Tsd_PathThruIter::next() {
    Tsd_BaseObj* obj = Tsd_BaseObjListIter::next();
    return obj != nullptr ? obj->getThruGroup() : nullptr;
}
