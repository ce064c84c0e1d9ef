# What `cmake --install` puts in the prefix besides the targets themselves:
# the headers, a CMake package (find_package(tsd) gives tsd::tsd) and a
# pkg-config file.
include(CMakePackageConfigHelpers)

set(TSD_INSTALL_CMAKEDIR ${CMAKE_INSTALL_LIBDIR}/cmake/tsd)

install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/tsd
        DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}
        FILES_MATCHING PATTERN "*.h")

install(EXPORT tsdTargets
        NAMESPACE tsd::
        DESTINATION ${TSD_INSTALL_CMAKEDIR})

configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/tsdConfig.cmake.in
                              ${PROJECT_BINARY_DIR}/tsdConfig.cmake
                              INSTALL_DESTINATION ${TSD_INSTALL_CMAKEDIR})
# Before 1.0 a new minor version may break the interface.
write_basic_package_version_file(${PROJECT_BINARY_DIR}/tsdConfigVersion.cmake
                                 COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/tsdConfig.cmake ${PROJECT_BINARY_DIR}/tsdConfigVersion.cmake
        DESTINATION ${TSD_INSTALL_CMAKEDIR})

# The .pc file finds the prefix from its own place, so an install with
# `cmake --install --prefix DIR` anywhere is found correctly.
set(_tsd_pc_dir ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
if(IS_ABSOLUTE "${CMAKE_INSTALL_LIBDIR}" OR IS_ABSOLUTE "${CMAKE_INSTALL_INCLUDEDIR}")
  set(TSD_PC_PREFIX "${CMAKE_INSTALL_PREFIX}")
  set(TSD_PC_LIBDIR "${CMAKE_INSTALL_FULL_LIBDIR}")
  set(TSD_PC_INCLUDEDIR "${CMAKE_INSTALL_FULL_INCLUDEDIR}")
else()
  file(RELATIVE_PATH _tsd_pc_up "/prefix/${_tsd_pc_dir}" "/prefix")
  string(REGEX REPLACE "/$" "" _tsd_pc_up "${_tsd_pc_up}")
  set(TSD_PC_PREFIX "\${pcfiledir}/${_tsd_pc_up}")
  set(TSD_PC_LIBDIR "\${prefix}/${CMAKE_INSTALL_LIBDIR}")
  set(TSD_PC_INCLUDEDIR "\${prefix}/${CMAKE_INSTALL_INCLUDEDIR}")
endif()
configure_file(${CMAKE_CURRENT_LIST_DIR}/tsd.pc.in ${PROJECT_BINARY_DIR}/tsd.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/tsd.pc DESTINATION ${_tsd_pc_dir})
