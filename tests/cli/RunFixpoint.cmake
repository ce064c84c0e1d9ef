# What the tool writes as properties reads back as itself: `tsd fmt` of the
# output gives the same lines again (comment lines aside) and the output
# checks without errors. A run that fails writes nothing.
#
#   cmake -DTSD=<tool> -DARGS=<arguments, separated by |> -DDIR=<where the tool runs>
#         -DOUTDIR=<scratch> -DNAME=<case> -P RunFixpoint.cmake
cmake_minimum_required(VERSION 3.25)

unset(ENV{TSD_DEBUG_TRACE})
unset(ENV{QOR_TSD_NO_SPECIAL_PARSER})
unset(ENV{QOR_TSD_DEBUG_SPECIAL_PARSER})
file(MAKE_DIRECTORY ${OUTDIR})
set(first ${OUTDIR}/${NAME}.first.props)
set(second ${OUTDIR}/${NAME}.second.props)
file(REMOVE ${first} ${second})
string(REPLACE "|" ";" args "${ARGS}")

execute_process(COMMAND ${TSD} ${args} WORKING_DIRECTORY ${DIR} OUTPUT_FILE ${first}
                ERROR_VARIABLE err RESULT_VARIABLE status)
file(READ ${first} once)
if(NOT status EQUAL 0)
  if(NOT once STREQUAL "")
    message(FATAL_ERROR "the run failed (${status}) but wrote:\n${once}")
  endif()
  return()
endif()
if(NOT err STREQUAL "")
  message(FATAL_ERROR "the run succeeded but reported:\n${err}")
endif()

execute_process(COMMAND ${TSD} fmt ${first} OUTPUT_FILE ${second} ERROR_VARIABLE err
                RESULT_VARIABLE status)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "fmt of the output failed (${status}):\n${err}")
endif()
file(READ ${second} twice)
string(REGEX REPLACE "(^|\n)#[^\n]*" "" expected "${once}")
string(REGEX REPLACE "^\n+" "" expected "${expected}")
if(NOT expected STREQUAL twice)
  message(FATAL_ERROR "the output does not read back as itself:\n--- output\n${once}"
                      "--- fmt of it\n${twice}")
endif()

execute_process(COMMAND ${TSD} check ${first} OUTPUT_VARIABLE out ERROR_VARIABLE err
                RESULT_VARIABLE status)
if(NOT status EQUAL 0 OR NOT err STREQUAL "")
  message(FATAL_ERROR "the output does not check cleanly (${status}):\n${err}")
endif()
