// The constraint structure of a design as a Graphviz DOT graph.
#pragma once

#include <iosfwd>

class Tsd_Design;

namespace tsd_cli {

// Groups and specifications are nodes, shaped by class; edges go from user
// groups to their members (exclusions dashed), from specifications to the
// groups they name, from linked specifications to the one they are defined
// by (labelled with the factor) and from TIG directives to the
// specification they ignore. Only active objects are drawn.
void writeDot(std::ostream& out, Tsd_Design& design);

} // namespace tsd_cli
