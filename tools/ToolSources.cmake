# The tool's sources but main, relative to tools/tsd: the tool's library and
# the fuzz target of its commands build the same list.
set(TSD_TOOL_SOURCES
  PropFile.cpp
  Statements.cpp
  Hints.cpp
  Diagnostics.cpp
  Describe.cpp
  Session.cpp
  Netlist.cpp
  Graph.cpp
  Json.cpp
  Pages.cpp
  Commands.cpp
)
