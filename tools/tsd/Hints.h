// Hints for names that were not found: the defined name that the writer
// most likely meant, for a diagnostic's `did you mean "clk_grp"?`.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace tsd_cli {

// Keywords and attribute names compare without regard to case (ASCII).
bool equalsNoCase(std::string_view a, std::string_view b);

// The defined name closest to `name`, if one is close: the same letters in
// another case come first, then the fewest edits (a letter inserted, deleted
// or replaced, or two neighbours swapped), at most two and at most a third
// of the name's length (one edit is always allowed). Among equally close
// names the one that comes first in `defined` wins. `name` itself is never
// proposed. Costs a small constant per defined name and letter.
std::optional<std::string> closestName(std::string_view name,
                                       const std::vector<std::string>& defined);

// `did you mean "NAME"?` for the closest name, or empty when none is close.
std::string didYouMean(std::string_view name, const std::vector<std::string>& defined);

// The same hints for many misses among many names. Names are indexed by
// their spelling in lower case and by length, so a miss is compared only
// with names of a length within two of its own; and the comparisons of one
// index stop for good after a budget of a few per name (at least a million
// in all): past it only a hint of the same letters in another case is
// given. Thousands of misses among a million names of one length then cost
// a few passes over the names, not one pass each.
class NameHints {
public:
    // `budget` 0: a few comparisons per name, at least a million.
    explicit NameHints(std::vector<std::string> defined, std::size_t budget = 0);

    std::optional<std::string> closest(std::string_view name);
    std::string didYouMean(std::string_view name);

private:
    std::vector<std::string> m_defined;
    std::unordered_map<std::string, std::uint32_t> m_byLower; // the first of each
    std::unordered_map<std::size_t, std::vector<std::uint32_t>> m_byLength;
    std::size_t m_budget;
};

} // namespace tsd_cli
