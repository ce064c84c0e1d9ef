#include "DesignGen.h"

#include <algorithm>
#include <initializer_list>
#include <stdexcept>
#include <utility>

namespace tsd_gen {

namespace {

// splitmix64: tiny, fast and the same everywhere, unlike the distributions
// of <random>.
class Rng {
public:
    explicit Rng(std::uint64_t seed) : m_state(seed) {}

    std::uint64_t next() {
        std::uint64_t z = (m_state += 0x9e3779b97f4a7c15ULL);
        z = (z ^ (z >> 30)) * 0xbf58476d1ce4e5b9ULL;
        z = (z ^ (z >> 27)) * 0x94d049bb133111ebULL;
        return z ^ (z >> 31);
    }
    std::size_t below(std::size_t n) { return n == 0 ? 0 : static_cast<std::size_t>(next() % n); }
    bool chance(unsigned percent) { return below(100) < percent; }
    template <class T>
    const T& pick(const std::vector<T>& items) {
        return items[below(items.size())];
    }
    const char* pick(std::initializer_list<const char*> items) {
        return items.begin()[below(items.size())];
    }

private:
    std::uint64_t m_state;
};

std::string num(std::size_t n) {
    return std::to_string(n);
}

// Constraint text in one of its two spellings: words apart (`FROM a TO b
// 10 ns`) or joined by colons (`FROM:a:TO:b:10:nS`).
class Words {
public:
    explicit Words(bool colons) : m_colons(colons) {}

    Words& add(const std::string& word) {
        if (!m_text.empty())
            m_text += m_colons ? ":" : " ";
        m_text += word;
        return *this;
    }
    // A number and its unit, the unit in the case each spelling favours.
    Words& time(const std::string& number, const char* unit = "ns") {
        add(number);
        std::string u = unit;
        if (m_colons && u.size() == 2)
            u[1] = static_cast<char>(u[1] - 'a' + 'A');
        return add(u);
    }
    // A link to another TSid: `TS4 * 2` or `TS4*2`.
    Words& link(const std::string& tsid, char op, const std::string& factor) {
        if (m_colons)
            return add(tsid + op + factor);
        return add(tsid).add(std::string(1, op)).add(factor);
    }
    bool colons() const { return m_colons; }
    const std::string& str() const { return m_text; }

private:
    bool m_colons;
    std::string m_text;
};

const std::vector<std::string> kBlocks = {"core", "dma", "eth", "pcie", "ddr", "uart",
                                          "spi",  "usb", "vid", "aes",  "crc", "irq"};
const std::vector<std::string> kKinds = {"regs", "ctrl", "data", "fifo", "cnt", "state", "pipe"};

// Places the lines of `extra` among `base` at random places, keeping the
// order within each.
std::vector<GenLine> scatter(std::vector<GenLine> base, std::vector<GenLine> extra, Rng& rng) {
    std::vector<std::pair<std::size_t, std::size_t>> keys; // (slot, index into extra)
    keys.reserve(extra.size());
    for (std::size_t i = 0; i < extra.size(); ++i)
        keys.emplace_back(rng.below(base.size() + 1), i);
    std::stable_sort(keys.begin(), keys.end(),
                     [](const auto& a, const auto& b) { return a.first < b.first; });
    std::vector<GenLine> out;
    out.reserve(base.size() + extra.size());
    std::size_t k = 0;
    for (std::size_t slot = 0; slot <= base.size(); ++slot) {
        while (k < keys.size() && keys[k].first == slot)
            out.push_back(std::move(extra[keys[k++].second]));
        if (slot < base.size())
            out.push_back(std::move(base[slot]));
    }
    return out;
}

GenLine ref(std::string element, std::string name, std::string value) {
    return {LineKind::Ref, std::move(element), std::move(name), std::move(value)};
}
GenLine group(std::string name, std::string value) {
    return {LineKind::Group, "", std::move(name), std::move(value)};
}
GenLine spec(std::string name, std::string value) {
    return {LineKind::Spec, "", std::move(name), std::move(value)};
}

// The realistic mix. Built in an order that lets each part name what the
// earlier parts defined; the lines come out as references, then groups,
// then specifications.
class MixGen {
public:
    MixGen(std::size_t n, std::uint64_t seed) : m_n(n), m_rng(seed) {}

