// Synthetic property files for tests and benchmarks: a realistic mix of
// constraints at any size, the same with a sprinkling of every kind of error,
// and adversarial shapes (long chains, wide groups, many references). The
// output depends only on the shape, the size and the seed, on every machine.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace tsd_gen {

enum class LineKind { Group, Spec, Ref, Raw };

// One line of a property file. A Raw line is written as `value` alone (the
// malformed lines of the error shape).
struct GenLine {
    LineKind kind = LineKind::Raw;
    std::string element; // Ref only
    std::string name;
    std::string value;
};

struct GenDesign {
    std::vector<GenLine> lines;
    // Netlist elements in the order a trim should withdraw them.
    std::vector<std::string> removeOrder;
};

// The shapes generate() knows, in a stable order.
const std::vector<std::string>& shapeNames();
bool isShape(const std::string& shape);

// Throws std::invalid_argument for an unknown shape. `n` is the number of
// properties for `mix` and `errors`, the length or width of the others.
GenDesign generate(const std::string& shape, std::size_t n, std::uint64_t seed);

// The line as the property-file reader takes it, without end-of-line.
std::string lineText(const GenLine& line);

// The whole file, with a comment line that says how it was made.
std::string designText(const GenDesign& design, const std::string& shape, std::size_t n,
                       std::uint64_t seed);

} // namespace tsd_gen
