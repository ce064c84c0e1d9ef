# Helpers of the golden-test drivers.

# Runs the tool with a clean environment for the library's switches and sets
# `var` to a transcript: the exit status, then standard output and error
# output, each as a section.
function(tsd_golden_run var)
  cmake_parse_arguments(R "" "TOOL;STDIN;DIR;OUTDIR;NAME" "ARGS" ${ARGN})
  unset(ENV{TSD_DEBUG_TRACE})
  unset(ENV{QOR_TSD_NO_SPECIAL_PARSER})
  unset(ENV{QOR_TSD_DEBUG_SPECIAL_PARSER})
  set(input /dev/null)
  if(R_STDIN)
    set(input ${R_STDIN})
  endif()
  execute_process(COMMAND ${R_TOOL} ${R_ARGS}
                  WORKING_DIRECTORY ${R_DIR}
                  INPUT_FILE ${input}
                  OUTPUT_FILE ${R_OUTDIR}/${R_NAME}.stdout
                  ERROR_FILE ${R_OUTDIR}/${R_NAME}.stderr
                  RESULT_VARIABLE status)
  file(READ ${R_OUTDIR}/${R_NAME}.stdout out)
  file(READ ${R_OUTDIR}/${R_NAME}.stderr err)
  set(text "status ${status}\n")
  tsd_golden_section(text "stdout" "${out}")
  tsd_golden_carriage_returns(text ${R_OUTDIR}/${R_NAME}.stdout)
  tsd_golden_section(text "stderr" "${err}")
  set(${var} "${text}" PARENT_SCOPE)
endfunction()

# Appends a titled section to the transcript in `var`; a body without a final
# end-of-line is marked, so that one cannot pass for the other.
function(tsd_golden_section var title body)
  set(text "${${var}}--- ${title}\n${body}")
  if(NOT body STREQUAL "" AND NOT body MATCHES "\n$")
    string(APPEND text "\n--- (no end-of-line above)\n")
  endif()
  set(${var} "${text}" PARENT_SCOPE)
endfunction()

# file(READ) drops carriage returns: a file that holds some has their count
# appended to the transcript in `var`.
function(tsd_golden_carriage_returns var file)
  file(READ ${file} hex HEX)
  if(NOT hex MATCHES "0d")
    return()
  endif()
  string(REGEX MATCHALL "[0-9a-f][0-9a-f]" bytes "${hex}")
  list(FILTER bytes INCLUDE REGEX "^0d$")
  list(LENGTH bytes count)
  if(count GREATER 0)
    set(${var} "${${var}}--- (${count} carriage returns above)\n" PARENT_SCOPE)
  endif()
endfunction()

# Compares a transcript with the expectation file (or rewrites it when
# TSD_UPDATE_GOLDEN is set); on a difference shows it and fails.
function(tsd_golden_compare actual expected scratch)
  if(DEFINED ENV{TSD_UPDATE_GOLDEN})
    file(WRITE ${expected} "${actual}")
    return()
  endif()
  if(NOT EXISTS ${expected})
    file(WRITE ${scratch} "${actual}")
    message(FATAL_ERROR "no expectation file ${expected}; the tool gave:\n${actual}")
  endif()
  file(READ ${expected} wanted)
  if(wanted STREQUAL actual)
    return()
  endif()
  file(WRITE ${scratch} "${actual}")
  find_program(DIFF diff)
  if(DIFF)
    execute_process(COMMAND ${DIFF} -u ${expected} ${scratch} OUTPUT_VARIABLE difference)
    message(FATAL_ERROR "the output differs from ${expected}:\n${difference}")
  endif()
  message(FATAL_ERROR "the output differs from ${expected}:\n--- wanted\n${wanted}--- got\n${actual}")
endfunction()