    GenDesign run() {
        nameGroups();
        makeUserGroups();
        makeOtherRefs();
        makeSpecs();
        makeOffsets();
        makeTnmRefs();
        makeTigRefs();

        GenDesign design;
        design.lines = scatter(std::move(m_tnmRefs), std::move(m_otherRefs), m_rng);
        for (GenLine& line : m_groups)
            design.lines.push_back(std::move(line));
        for (GenLine& line : m_specs)
            design.lines.push_back(std::move(line));
        design.removeOrder = removeOrder();
        return design;
    }

    // What the error shape needs to name.
    const std::vector<std::string>& tnm() const { return m_tnm; }
    const std::vector<std::string>& thru() const { return m_thru; }
    const std::vector<std::string>& users() const { return m_users; }
    const std::vector<std::string>& clocks() const { return m_clocks; }
    const std::vector<std::string>& pathTsids() const { return m_linkable[1]; }

private:
    // A base that keeps small designs varied, plus a share that grows
    // with the design.
    std::size_t scaled(std::size_t divisor, std::size_t base) const { return base + m_n / divisor; }
    const std::string& block(std::size_t i) const { return kBlocks[i % kBlocks.size()]; }
    // A group that FROM, TO and PERIOD accept.
    const std::string& termGroup() {
        std::size_t all = m_tnm.size() + m_users.size() + m_sync.size();
        std::size_t i = m_rng.below(all);
        if (i < m_tnm.size())
            return m_tnm[i];
        i -= m_tnm.size();
        return i < m_users.size() ? m_users[i] : m_sync[i - m_users.size()];
    }
    // A group that an OFFSET takes as its register group.
    const std::string& regGroup() {
        return m_rng.chance(50) ? m_rng.pick(m_tnm) : m_rng.pick(m_users);
    }
    bool spelling() { return m_rng.chance(50); }

    void nameGroups() {
        std::size_t nTnm = scaled(200, 12);
        for (std::size_t i = 0; i < nTnm; ++i) {
            std::string kind = i % 9 == 4 ? "pads" : kKinds[(i / 3) % kKinds.size()];
            m_tnm.push_back(block(i) + num(i % 5) + "_" + kind + num(i));
            if (kind == "pads")
                m_pads.push_back(m_tnm.back());
        }
        if (m_pads.empty())
            m_pads.push_back(m_tnm.front());
        m_tnmElems.resize(nTnm);
        for (std::size_t i = 0; i < scaled(1000, 2); ++i)
            m_thru.push_back("tp_" + block(i + 3) + "_mux" + num(i));
        for (std::size_t i = 0; i < scaled(4000, 1); ++i)
            m_sync.push_back("sync_" + block(i + 5) + num(i));
        for (std::size_t i = 0; i < scaled(4000, 2); ++i)
            m_clocks.push_back(block(i + 7) + "_clk" + num(i));
    }

    // Every reference that is not a TNM or TIG reference.
    void makeOtherRefs() {
        for (std::size_t c = 0; c < m_clocks.size(); ++c) {
            m_clockElems.push_back("u_clkgen/bufg_" + num(c));
            m_otherRefs.push_back(ref(m_clockElems.back(), "TS_CLKGRP", m_clocks[c]));
            if (c % 3 == 1)
                m_otherRefs.push_back(ref("u_clkgen/bufgce_" + num(c), "TS_CLKGRP", m_clocks[c]));
        }
        m_thruElems.resize(m_thru.size());
        for (std::size_t t = 0; t < m_thru.size(); ++t) {
            std::size_t count = 1 + m_rng.below(3);
            for (std::size_t k = 0; k < count; ++k) {
                m_thruElems[t].push_back("u_" + block(t + 3) + num(t % 4) + "/mux_" + num(t) + "_" +
                                         num(k) + "/o");
                m_otherRefs.push_back(ref(m_thruElems[t].back(), "TS_TPTHRU", m_thru[t]));
            }
        }
        for (std::size_t s = 0; s < m_sync.size(); ++s) {
            std::size_t count = 1 + m_rng.below(2);
            for (std::size_t k = 0; k < count; ++k)
                m_otherRefs.push_back(
                    ref("u_sync" + num(s) + "/latch" + num(k), "TS_TPSYNC", m_sync[s]));
        }
        std::size_t nNet = scaled(500, 5);
        for (std::size_t i = 0; i < nNet; ++i)
            m_otherRefs.push_back(netTiming(i));
    }

