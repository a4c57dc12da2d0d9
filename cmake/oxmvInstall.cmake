# Installs the libraries, their headers and the command, and what others find them by: a CMake
# package and a pkg-config file. Both find their prefix from where they stand, so the installed tree
# may be moved.
include(CMakePackageConfigHelpers)

set(package_dir "${CMAKE_INSTALL_LIBDIR}/cmake/oxmv")
set(pkgconfig_dir "${CMAKE_INSTALL_LIBDIR}/pkgconfig")

install(TARGETS oxmv_core oxmv
  EXPORT oxmvTargets
  FILE_SET HEADERS
  FILE_SET generated)
install(EXPORT oxmvTargets NAMESPACE oxmv:: DESTINATION "${package_dir}")

configure_package_config_file(cmake/oxmvConfig.cmake.in
  "${PROJECT_BINARY_DIR}/oxmvConfig.cmake"
  INSTALL_DESTINATION "${package_dir}")
# Until 1.0 any minor version may change the interface.
write_basic_package_version_file("${PROJECT_BINARY_DIR}/oxmvConfigVersion.cmake"
  COMPATIBILITY SameMinorVersion)
install(FILES
  "${PROJECT_BINARY_DIR}/oxmvConfig.cmake"
  "${PROJECT_BINARY_DIR}/oxmvConfigVersion.cmake"
  DESTINATION "${package_dir}")

# From the folder of the file back to the prefix: "../.." for lib, one more for a multiarch lib.
file(RELATIVE_PATH prefix_from_pkgconfig
  "${CMAKE_INSTALL_PREFIX}/${pkgconfig_dir}" "${CMAKE_INSTALL_PREFIX}")
string(REGEX REPLACE "/$" "" prefix_from_pkgconfig "${prefix_from_pkgconfig}")
configure_file(packaging/oxmv.pc.in "${PROJECT_BINARY_DIR}/oxmv.pc" @ONLY)
install(FILES "${PROJECT_BINARY_DIR}/oxmv.pc" DESTINATION "${pkgconfig_dir}")

if(OXMV_BUILD_CLI)
  install(TARGETS oxmv_cli)
endif()

# Shared libraries are found beside each other and from the command, wherever the tree stands.
if(BUILD_SHARED_LIBS)
  set_target_properties(oxmv PROPERTIES INSTALL_RPATH "$ORIGIN")
  if(OXMV_BUILD_CLI)
    file(RELATIVE_PATH lib_from_bin
      "${CMAKE_INSTALL_PREFIX}/${CMAKE_INSTALL_BINDIR}"
      "${CMAKE_INSTALL_PREFIX}/${CMAKE_INSTALL_LIBDIR}")
    set_target_properties(oxmv_cli PROPERTIES INSTALL_RPATH "$ORIGIN/${lib_from_bin}")
  endif()
endif()