# Runs the tool and checks that what it writes as properties reads back as
# itself: `tsd fmt` of the output gives the same lines again (comment lines
# aside; with STATEMENTS, a statement file keeps its comments: the same
# bytes) and the output checks without errors. A run that fails must write
# nothing.
function(tsd_golden_fixpoint)
  cmake_parse_arguments(F "STATEMENTS" "TOOL;DIR;OUTDIR;NAME" "ARGS" ${ARGN})
  unset(ENV{TSD_DEBUG_TRACE})
  unset(ENV{QOR_TSD_NO_SPECIAL_PARSER})
  unset(ENV{QOR_TSD_DEBUG_SPECIAL_PARSER})
  file(MAKE_DIRECTORY ${F_OUTDIR})
  set(ext props)
  if(F_STATEMENTS)
    set(ext stmts)
  endif()
  set(first ${F_OUTDIR}/${F_NAME}.first.${ext})
  set(second ${F_OUTDIR}/${F_NAME}.second.${ext})
  file(REMOVE ${first} ${second})

  # Names taken from the netlist are taken so again when the output is
  # read, and the notes that say so are no complaint.
  set(again "")
  if("--assume-netlist" IN_LIST F_ARGS)
    set(again --assume-netlist)
  endif()
  macro(_tsd_drop_notes)
    if(again)
      string(REGEX REPLACE "[^\n]*: note: [^\n]*\n(   [^\n]*\n)*" "" err "${err}")
    endif()
  endmacro()

  execute_process(COMMAND ${F_TOOL} ${F_ARGS} WORKING_DIRECTORY ${F_DIR} OUTPUT_FILE ${first}
                  ERROR_VARIABLE err RESULT_VARIABLE status)
  _tsd_drop_notes()
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

  execute_process(COMMAND ${F_TOOL} fmt ${again} ${first} OUTPUT_FILE ${second}
                  ERROR_VARIABLE err RESULT_VARIABLE status)
  if(NOT status EQUAL 0)
    message(FATAL_ERROR "fmt of the output failed (${status}):\n${err}")
  endif()
  file(READ ${second} twice)
  set(expected "${once}")
  set(got "${twice}")
  if(F_STATEMENTS)
    # Byte for byte, carriage returns included.
    file(READ ${first} expected HEX)
    file(READ ${second} got HEX)
  else()
    string(REGEX REPLACE "(^|\n)#[^\n]*" "" expected "${once}")
    string(REGEX REPLACE "^\n+" "" expected "${expected}")
  endif()
  if(NOT expected STREQUAL got)
    message(FATAL_ERROR "the output does not read back as itself:\n--- output\n${once}"
                        "--- fmt of it\n${twice}")
  endif()

  execute_process(COMMAND ${F_TOOL} check ${again} ${first} OUTPUT_VARIABLE out
                  ERROR_VARIABLE err RESULT_VARIABLE status)
  _tsd_drop_notes()
  if(NOT status EQUAL 0 OR NOT err STREQUAL "")
    message(FATAL_ERROR "the output does not check cleanly (${status}):\n${err}")
  endif()
endfunction()

# Converts a file both ways: its canonical property lines, written as
# statements (or written back as the statement file it is) and read again,
# are the same lines; and so are those lines written as statements and read
# again.
function(tsd_golden_conversion)
  cmake_parse_arguments(C "" "TOOL;DIR;OUTDIR;NAME;INPUT" "" ${ARGN})
  file(MAKE_DIRECTORY ${C_OUTDIR})
  set(base ${C_OUTDIR}/${C_NAME})
  function(_tsd_convert to input output)
    execute_process(COMMAND ${C_TOOL} fmt --to ${to} ${input} -o ${output}
                    WORKING_DIRECTORY ${C_DIR} ERROR_VARIABLE err RESULT_VARIABLE status)
    if(NOT status EQUAL 0 OR NOT err STREQUAL "")
      message(FATAL_ERROR "fmt --to ${to} ${input} failed (${status}):\n${err}")
    endif()
  endfunction()
  _tsd_convert(props ${C_INPUT} ${base}.props)
  _tsd_convert(statements ${C_INPUT} ${base}.stmts)
  _tsd_convert(props ${base}.stmts ${base}.back.props)
  _tsd_convert(statements ${base}.props ${base}.converted.stmts)
  _tsd_convert(props ${base}.converted.stmts ${base}.converted.props)
  file(READ ${base}.props lines)
  foreach(form back converted)
    file(READ ${base}.${form}.props again)
    if(NOT again STREQUAL lines)
      message(FATAL_ERROR "${base}.${form}.props differs from the canonical lines:\n"
                          "--- canonical\n${lines}--- read back\n${again}")
    endif()
  endforeach()
endfunction()