    GenLine netTiming(std::size_t i) {
        std::string net = "n_" + block(i) + num(i % 7) + "_";
        Words w(spelling());
        const std::string& clk = m_rng.pick(m_clocks);
        switch (i % 5) {
        case 0:
            w.time(m_rng.pick({"10", "8", "5", "20"}));
            if (m_rng.chance(50))
                w.add(m_rng.pick({"HIGH", "LOW"})).add(m_rng.pick({"50%", "40%", "60%"}));
            if (m_rng.chance(30))
                w.add("INPUT_JITTER").time("100", "ps");
            return ref(net + "clk" + num(i), "TS_PERIOD", w.str());
        case 1:
            w.time(m_rng.pick({"2", "1.5", "3"}));
            return ref(net + "rst" + num(i), "TS_MAXDELAY", w.str());
        case 2:
            w.time(m_rng.pick({"500", "250", "800"}), "ps");
            return ref(net + "bus" + num(i), "TS_MAXSKEW", w.str());
        case 3:
            if (m_rng.chance(50)) {
                w.add("IN").time(m_rng.pick({"2", "1", "0.5"})).add("BEFORE").add(clk);
            } else {
                w.add("OUT").time("1").add("VALID").time("2").add("AFTER").add(clk);
                w.add("TIMEGRP").add(regGroup());
                if (m_rng.chance(50))
                    w.add(m_rng.pick({"HIGH", "LOW"}));
            }
            return ref(net + "io" + num(i), "TS_OFFSET", w.str());
        default:
            w.time(m_rng.pick({"1.5", "0.8", "2"})).add("NET").add(clk);
            return ref(net + "fb" + num(i), "TS_FEEDBACK", w.str());
        }
    }

    void makeUserGroups() {
        std::size_t nUser = scaled(200, 10);
        for (std::size_t u = 0; u < nUser; ++u)
            m_users.push_back("grp_" + block(u + 1) + "_" + num(u));
        std::vector<GenLine> defs;
        for (std::size_t u = 0; u < nUser; ++u) {
            Words w(spelling());
            std::vector<std::string> members;
            std::size_t count = 1 + m_rng.below(4);
            for (std::size_t k = 0; k < count; ++k) {
                // Only earlier user groups: the definitions never go round.
                std::string member = u > 0 && m_rng.chance(30)
                                         ? m_users[u - 1 - m_rng.below(std::min<std::size_t>(u, 8))]
                                         : m_rng.pick(m_tnm);
                if (std::find(members.begin(), members.end(), member) != members.end())
                    continue;
                members.push_back(member);
                if (m_rng.chance(25))
                    w.add(m_rng.pick({"RISING", "FALLING"}));
                w.add(member);
            }
            if (m_rng.chance(25)) {
                std::vector<std::string> excluded;
                std::size_t count = 1 + m_rng.below(2);
                for (std::size_t k = 0; k < count; ++k) {
                    const std::string& member = m_rng.pick(m_tnm);
                    if (std::find(members.begin(), members.end(), member) != members.end())
                        continue;
                    members.push_back(member);
                    excluded.push_back(member);
                }
                if (!excluded.empty())
                    w.add("EXCEPT");
                for (const std::string& member : excluded)
                    w.add(member);
            }
            defs.push_back(group(m_users[u], w.str()));
        }
        // A group of exclusions only, which the first trim empties.
        defs.push_back(group("grp_spare_io", ":EXCEPT:" + m_pads.front()));
        // Blocks of six in reverse: many definitions name a group that is
        // defined further down.
        for (std::size_t start = 0; start < defs.size(); start += 6) {
            std::size_t end = std::min(defs.size(), start + 6);
            std::reverse(defs.begin() + static_cast<std::ptrdiff_t>(start),
                         defs.begin() + static_cast<std::ptrdiff_t>(end));
        }
        m_groups = std::move(defs);
    }

    enum class SpecKind { Period, Path, TigPath, Offset };

