# Runs the tool once and compares its exit status, standard output and error
# output with an expectation file.
#
#   cmake -DTSD=<tool> -DARGS=<arguments, separated by |> [-DSTDIN=<file>]
#         -DSOURCE_DIR=<where the tool runs> -DEXPECTED=<expectation file>
#         -DOUTDIR=<scratch directory> -DNAME=<case> -P RunGolden.cmake
#
# The argument @OUT@ stands for a scratch file; what the tool writes there is
# compared too. With the environment variable TSD_UPDATE_GOLDEN set, the
# expectation file is rewritten instead.
cmake_minimum_required(VERSION 3.25)

include(${CMAKE_CURRENT_LIST_DIR}/GoldenSupport.cmake)

file(MAKE_DIRECTORY ${OUTDIR})
set(written ${OUTDIR}/${NAME}.written)
file(REMOVE ${written})
string(REPLACE "|" ";" args "${ARGS}")
list(TRANSFORM args REPLACE "^@OUT@$" "${written}")

tsd_golden_run(actual TOOL ${TSD} ARGS ${args} STDIN "${STDIN}" DIR ${SOURCE_DIR}
               OUTDIR ${OUTDIR} NAME ${NAME})
if(EXISTS ${written})
  file(READ ${written} content)
  tsd_golden_section(actual "written file" "${content}")
  tsd_golden_carriage_returns(actual ${written})
endif()
tsd_golden_compare("${actual}" ${EXPECTED} ${OUTDIR}/${NAME}.actual)
