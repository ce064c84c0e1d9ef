# `tsd graph` writes DOT that Graphviz renders to SVG.
#
#   cmake -DTSD=<tool> -DDOT=<dot> -DINPUT=<file> -DOUTDIR=<scratch> -P RenderGraph.cmake
cmake_minimum_required(VERSION 3.25)

if(NOT DOT)
  message(FATAL_ERROR "Graphviz's dot was not found: run scripts/setup-deps.sh")
endif()
file(MAKE_DIRECTORY ${OUTDIR})
get_filename_component(stem ${INPUT} NAME_WE)
set(graph ${OUTDIR}/${stem}.dot)
set(svg ${OUTDIR}/${stem}.svg)
file(REMOVE ${graph} ${svg})

execute_process(COMMAND ${TSD} graph ${INPUT} -o ${graph} RESULT_VARIABLE status
                ERROR_VARIABLE err)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "tsd graph failed (${status}):\n${err}")
endif()
execute_process(COMMAND ${DOT} -Tsvg ${graph} -o ${svg} RESULT_VARIABLE status
                ERROR_VARIABLE err)
if(NOT status EQUAL 0 OR NOT err STREQUAL "")
  message(FATAL_ERROR "dot could not render ${graph} (${status}):\n${err}")
endif()
file(READ ${svg} content)
if(NOT content MATCHES "<svg[ \n]" OR NOT content MATCHES "</svg>")
  message(FATAL_ERROR "dot did not write an SVG document to ${svg}")
endif()
# Every node and edge of the graph made it into the picture.
file(STRINGS ${graph} nodes REGEX "^  n[0-9]+ \\[label=")
file(STRINGS ${graph} edges REGEX "^  n[0-9]+ -> n[0-9]+")
string(REGEX MATCHALL "class=\"node\"" svgNodes "${content}")
string(REGEX MATCHALL "class=\"edge\"" svgEdges "${content}")
list(LENGTH nodes nodeCount)
list(LENGTH edges edgeCount)
list(LENGTH svgNodes svgNodeCount)
list(LENGTH svgEdges svgEdgeCount)
if(nodeCount EQUAL 0 OR NOT nodeCount EQUAL svgNodeCount OR NOT edgeCount EQUAL svgEdgeCount)
  message(FATAL_ERROR "the SVG has ${svgNodeCount} nodes and ${svgEdgeCount} edges; "
                      "the graph has ${nodeCount} and ${edgeCount}")
endif()