    void makeSpecs() {
        std::size_t nSpec = scaled(100, 20);
        std::vector<SpecKind> kinds(nSpec);
        std::vector<bool> linked(nSpec, false);
        for (std::size_t s = 0; s < nSpec; ++s) {
            std::size_t r = m_rng.below(100);
            // TS1 is always a path, and the first TIG reference names it:
            // tests ask for its holders.
            kinds[s] = s == 0   ? SpecKind::Path
                       : r < 24 ? SpecKind::Period
                       : r < 27 ? SpecKind::Offset
                       : r < 37 ? SpecKind::TigPath
                                : SpecKind::Path;
            linked[s] = (kinds[s] == SpecKind::Period && m_rng.chance(20)) ||
                        (kinds[s] == SpecKind::Path && m_rng.chance(22));
            m_tsids.push_back("TS" + num(s + 1));
        }
        // Periods link to periods and paths to paths; to any earlier one
        // (chains) or to a later one that is not linked itself, so links
        // never go round.
        std::vector<std::size_t> category[2];
        for (std::size_t s = 0; s < nSpec; ++s)
            if (kinds[s] == SpecKind::Period || kinds[s] == SpecKind::Path)
                category[kinds[s] == SpecKind::Path ? 1 : 0].push_back(s);
        for (std::size_t s = 0; s < nSpec; ++s) {
            if (kinds[s] == SpecKind::Path)
                m_linkable[1].push_back(m_tsids[s]);
            if (kinds[s] == SpecKind::Period)
                m_linkable[0].push_back(m_tsids[s]);
            if (kinds[s] == SpecKind::Path || kinds[s] == SpecKind::TigPath)
                m_tigTargets.push_back(m_tsids[s]);
        }
        for (std::size_t s = 0; s < nSpec; ++s) {
            std::string target;
            if (linked[s]) {
                const auto& cat = category[kinds[s] == SpecKind::Path ? 1 : 0];
                auto here = std::lower_bound(cat.begin(), cat.end(), s);
                std::size_t earlier = static_cast<std::size_t>(here - cat.begin());
                std::vector<std::size_t> later;
                for (auto it = here + 1; it != cat.end() && later.size() < 3; ++it)
                    if (!linked[*it])
                        later.push_back(*it);
                if (!later.empty() && (earlier == 0 || m_rng.chance(25)))
                    target = m_tsids[m_rng.pick(later)];
                else if (earlier > 0)
                    target =
                        m_tsids[cat[earlier - 1 - m_rng.below(std::min<std::size_t>(earlier, 20))]];
            }
            m_specs.push_back(spec(m_tsids[s], specValue(kinds[s], target)));
        }
        m_specs.push_back(spec("ENABLE", "reg_sr_o"));
        m_specs.push_back(spec("DISABLE", "lat_d_q"));
        if (m_n >= 500)
            m_specs.push_back(spec("DISABLE", ""));
    }

    void addDelay(Words& w, const std::string& target) {
        if (!target.empty())
            w.link(target, m_rng.chance(60) ? '*' : '/', m_rng.pick({"2", "4", "1.5", "3"}));
        else if (m_rng.chance(8))
            w.time(m_rng.pick({"250", "200", "125"}), "MHz");
        else if (m_rng.chance(15))
            w.time(m_rng.pick({"800", "1500", "2500"}), "ps");
        else
            w.time(m_rng.pick({"5", "4", "2.5", "10", "6", "1.25", "12.5"}));
    }

