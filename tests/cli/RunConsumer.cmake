# Installs the project into a scratch prefix, then builds and runs the
# consumer example against it twice: through find_package(tsd) and through
# pkg-config. The installed tool must run too.
#
#   cmake -DBUILD_DIR=<this build> -DSOURCE_DIR=<project> -DWORK=<scratch>
#         -DCXX=<compiler> -DFLAGS=<extra compile and link flags, separated by |>
#         -DVERSION=<project version> [-DPKG_CONFIG=<pkg-config>] -P RunConsumer.cmake
cmake_minimum_required(VERSION 3.25)

function(run)
  execute_process(COMMAND ${ARGN} RESULT_VARIABLE status OUTPUT_VARIABLE out ERROR_VARIABLE err)
  if(NOT status EQUAL 0)
    string(REPLACE ";" " " command "${ARGN}")
    message(FATAL_ERROR "failed (${status}): ${command}\n${out}${err}")
  endif()
  set(out "${out}" PARENT_SCOPE)
endfunction()

function(expect_consumer_output text)
  foreach(line "TIMEGRP all_regs=regs" "TIMESPEC TS01=PERIOD:all_regs:10000:pS:HIGH:50%"
               "u1/q_reg TS_TNM=regs")
    string(FIND "${text}" "${line}" at)
    if(at EQUAL -1)
      message(FATAL_ERROR "the consumer did not print \"${line}\":\n${text}")
    endif()
  endforeach()
endfunction()

string(REPLACE "|" ";" flags "${FLAGS}")
string(REPLACE "|" " " flagString "${FLAGS}")
set(prefix ${WORK}/prefix)
file(REMOVE_RECURSE ${WORK})

run(${CMAKE_COMMAND} --install ${BUILD_DIR} --prefix ${prefix})
foreach(file include/tsd/Tsd.h include/tsd/host/Messages.h bin/tsd)
  if(NOT EXISTS ${prefix}/${file})
    message(FATAL_ERROR "the install has no ${file}")
  endif()
endforeach()

# find_package(tsd)
run(${CMAKE_COMMAND} -S ${SOURCE_DIR}/examples/consumer -B ${WORK}/build -G Ninja
    -DCMAKE_BUILD_TYPE=Debug -DCMAKE_CXX_COMPILER=${CXX} -DCMAKE_PREFIX_PATH=${prefix}
    "-DCMAKE_CXX_FLAGS=${flagString}" "-DCMAKE_EXE_LINKER_FLAGS=${flagString}")
run(${CMAKE_COMMAND} --build ${WORK}/build)
run(${WORK}/build/tsd_consumer)
expect_consumer_output("${out}")

# pkg-config, with the .pc file found where the install put it
if(PKG_CONFIG)
  file(GLOB_RECURSE pcFiles ${prefix}/*/tsd.pc)
  list(LENGTH pcFiles pcCount)
  if(NOT pcCount EQUAL 1)
    message(FATAL_ERROR "expected one tsd.pc under ${prefix}, found: ${pcFiles}")
  endif()
  get_filename_component(pcDir ${pcFiles} DIRECTORY)
  set(ENV{PKG_CONFIG_PATH} ${pcDir})
  run(${PKG_CONFIG} --modversion tsd)
  string(STRIP "${out}" modversion)
  if(NOT modversion STREQUAL VERSION)
    message(FATAL_ERROR "pkg-config says version ${modversion}, the project is ${VERSION}")
  endif()
  run(${PKG_CONFIG} --cflags --libs tsd)
  separate_arguments(pcFlags UNIX_COMMAND "${out}")
  run(${CXX} -std=c++17 ${flags} ${SOURCE_DIR}/examples/consumer/main.cpp ${pcFlags}
      -o ${WORK}/tsd_consumer_pc)
  run(${WORK}/tsd_consumer_pc)
  expect_consumer_output("${out}")
endif()

# The installed tool
run(${prefix}/bin/tsd --version)
if(NOT out STREQUAL "tsd ${VERSION}\n")
  message(FATAL_ERROR "the installed tsd says: ${out}")
endif()
run(${prefix}/bin/tsd check ${SOURCE_DIR}/examples/demo.props)
