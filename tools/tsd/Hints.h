// Hints for names that were not found: the defined name that the writer
// most likely meant, for a diagnostic's `did you mean "clk_grp"?`.
#pragma once

#include <optional>
#include <string>
#include <string_view>
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

} // namespace tsd_cli