    std::string specValue(SpecKind kind, const std::string& target) {
        Words w(spelling());
        switch (kind) {
        case SpecKind::Period: {
            w.add("PERIOD").add(termGroup());
            bool absolute = target.empty() && !m_rng.chance(20);
            if (!target.empty())
                w.link(target, m_rng.chance(70) ? '*' : '/', m_rng.pick({"2", "4", "0.5"}));
            else if (absolute)
                w.time(m_rng.pick({"10", "8", "20", "5", "6.4"}));
            else
                w.time(m_rng.pick({"100", "125", "50", "200"}), "MHz");
            if (m_rng.chance(10)) {
                w.add("PHASE");
                if (m_rng.chance(50))
                    w.add("+");
                w.time(m_rng.pick({"1", "2.5", "0.5"}));
            }
            if (m_rng.chance(30)) {
                w.add(m_rng.pick({"HIGH", "LOW"}));
                if (absolute && m_rng.chance(30))
                    w.time("2");
                else
                    w.add(m_rng.pick({"50%", "40%", "60%", "45%"}));
            }
            if (m_rng.chance(10))
                w.add("INPUT_JITTER").time(m_rng.pick({"100", "200"}), "ps");
            if (m_rng.chance(10))
                w.add("PRIORITY").add(num(m_rng.below(10)));
            return w.str();
        }
        case SpecKind::Path:
        case SpecKind::TigPath: {
            std::size_t form = m_rng.below(100);
            bool from = form < 80 || form >= 90;
            bool to = form < 90;
            if (from)
                w.add("FROM").add(termGroup());
            if (m_rng.chance(18)) {
                std::size_t count = 1 + m_rng.below(2);
                for (std::size_t k = 0; k < count; ++k)
                    w.add("THRU").add(m_rng.pick(m_thru));
            }
            if (to)
                w.add("TO").add(termGroup());
            if (kind == SpecKind::TigPath) {
                w.add("TIG");
            } else {
                addDelay(w, target);
                if (m_rng.chance(10))
                    w.add("DATAPATHONLY");
            }
            if (m_rng.chance(10))
                w.add("PRIORITY").add(num(m_rng.below(10)));
            return w.str();
        }
        case SpecKind::Offset:
            break;
        }
        std::string pads = m_rng.pick(m_pads);
        Words body(w.colons());
        body.add("OUT").time(m_rng.pick({"4", "3", "6"})).add("AFTER").add(m_rng.pick(m_clocks));
        return w.add("TIMEGRP").add(pads).str() + (w.colons() ? ":OFFSET=" : " OFFSET = ") +
               body.str();
    }

    void makeOffsets() {
        std::size_t nOffset = scaled(800, 3);
        for (std::size_t i = 0; i < nOffset; ++i) {
            Words w(spelling());
            const std::string& clk = m_rng.pick(m_clocks);
            switch (i % 3) {
            case 0:
                w.add("IN").time(m_rng.pick({"2", "1.5", "3"}));
                if (m_rng.chance(50))
                    w.add("VALID").time(m_rng.pick({"3", "4"}));
                w.add("BEFORE").add(clk);
                if (m_rng.chance(10) && m_clocks.size() > 1)
                    w.add("REFERENCE_PIN").add(m_clocks[(i + 1) % m_clocks.size()]);
                m_specs.push_back(spec("OFFSET", w.str()));
                break;
            case 1:
                w.add("OUT").time(m_rng.pick({"5", "4", "7"})).add("AFTER").add(clk);
                if (m_rng.chance(70))
                    w.add("TIMEGRP").add(regGroup());
                if (m_rng.chance(40))
                    w.add(m_rng.pick({"HIGH", "LOW"}));
                m_specs.push_back(spec("OFFSET", w.str()));
                break;
            default: {
                Words body(w.colons());
                body.add("IN").time(m_rng.pick({"2", "1"})).add("BEFORE").add(clk);
                if (m_rng.chance(40))
                    body.add("TIMEGRP").add(regGroup()).add(m_rng.pick({"HIGH", "LOW"}));
                w.add("TIMEGRP").add(m_rng.pick(m_pads));
                m_specs.push_back(
                    spec("TS_GROUP_BASED_OFFSET",
                         w.str() + (w.colons() ? ":OFFSET=" : " OFFSET = ") + body.str()));
                break;
            }
            }
        }
    }

    std::size_t tigCount() const { return scaled(800, 2); }
    std::size_t globalTigCount() const { return 1 + m_n / 5000; }

    // TNM references fill the design up to about n properties; every TNM
    // group has at least one, a few have many.
    void makeTnmRefs() {
        std::size_t others =
            m_otherRefs.size() + m_groups.size() + m_specs.size() + tigCount() + globalTigCount();
        std::size_t total = std::max(m_tnm.size(), m_n > others ? m_n - others : 0);
        std::vector<std::size_t> counts(m_tnm.size(), 1);
        for (std::size_t k = m_tnm.size(); k < total; ++k) {
            // Half the draws squared: the first groups get many more.
            std::size_t r = m_rng.below(1000);
            if (m_rng.chance(50))
                r = r * r / 1000;
            counts[r * m_tnm.size() / 1000]++;
        }
        for (std::size_t g = 0; g < m_tnm.size(); ++g) {
            std::string prefix =
                "u_" + block(g) + num(g % 5) + "/" + kKinds[(g / 3) % kKinds.size()] + "_" + num(g);
            for (std::size_t j = 0; j < counts[g]; ++j) {
                std::string element = counts[g] == 1
                                          ? prefix + "_q"
                                          : prefix + "_" + num(j / 8) + "<" + num(j % 8) + ">";
                m_tnmElems[g].push_back(element);
                m_tnmRefs.push_back(ref(element, "TS_TNM", m_tnm[g]));
            }
        }
    }

