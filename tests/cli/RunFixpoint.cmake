# What the tool writes as properties reads back as itself: `tsd fmt` of the
# output gives the same lines again (comment lines aside) and the output
# checks without errors. A run that fails writes nothing.
#
#   cmake -DTSD=<tool> -DARGS=<arguments, separated by |> -DDIR=<where the tool runs>
#         -DOUTDIR=<scratch> -DNAME=<case> [-DSTATEMENTS=ON] -P RunFixpoint.cmake
#
# With STATEMENTS the output is a statement file, which fmt writes back
# byte for byte.
cmake_minimum_required(VERSION 3.25)

include(${CMAKE_CURRENT_LIST_DIR}/GoldenSupport.cmake)

string(REPLACE "|" ";" args "${ARGS}")
set(statements "")
if(STATEMENTS)
  set(statements STATEMENTS)
endif()
tsd_golden_fixpoint(${statements} TOOL ${TSD} ARGS ${args} DIR ${DIR} OUTDIR ${OUTDIR} NAME ${NAME})
