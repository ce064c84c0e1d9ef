#include "internal/Tsd_LinkGraph.h"

#include "internal/Tsd_Report.h"

namespace tsd_detail {

LinkGraph::LinkGraph(const Tsd_BaseObjList& list) {
    // Number every linked spec of the list and every spec its chain reaches,
    // following each chain only as far as the first spec already numbered.
    m_ids.reserve(static_cast<std::size_t>(list.getCount()));
    for (int i = 0; i < list.getCount(); ++i) {
        Tsd_BaseObj* obj = list.getAt(i);
        Tsd_EndpointSpec* spec = obj != nullptr ? obj->getEndpointSpec() : nullptr;
        if (spec == nullptr || !spec->isLinked())
            continue;
        while (spec != nullptr && m_ids.first(spec) < 0) {
            m_ids.add(spec, size());
            m_specs.push_back(spec);
            spec = spec->getLinkedSpec();
        }
    }
    m_next.resize(m_specs.size());
    for (int id = 0; id < size(); ++id) {
        Tsd_EndpointSpec* linked = spec(id)->getLinkedSpec();
        m_next[static_cast<std::size_t>(id)] = linked != nullptr ? m_ids.first(linked) : -1;
    }

    // Walk each chain from its first unvisited node; a walk that comes back
    // to itself has found a cycle.
    enum : char { NEW, WALKING, DONE };
    std::vector<char> state(m_specs.size(), NEW);
    m_cycleOf.assign(m_specs.size(), -1);
    m_order.reserve(m_specs.size());
    std::vector<int> path;
    for (int start = 0; start < size(); ++start) {
        path.clear();
        int x = start;
        while (x != -1 && state[static_cast<std::size_t>(x)] == NEW) {
            state[static_cast<std::size_t>(x)] = WALKING;
            path.push_back(x);
            x = next(x);
        }
        std::size_t tail = path.size();
        if (x != -1 && state[static_cast<std::size_t>(x)] == WALKING) {
            while (path[tail - 1] != x)
                --tail;
            --tail;
            const int cycle = cycleCount();
            for (std::size_t k = tail; k < path.size(); ++k) {
                m_cycleOf[static_cast<std::size_t>(path[k])] = cycle;
                m_cycleNodes.push_back(path[k]);
                m_order.push_back(path[k]);
            }
            m_cycleStart.push_back(static_cast<int>(m_cycleNodes.size()));
        }
        for (std::size_t k = tail; k-- > 0;)
            m_order.push_back(path[k]);
        for (int node : path)
            state[static_cast<std::size_t>(node)] = DONE;
    }
}

int LinkGraph::idOf(const Tsd_EndpointSpec* spec) const {
    return m_ids.first(spec);
}

std::vector<int> LinkGraph::cycleNodes(int c) const {
    return std::vector<int>(m_cycleNodes.begin() + m_cycleStart[static_cast<std::size_t>(c)],
                            m_cycleNodes.begin() + m_cycleStart[static_cast<std::size_t>(c) + 1]);
}

std::vector<int> LinkGraph::distanceTo(const std::vector<int>& cycle,
                                       const std::vector<char>& flag) {
    const int length = static_cast<int>(cycle.size());
    std::vector<int> distance(cycle.size(), -1);
    // Sweep the cycle twice backwards: the nearest flagged position at or
    // after k, over two rounds, is found for every k of the first round.
    int nearest = -1;
    for (int k = 2 * length - 1; k >= 0; --k) {
        if (flag[static_cast<std::size_t>(cycle[static_cast<std::size_t>(k % length)])])
            nearest = k;
        if (k < length && nearest != -1 && nearest < k + length)
            distance[static_cast<std::size_t>(k)] = nearest - k;
    }
    return distance;
}

void reportZeroDivisor(const Tsd_EndpointSpec* spec) {
    TSD_MSG().error("Delay expression for specification \"%s\" contains a division by zero: "
                    "\"%s\"\n",
                    spec->getTSid(), formatLink(spec->getLinkData(), " "));
}

void reportIgnoredLink(const Tsd_EndpointSpec* from, const Tsd_EndpointSpec* ignored) {
    TSD_MSG().error("Specification \"%s\" is defined in terms of specification \"%s\", "
                    "which is an ignored path.\n",
                    from->getTSid(), ignored->getTSid());
}

} // namespace tsd_detail