    void makeTigRefs() {
        for (std::size_t i = 0; i < tigCount(); ++i) {
            const auto& elems = m_tnmElems[m_rng.below(m_tnm.size())];
            std::string tsid = i == 0 ? m_tsids.front() : m_rng.pick(m_tigTargets);
            m_otherRefs.push_back(ref(m_rng.pick(elems), "TS_TIG", tsid));
        }
        for (std::size_t i = 0; i < globalTigCount(); ++i)
            m_otherRefs.push_back(ref("u_test/scan_en" + num(i), "TS_TIG", ""));
    }

    // A clock and a THRU point first, then whole TNM groups, so that
    // withdrawing the first few dozen elements cascades.
    std::vector<std::string> removeOrder() {
        std::vector<std::string> order;
        order.push_back(m_clockElems.front());
        for (const std::string& e : m_thruElems.front())
            order.push_back(e);
        // Small groups first, in random order among equals: a few dozen
        // elements empty several groups.
        std::vector<std::pair<std::size_t, std::uint64_t>> keys;
        for (std::size_t g = 0; g < m_tnm.size(); ++g)
            keys.emplace_back(m_tnmElems[g].size(), m_rng.next());
        std::vector<std::size_t> groups(m_tnm.size());
        for (std::size_t g = 0; g < groups.size(); ++g)
            groups[g] = g;
        std::sort(groups.begin(), groups.end(),
                  [&keys](std::size_t a, std::size_t b) { return keys[a] < keys[b]; });
        for (std::size_t g : groups)
            for (const std::string& e : m_tnmElems[g])
                order.push_back(e);
        return order;
    }

