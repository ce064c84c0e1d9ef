#include "Hints.h"

#include "PropFile.h"

#include <algorithm>
#include <cctype>
#include <cstdlib>

namespace tsd_cli {

namespace {

// The edit distance of a and b counting a swap of neighbours as one edit,
// or bound + 1 when it exceeds the bound. Only the diagonal band of width
// 2 * bound + 1 is computed, and the walk stops when a whole row exceeds
// the bound.
class BoundedDistance {
public:
    explicit BoundedDistance(int bound) : m_bound(bound) {}

    int operator()(std::string_view a, std::string_view b) {
        const int far = m_bound + 1;
        int n = static_cast<int>(a.size());
        int m = static_cast<int>(b.size());
        if (std::abs(n - m) > m_bound)
            return far;
        for (std::vector<int>* row : {&m_before, &m_previous, &m_current})
            row->assign(static_cast<std::size_t>(m) + 1, far);
        for (int j = 0; j <= std::min(m, m_bound); ++j)
            m_previous[static_cast<std::size_t>(j)] = j;
        for (int i = 1; i <= n; ++i) {
            int low = std::max(1, i - m_bound);
            int high = std::min(m, i + m_bound);
            auto at = [](std::vector<int>& row, int j) -> int& {
                return row[static_cast<std::size_t>(j)];
            };
            at(m_current, low - 1) = low == 1 && i <= m_bound ? i : far;
            if (high + 1 <= m)
                at(m_current, high + 1) = far;
            int rowMin = at(m_current, low - 1);
            for (int j = low; j <= high; ++j) {
                int cost = a[static_cast<std::size_t>(i - 1)] == b[static_cast<std::size_t>(j - 1)]
                               ? 0
                               : 1;
                int best = std::min({at(m_previous, j) + 1, at(m_current, j - 1) + 1,
                                     at(m_previous, j - 1) + cost});
                if (i > 1 && j > 1 &&
                    a[static_cast<std::size_t>(i - 1)] == b[static_cast<std::size_t>(j - 2)] &&
                    a[static_cast<std::size_t>(i - 2)] == b[static_cast<std::size_t>(j - 1)])
                    best = std::min(best, at(m_before, j - 2) + 1);
                at(m_current, j) = std::min(best, far);
                rowMin = std::min(rowMin, at(m_current, j));
            }
            if (rowMin > m_bound)
                return far;
            std::swap(m_before, m_previous);
            std::swap(m_previous, m_current);
        }
        return std::min(m_previous[static_cast<std::size_t>(m)], far);
    }

private:
    int m_bound;
    std::vector<int> m_before, m_previous, m_current;
};

std::string lowerCase(std::string_view text) {
    std::string lower(text);
    for (char& c : lower)
        c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return lower;
}

// At most a third of the name's length, at most two; one is always allowed.
int editBound(std::string_view name) {
    return std::max(1, std::min(2, static_cast<int>(name.size()) / 3));
}

std::string hintText(const std::optional<std::string>& close) {
    return close ? "did you mean " + inQuotes(*close) + "?" : std::string();
}

} // namespace

bool equalsNoCase(std::string_view a, std::string_view b) {
    if (a.size() != b.size())
        return false;
    for (std::size_t i = 0; i < a.size(); ++i)
        if (std::toupper(static_cast<unsigned char>(a[i])) !=
            std::toupper(static_cast<unsigned char>(b[i])))
            return false;
    return true;
}

std::optional<std::string> closestName(std::string_view name,
                                       const std::vector<std::string>& defined) {
    int bound = editBound(name);
    BoundedDistance distance(bound);
    const std::string* best = nullptr;
    int bestScore = bound + 1;
    for (const std::string& candidate : defined) {
        if (candidate != name && equalsNoCase(name, candidate))
            return candidate; // nothing is closer
        if (candidate == name)
            continue;
        int score = distance(name, candidate);
        if (score < bestScore) {
            bestScore = score;
            best = &candidate;
        }
    }
    if (best == nullptr)
        return std::nullopt;
    return *best;
}

std::string didYouMean(std::string_view name, const std::vector<std::string>& defined) {
    return hintText(closestName(name, defined));
}

NameHints::NameHints(std::vector<std::string> defined, std::size_t budget)
    : m_defined(std::move(defined)),
      m_budget(budget != 0 ? budget
                           : std::max<std::size_t>(std::size_t{1} << 20, 4 * m_defined.size())) {
    for (std::uint32_t i = 0; i < m_defined.size(); ++i) {
        m_byLower.emplace(lowerCase(m_defined[i]), i);
        m_byLength[m_defined[i].size()].push_back(i);
    }
}

std::optional<std::string> NameHints::closest(std::string_view name) {
    auto sameLetters = m_byLower.find(lowerCase(name));
    if (sameLetters != m_byLower.end() && m_defined[sameLetters->second] != name)
        return m_defined[sameLetters->second]; // nothing is closer
    int bound = editBound(name);
    BoundedDistance distance(bound);
    int bestScore = bound + 1;
    std::uint32_t best = 0;
    for (std::size_t length = name.size() > static_cast<std::size_t>(bound)
                                  ? name.size() - static_cast<std::size_t>(bound)
                                  : 0;
         length <= name.size() + static_cast<std::size_t>(bound); ++length) {
        auto bucket = m_byLength.find(length);
        if (bucket == m_byLength.end())
            continue;
        for (std::uint32_t index : bucket->second) {
            if (m_budget == 0)
                break;
            --m_budget;
            const std::string& candidate = m_defined[index];
            if (candidate == name)
                continue;
            int score = distance(name, candidate);
            // Among equally close names the first defined wins.
            if (score < bestScore || (score == bestScore && score <= bound && index < best)) {
                bestScore = score;
                best = index;
            }
        }
    }
    if (bestScore > bound)
        return std::nullopt;
    return m_defined[best];
}

std::string NameHints::didYouMean(std::string_view name) {
    return hintText(closest(name));
}

} // namespace tsd_cli
