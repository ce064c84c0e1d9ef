// The TSid links among endpoint specs as a graph, and the messages of the
// link check, shared by an endpoint specification's own check and the
// builder's check of a whole design.
#pragma once

#include "tsd/Tsd_BaseObj.h"
#include "tsd/Tsd_Specs.h"

#include <cstdint>
#include <vector>

namespace tsd_detail {

// Every spec links to at most one other, so the links form chains that end
// at a spec without a resolved link or run into a cycle. Walking a chain
// from each of n specs costs up to n^2; a graph of them lets whole-design
// checks share the walks.
class LinkGraph {
public:
    // The linked endpoint specs of `list` (other objects are passed over)
    // and every spec their links reach.
    explicit LinkGraph(const Tsd_BaseObjList& list);
    ~LinkGraph();
    LinkGraph(const LinkGraph&) = delete;
    LinkGraph& operator=(const LinkGraph&) = delete;

    // Nodes are numbered below size(); a number without a spec is no node.
    int size() const { return static_cast<int>(m_specs.size()); }
    // The node of `spec`, or -1.
    int idOf(const Tsd_EndpointSpec* spec) const;
    // The same for the spec at `slot` of the list, mostly without a lookup.
    int idAt(int slot, const Tsd_EndpointSpec* spec) const;
    // The spec of node `id`, or null when `id` is no node.
    Tsd_EndpointSpec* spec(int id) const { return m_specs[static_cast<std::size_t>(id)]; }
    // The node that `id` links to; -1 when its chain ends there.
    int next(int id) const { return m_next[static_cast<std::size_t>(id)]; }
    // The cycle `id` is on, or -1.
    int cycleOf(int id) const { return m_cycleOf[static_cast<std::size_t>(id)]; }
    int cycleCount() const { return static_cast<int>(m_cycleStart.size()) - 1; }
    // The nodes of cycle c, in link order.
    std::vector<int> cycleNodes(int c) const;
    // Every node once: each node that is not on a cycle after the node it
    // links to, the nodes of each cycle before the nodes leading into it.
    const std::vector<int>& order() const { return m_order; }

    // For each position j of `cycle` (nodes in link order), how many links
    // on from it the first node with flag[node] set stands; -1 when none.
    static std::vector<int> distanceTo(const std::vector<int>& cycle,
                                       const std::vector<char>& flag);

private:
    // The node of `spec`, numbered now if it had none (`added` then true).
    int number(Tsd_EndpointSpec* spec, bool& added);
    // The node of `spec` as its mark tells: its first slot in the list, or
    // its number when it is outside; -1 when it has neither.
    int marked(const Tsd_EndpointSpec* spec) const;
    void mark(const Tsd_EndpointSpec* spec, int id) const;

    const Tsd_BaseObjList& m_list;
    std::vector<Tsd_EndpointSpec*> m_specs;
    // Each specification's node stands in that object, tagged with this
    // graph, so a million linked specs need no table. A graph made while another one
    // holds the marks finds listed specs through the list's own index and
    // numbers the others in m_unlisted.
    std::uint64_t m_tag = 0;
    int m_listed = 0;         // the slots of the list when the graph was made
    Tsd_SlotIndex m_unlisted; // the node of each spec outside the list, as its "slot"
    std::vector<int> m_next;
    std::vector<int> m_cycleOf;
    std::vector<int> m_cycleStart{0}; // cycle c is m_cycleNodes[start[c], start[c+1])
    std::vector<int> m_cycleNodes;
    std::vector<int> m_order;
};

// True when the spec's link divides by zero.
inline bool dividesByZero(const Tsd_EndpointSpec* spec) {
    const Tsd_EndpointSpec::LinkData* link = spec->getLinkData();
    return link != nullptr && !link->multiply && link->factor == 0.0;
}

// The errors of the link check.
void reportZeroDivisor(const Tsd_EndpointSpec* spec);
void reportIgnoredLink(const Tsd_EndpointSpec* from, const Tsd_EndpointSpec* ignored);

} // namespace tsd_detail