    std::size_t m_n;
    Rng m_rng;
    std::vector<std::string> m_tnm, m_pads, m_thru, m_sync, m_clocks, m_users, m_tsids;
    std::vector<std::vector<std::string>> m_tnmElems, m_thruElems;
    std::vector<std::string> m_clockElems;
    std::vector<std::string> m_linkable[2]; // periods, paths
    std::vector<std::string> m_tigTargets;
    std::vector<GenLine> m_tnmRefs, m_otherRefs, m_groups, m_specs;
};

// The mix with a deterministic sprinkling of every kind of error the
// builder and the file reader report. Names that nothing defines are far
// from every defined name.
GenDesign errorsShape(std::size_t n, std::uint64_t seed) {
    MixGen mix(n, seed);
    GenDesign design = mix.run();
    Rng rng(seed ^ 0x5eed0e770bad1dea);
    std::vector<GenLine> errors;
    std::size_t rounds = std::max<std::size_t>(1, n / 500);
    for (std::size_t r = 0; r < rounds; ++r) {
        std::string e = num(r + 1);
        std::string ts = "TSX" + e;
        const std::string& g1 = rng.pick(mix.tnm());
        const std::string& g2 = rng.pick(mix.tnm());
        const std::string& thru = rng.pick(mix.thru());
        const std::string& clk = rng.pick(mix.clocks());
        std::string path = mix.pathTsids().empty() ? "TS1" : rng.pick(mix.pathTsids());
        std::string fromTo = "FROM " + g1 + " TO " + g2 + " ";
        std::vector<GenLine> round = {
            group("undef_e" + e, g1 + " missing_grp_e" + e),
            spec(ts + "A", "FROM " + g1 + " THRU " + g2 + " TO " + g2 + " 5 ns"),
            ref("u_err" + e + "/sync_q", "TS_TPSYNC", "dup_e" + e),
            ref("u_err" + e + "/dup_q", "TS_TNM", "dup_e" + e),
            group(rng.pick(mix.users()), g2),
            spec(path, fromTo + "6 ns"),
            spec(ts + "C", fromTo + ts + "D * 2"),
            spec(ts + "D", "FROM:" + g2 + ":TO:" + g1 + ":" + ts + "C/2"),
            group("loop_e" + e + "_a", "loop_e" + e + "_b"),
            group("loop_e" + e + "_b", g1 + ":loop_e" + e + "_c"),
            group("loop_e" + e + "_c", "loop_e" + e + "_a"),
            spec(ts + "E", fromTo + path + " / 0"),
            ref("u_err" + e + "/tig_q", "TS_TIG", ts + "_GONE"),
            spec("OFFSET", "IN 2 ns BEFORE noclk_e" + e),
            spec(ts + "F", "PERIOD " + g1 + " 10 ns DUTY 50%"),
            ref("u_err" + e + "/x", "TS_SOMETHING", g1),
            spec("PERIOD", g1 + " 10 ns"),
            {LineKind::Raw, "", "", "timespec " + ts + "G = PERIOD " + g1 + " 10 ns"},
            {LineKind::Raw, "", "", "group noeq_e" + e + " " + g1},
            spec(ts + "H", "FROM " + g1 + " TO nowhere_e" + e + " 5 ns"),
            ref("n_err" + e + "_clk", "TS_PERIOD", "10 furlongs"),
            spec(ts + "I", "DROP_SPEC"),
            spec("OFFSET", "OUT 5 ns AFTER " + clk + " TIMEGRP noreg_e" + e),
            spec("OFFSET", "OUT:5:nS:AFTER:" + clk + ":TIMEGRP:" + thru),
            spec(ts + "J", "PERIOD:" + g2 + ":0:nS"),
            ref("n_err" + e + "_dly", "TS_MAXDELAY", "-1 ns"),
            spec(ts + "K", "PERIOD " + thru + " 10 ns"),
            {LineKind::Raw, "", "", "ref u_err" + e + "/only_elem"},
            group("badword_e" + e, g1 + " EXCEPT EXCEPT " + g2),
            ref("u_err" + e + "/tnm", "TS_TNM", ""),
        };
        // A link to a missing TSid stops the check for circular links, so
        // only even seeds have one.
        if (seed % 2 == 0)
            round.push_back(spec(ts + "B", fromTo + ts + "_NOSUCH / 2"));
        for (GenLine& line : round)
            errors.push_back(std::move(line));
    }
    design.lines = scatter(std::move(design.lines), std::move(errors), rng);
    design.removeOrder.clear();
    return design;
}

// N TIMEGRP definitions, each naming the next; the last names a TNM group
// whose one reference sits on `base`; a period uses the first.
GenDesign groupChain(std::size_t n, bool reversed) {
    GenDesign d;
    d.lines.push_back(ref("base", "TS_TNM", "chain_leaf"));
    std::vector<GenLine> defs;
    for (std::size_t i = 0; i < n; ++i)
        defs.push_back(group("gc" + num(i), i + 1 < n ? "gc" + num(i + 1) : "chain_leaf"));
    if (reversed)
        std::reverse(defs.begin(), defs.end());
    for (GenLine& line : defs)
        d.lines.push_back(std::move(line));
    d.lines.push_back(spec("TS1", n > 0 ? "PERIOD gc0 10 ns" : "PERIOD chain_leaf 10 ns"));
    d.removeOrder = {"base"};
    return d;
}

// N TSids, each linked to the one before; the first a period on a TNM group
// whose one reference sits on `base`, the others on a group that stays.
GenDesign tsidChain(std::size_t n, bool reversed) {
    GenDesign d;
    d.lines.push_back(ref("base", "TS_TNM", "chain_clk"));
    d.lines.push_back(ref("other", "TS_TNM", "chain_data"));
    std::vector<GenLine> defs;
    for (std::size_t i = 0; i < n; ++i) {
        std::string value;
        if (i == 0)
            value = "PERIOD chain_clk 10 ns";
        else
            value = "PERIOD chain_data TS" + num(i - 1) + (i % 2 != 0 ? " * 2" : " / 2") +
                    (i % 10 == 5 ? " PHASE + 1 ns" : "");
        defs.push_back(spec("TS" + num(i), value));
    }
    if (reversed)
        std::reverse(defs.begin(), defs.end());
    for (GenLine& line : defs)
        d.lines.push_back(std::move(line));
    d.removeOrder = {"base"};
    return d;
}

// One TIMEGRP of N members, each a TNM group of one reference; `base`
// carries the first.
GenDesign wideGroup(std::size_t n) {
    GenDesign d;
    std::string members;
    for (std::size_t i = 0; i < n; ++i) {
        d.lines.push_back(ref(i == 0 ? "base" : "u_w/r" + num(i), "TS_TNM", "w" + num(i)));
        members += (i == 0 ? "" : " ") + ("w" + num(i));
    }
    d.lines.push_back(group("wide", members));
    d.lines.push_back(spec("TS1", "FROM wide TO wide 5 ns"));
    d.lines.push_back(spec("TS2", "PERIOD wide 10 ns"));
    d.removeOrder = {"base"};
    return d;
}

// N TNM references on one group.
GenDesign tnmRefs(std::size_t n) {
    GenDesign d;
    for (std::size_t i = 0; i < n; ++i) {
        std::string element = "u_big/r" + num(i / 8) + "<" + num(i % 8) + ">";
        d.lines.push_back(ref(element, "TS_TNM", "big"));
        d.removeOrder.push_back(element);
    }
    d.lines.push_back(spec("TS1", "PERIOD big 10 ns"));
    d.lines.push_back(spec("TS2", "FROM big TO big 5 ns"));
    return d;
}

// N objects that withdrawing the listed elements trashes: half TNM groups,
// half paths from them; one group and period stay.
GenDesign trashed(std::size_t n) {
    GenDesign d;
    d.lines.push_back(ref("u_keep/r", "TS_TNM", "keep"));
    std::size_t half = (n + 1) / 2;
    for (std::size_t i = 0; i < half; ++i) {
        std::string element = "u_tr/r" + num(i);
        d.lines.push_back(ref(element, "TS_TNM", "tr" + num(i)));
        d.removeOrder.push_back(element);
    }
    d.lines.push_back(spec("TS0", "PERIOD keep 10 ns"));
    for (std::size_t i = 0; i < n - half; ++i)
        d.lines.push_back(spec("TS" + num(i + 1), "FROM tr" + num(i) + " TO keep 5 ns"));
    return d;
}

} // namespace

const std::vector<std::string>& shapeNames() {
    static const std::vector<std::string> names = {
        "mix",        "errors",   "group-chain", "group-chain-rev", "tsid-chain", "tsid-chain-rev",
        "wide-group", "tnm-refs", "trashed"};
    return names;
}

bool isShape(const std::string& shape) {
    const auto& names = shapeNames();
    return std::find(names.begin(), names.end(), shape) != names.end();
}

GenDesign generate(const std::string& shape, std::size_t n, std::uint64_t seed) {
    if (shape == "mix")
        return MixGen(n, seed).run();
    if (shape == "errors")
        return errorsShape(n, seed);
    if (shape == "group-chain" || shape == "group-chain-rev")
        return groupChain(n, shape == "group-chain-rev");
    if (shape == "tsid-chain" || shape == "tsid-chain-rev")
        return tsidChain(n, shape == "tsid-chain-rev");
    if (shape == "wide-group")
        return wideGroup(n);
    if (shape == "tnm-refs")
        return tnmRefs(n);
    if (shape == "trashed")
        return trashed(n);
    throw std::invalid_argument("unknown shape \"" + shape + "\"");
}

std::string lineText(const GenLine& line) {
    std::string text;
    switch (line.kind) {
    case LineKind::Raw:
        return line.value;
    case LineKind::Group:
        text = "group " + line.name;
        break;
    case LineKind::Spec:
        text = "spec " + line.name;
        break;
    case LineKind::Ref:
        text = "ref " + line.element + " " + line.name;
        break;
    }
    text += " =";
    if (!line.value.empty())
        text += " " + line.value;
    return text;
}

std::string designText(const GenDesign& design, const std::string& shape, std::size_t n,
                       std::uint64_t seed) {
    std::string text =
        "# tsd_gen " + shape + " " + num(n) + " --seed " + std::to_string(seed) + "\n";
    for (const GenLine& line : design.lines)
        text += lineText(line) + "\n";
    return text;
}

} // namespace tsd_gen
