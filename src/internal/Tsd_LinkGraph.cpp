#include "internal/Tsd_LinkGraph.h"

#include "internal/Tsd_Report.h"

namespace tsd_detail {

namespace {

std::uint64_t g_lastTag = 0;
bool g_marksTaken = false;

} // namespace

LinkGraph::LinkGraph(const Tsd_BaseObjList& list) : m_list(list) {
    // Number every linked spec of the list and every spec its chain reaches,
    // following each chain only as far as the first spec already numbered.
    // A spec of the list is numbered by its first slot there; a spec reached
    // only through links gets a number after those.
    m_specs.assign(static_cast<std::size_t>(list.getCount()), nullptr);
    m_next.assign(m_specs.size(), -1);
    m_listed = list.getCount();
    if (!g_marksTaken) {
        g_marksTaken = true;
        m_tag = ++g_lastTag;
        // Every spec of the list learns its first slot.
        for (int i = 0; i < list.getCount(); ++i) {
            Tsd_BaseObj* obj = list.getAt(i);
            Tsd_EndpointSpec* spec = obj != nullptr ? obj->getEndpointSpec() : nullptr;
            if (spec != nullptr && marked(spec) < 0)
                mark(spec, i);
        }
    }
    for (int i = 0; i < list.getCount(); ++i) {
        Tsd_BaseObj* obj = list.getAt(i);
        Tsd_EndpointSpec* spec = obj != nullptr ? obj->getEndpointSpec() : nullptr;
        // A slot already numbered holds the spec it was numbered for.
        if (spec == nullptr || !spec->isLinked() || m_specs[static_cast<std::size_t>(i)] != nullptr)
            continue;
        bool added = false;
        int id = number(spec, added);
        while (added && spec->getLinkedSpec() != nullptr) {
            spec = spec->getLinkedSpec();
            const int next = number(spec, added);
            m_next[static_cast<std::size_t>(id)] = next;
            id = next;
        }
    }

    // Walk each chain from its first unvisited node; a walk that comes back
    // to itself has found a cycle.
    enum : char { NEW, WALKING, DONE };
    std::vector<char> state(m_specs.size(), NEW);
    m_cycleOf.assign(m_specs.size(), -1);
    m_order.reserve(m_specs.size());
    std::vector<int> path;
    for (int start = 0; start < size(); ++start) {
        if (spec(start) == nullptr)
            continue;
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

LinkGraph::~LinkGraph() {
    if (m_tag != 0)
        g_marksTaken = false;
}

int LinkGraph::marked(const Tsd_EndpointSpec* spec) const {
    return spec->m_graphTag == m_tag ? spec->m_graphNode : -1;
}

void LinkGraph::mark(const Tsd_EndpointSpec* spec, int id) const {
    spec->m_graphTag = m_tag;
    spec->m_graphNode = id;
}

int LinkGraph::number(Tsd_EndpointSpec* spec, bool& added) {
    if (m_tag != 0) {
        int id = marked(spec);
        if (id < 0) {
            // Outside the list, and met for the first time.
            id = size();
            mark(spec, id);
            m_specs.push_back(spec);
            m_next.push_back(-1);
            added = true;
            return id;
        }
        if (id < m_listed) {
            added = m_specs[static_cast<std::size_t>(id)] == nullptr;
            m_specs[static_cast<std::size_t>(id)] = spec;
        } else {
            added = false;
        }
        return id;
    }
    const int slot = m_list.firstSlotOf(spec);
    if (slot >= 0) {
        added = m_specs[static_cast<std::size_t>(slot)] == nullptr;
        m_specs[static_cast<std::size_t>(slot)] = spec;
        return slot;
    }
    const int id = m_unlisted.first(spec);
    added = id < 0;
    if (!added)
        return id;
    m_unlisted.add(spec, size());
    m_specs.push_back(spec);
    m_next.push_back(-1);
    return size() - 1;
}

int LinkGraph::idAt(int slot, const Tsd_EndpointSpec* spec) const {
    return spec == m_specs[static_cast<std::size_t>(slot)] ? slot : idOf(spec);
}

int LinkGraph::idOf(const Tsd_EndpointSpec* spec) const {
    if (m_tag != 0) {
        const int id = marked(spec);
        if (id < 0 || id >= m_listed)
            return id;
        return m_specs[static_cast<std::size_t>(id)] != nullptr ? id : -1;
    }
    const int slot = m_list.firstSlotOf(spec);
    if (slot >= 0)
        return m_specs[static_cast<std::size_t>(slot)] != nullptr ? slot : -1;
    return m_unlisted.first(spec);
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
