# Runs one libFuzzer target for SECONDS seconds on a fresh copy of its seed
# corpus under WORK, so the repository is never written.
#   cmake -DFUZZER=exe -DSEEDS=dir -DDICT=file -DWORK=dir -DSECONDS=n -P RunFuzzer.cmake
foreach(var FUZZER SEEDS DICT WORK SECONDS)
  if(NOT DEFINED ${var})
    message(FATAL_ERROR "RunFuzzer.cmake: ${var} is not set")
  endif()
endforeach()

file(REMOVE_RECURSE "${WORK}")
file(MAKE_DIRECTORY "${WORK}/corpus" "${WORK}/artifacts")
file(GLOB seeds "${SEEDS}/*")
if(NOT seeds)
  message(FATAL_ERROR "RunFuzzer.cmake: no seeds in ${SEEDS}")
endif()
file(COPY ${seeds} DESTINATION "${WORK}/corpus")

execute_process(
  COMMAND "${FUZZER}" -max_total_time=${SECONDS} -timeout=10 -rss_limit_mb=2048
          -max_len=4096 -print_final_stats=1 "-dict=${DICT}"
          "-artifact_prefix=${WORK}/artifacts/" "${WORK}/corpus"
  RESULT_VARIABLE result)
if(NOT result EQUAL 0)
  message(FATAL_ERROR "${FUZZER} failed (${result}); the input is in ${WORK}/artifacts")
endif()
