# Converts a file to property lines and to statements and back; both ways
# give the same canonical property lines.
#
#   cmake -DTSD=<tool> -DINPUT=<file> -DDIR=<where the tool runs>
#         -DOUTDIR=<scratch> -DNAME=<case> -P RunConversion.cmake
cmake_minimum_required(VERSION 3.25)

include(${CMAKE_CURRENT_LIST_DIR}/GoldenSupport.cmake)

tsd_golden_conversion(TOOL ${TSD} INPUT ${INPUT} DIR ${DIR} OUTDIR ${OUTDIR} NAME ${NAME})
