# Generates one case of the regression corpus and runs every command of it,
# comparing each transcript with expected/<case>.<command>.golden (or
# checking that the output is a fmt fixpoint).
#
#   cmake -DTSD=<tool> -DGEN=<tsd_gen> -DCASE_FILE=<case description>
#         -DDIR=<scratch> -DEXPECTED_DIR=<expectations> -P RunRegress.cmake
#
# The case description sets CASE, GEN_ARGS and COMMANDS, and for each
# command ARGS_<command>, optionally REMOVE_<command> (generator arguments
# that list the elements standing for @REMOVE@) and FIXPOINT_<command>.
# @IN@ stands for the generated file; the tool runs beside it, so messages
# name it the same way on every machine.
cmake_minimum_required(VERSION 3.25)

include(${CMAKE_CURRENT_LIST_DIR}/../cli/GoldenSupport.cmake)
include(${CASE_FILE})

file(REMOVE_RECURSE ${DIR})
file(MAKE_DIRECTORY ${DIR})
set(input ${CASE}.props)

function(generate)
  execute_process(COMMAND ${GEN} ${ARGN} WORKING_DIRECTORY ${DIR} RESULT_VARIABLE status
                  OUTPUT_VARIABLE out ERROR_VARIABLE err)
  if(NOT status EQUAL 0)
    message(FATAL_ERROR "tsd_gen ${ARGN} failed (${status}):\n${err}")
  endif()
  set(generated "${out}" PARENT_SCOPE)
endfunction()

generate(${GEN_ARGS} -o ${input})
foreach(command IN LISTS COMMANDS)
  set(name ${CASE}.${command})
  set(args ${ARGS_${command}})
  list(TRANSFORM args REPLACE "^@IN@$" "${input}")
  list(FIND args "@REMOVE@" at)
  if(at GREATER_EQUAL 0)
    generate(${REMOVE_${command}})
    string(REGEX REPLACE "\n$" "" elements "${generated}")
    string(REPLACE "\n" ";" elements "${elements}")
    list(REMOVE_AT args ${at})
    list(INSERT args ${at} ${elements})
  endif()
  if(FIXPOINT_${command})
    tsd_golden_fixpoint(TOOL ${TSD} ARGS ${args} DIR ${DIR} OUTDIR ${DIR} NAME ${name})
  else()
    tsd_golden_run(actual TOOL ${TSD} ARGS ${args} DIR ${DIR} OUTDIR ${DIR} NAME ${name})
    tsd_golden_compare("${actual}" ${EXPECTED_DIR}/${name}.golden ${DIR}/${name}.actual)
  endif()
endforeach()
