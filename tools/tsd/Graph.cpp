#include "Graph.h"

#include "Describe.h"

#include "tsd/Tsd.h"

#include <ostream>
#include <string>
#include <unordered_map>
#include <vector>

namespace tsd_cli {

namespace {

std::string dotString(const std::string& text) {
    std::string out = "\"";
    for (char c : text) {
        if (c == '"' || c == '\\')
            out += '\\';
        if (c == '\n') {
            out += "\\n";
            continue;
        }
        out += c;
    }
    out += '"';
    return out;
}

const char* edgeWord(Tsd_UserGroup::Edge edge) {
    switch (edge) {
    case Tsd_UserGroup::EDGE_RISING:
        return "RISING";
    case Tsd_UserGroup::EDGE_FALLING:
        return "FALLING";
    case Tsd_UserGroup::EDGE_TRANSHI:
        return "TRANSHI";
    case Tsd_UserGroup::EDGE_TRANSLO:
        return "TRANSLO";
    case Tsd_UserGroup::EDGE_ANY:
        break;
    }
    return "";
}

// Shape and style of a node by the object's class.
std::string nodeAttributes(Tsd_BaseObj* obj) {
    if (obj->getUserGroup() != nullptr)
        return "shape=folder";
    if (obj->getTNMGroup() != nullptr)
        return "shape=ellipse";
    if (obj->getSyncGroup() != nullptr)
        return "shape=egg";
    if (obj->getThruGroup() != nullptr)
        return "shape=diamond";
    if (obj->getTIGGroup() != nullptr)
        return "shape=octagon";
    if (obj->getClkGroup() != nullptr)
        return "shape=cds";
    if (Tsd_DelayPath* path = obj->getDelayPath())
        return path->isIgnored() ? "shape=box, style=dashed" : "shape=box";
    if (obj->getPeriod() != nullptr)
        return "shape=box, style=rounded";
    if (obj->getNetOffset() != nullptr)
        return "shape=parallelogram, style=dashed";
    if (obj->getOffset() != nullptr)
        return "shape=parallelogram";
    if (obj->getNetTiming() != nullptr)
        return "shape=note";
    if (obj->getPortTiming() != nullptr)
        return "shape=house";
    if (obj->getPathControl() != nullptr)
        return "shape=plaintext";
    return "shape=ellipse";
}

class DotWriter {
public:
    DotWriter(std::ostream& out, Tsd_Design& design) : m_out(out), m_design(design) {}

    void write() {
        m_out << "digraph tsd {\n"
              << "  rankdir=LR;\n"
              << "  node [fontname=\"Helvetica\", fontsize=10];\n"
              << "  edge [fontname=\"Helvetica\", fontsize=9];\n";
        std::vector<Tsd_BaseObjList*> lists = {
            m_design.getGroupList(),       m_design.getClockGroupList(),
            m_design.getTIGGroupList(),    m_design.getEndpointSpecList(),
            m_design.getOffsetSpecList(),  m_design.getNetSpecList(),
            m_design.getPathControlList(), m_design.getPortTimingList(),
        };
        for (Tsd_BaseObjList* list : lists) {
            Tsd_BaseObjListIter iter(list);
            while (Tsd_BaseObj* obj = iter.next())
                node(obj);
        }
        for (Tsd_BaseObjList* list : lists) {
            Tsd_BaseObjListIter iter(list);
            while (Tsd_BaseObj* obj = iter.next())
                edges(obj);
        }
        m_out << "}\n";
    }

private:
    const std::string& node(Tsd_BaseObj* obj) {
        auto found = m_ids.find(obj);
        if (found != m_ids.end())
            return found->second;
        std::string id = "n" + std::to_string(m_ids.size());
        std::string label = objectName(obj) + "\n" + objectClass(obj);
        if (obj == m_design.getGlobalTIG())
            label += " (global)";
        m_out << "  " << id << " [label=" << dotString(label) << ", " << nodeAttributes(obj)
              << "];\n";
        return m_ids.emplace(obj, id).first->second;
    }

    void edge(Tsd_BaseObj* from, Tsd_BaseObj* to, const std::string& label,
              const char* style = nullptr) {
        if (from == nullptr || to == nullptr)
            return;
        std::string fromId = node(from);
        std::string toId = node(to);
        m_out << "  " << fromId << " -> " << toId;
        std::string attributes;
        if (!label.empty())
            attributes = "label=" + dotString(label);
        if (style != nullptr)
            attributes += std::string(attributes.empty() ? "" : ", ") + style;
        if (!attributes.empty())
            m_out << " [" << attributes << "]";
        m_out << ";\n";
    }

    void edges(Tsd_BaseObj* obj) {
        if (Tsd_UserGroup* group = obj->getUserGroup()) {
            Tsd_UserGroup::Edge memberEdge = Tsd_UserGroup::EDGE_ANY;
            Tsd_UserGroupIter includes(group, false);
            while (Tsd_PredefGroup* member = includes.next(memberEdge))
                edge(group, member, edgeWord(memberEdge));
            Tsd_UserGroupIter excludes(group, true);
            while (Tsd_PredefGroup* member = excludes.next(memberEdge))
                edge(group, member, "EXCEPT", "style=dashed, color=red, fontcolor=red");
        }
        if (Tsd_EndpointSpec* spec = obj->getEndpointSpec()) {
            if (Tsd_DelayPath* path = obj->getDelayPath()) {
                edge(path, path->getStart(), "FROM");
                if (std::unique_ptr<Tsd_PathThruIter> thru = path->createThruIter())
                    while (Tsd_ThruGroup* group = thru->next())
                        edge(path, group, "THRU");
                edge(path, path->getEnd(), "TO");
            }
            if (Tsd_Period* period = obj->getPeriod())
                edge(period, period->getPeriodGroup(), "PERIOD");
            if (const Tsd_EndpointSpec::LinkData* link = spec->getLinkData()) {
                std::string factor =
                    std::string(link->multiply ? "*" : "/") + formatNumber(link->factor);
                edge(spec, link->spec, factor, "style=dotted");
            }
            if (Tsd_TIGGroup* tig = spec->getIgnoreGroup())
                edge(tig, spec, "TIG", "color=gray40, fontcolor=gray40");
        }
        if (Tsd_Offset* offset = obj->getOffset()) {
            edge(offset, offset->getClockPad(), "clock");
            edge(offset, offset->getReferencePin(), "REFERENCE_PIN");
            edge(offset, offset->getRegGroup(), "TIMEGRP");
            if (Tsd_GroupOffset* groupOffset = obj->getGroupOffset())
                edge(groupOffset, groupOffset->getPadGroup(), "pads");
        }
        if (Tsd_PortTiming* port = obj->getPortTiming())
            edge(port, port->getSecondaryGroup(), "NET");
    }

    std::ostream& m_out;
    Tsd_Design& m_design;
    std::unordered_map<Tsd_BaseObj*, std::string> m_ids;
};

} // namespace

void writeDot(std::ostream& out, Tsd_Design& design) {
    DotWriter(out, design).write();
}

} // namespace tsd_cli
