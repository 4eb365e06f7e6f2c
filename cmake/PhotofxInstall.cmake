# What `cmake --install` puts under the prefix: the shared library with its SONAME links, the
# public header, a pkg-config file and a CMake package giving the target photofx::photofx.
# The test programs, the examples and the internal static library are not installed.
include(CMakePackageConfigHelpers)

set(PHOTOFX_CMAKE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/photofx)

install(TARGETS photofx EXPORT photofxTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
  PUBLIC_HEADER DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(EXPORT photofxTargets NAMESPACE photofx:: DESTINATION ${PHOTOFX_CMAKE_DIR})

configure_package_config_file(cmake/photofxConfig.cmake.in
  ${CMAKE_CURRENT_BINARY_DIR}/photofxConfig.cmake
  INSTALL_DESTINATION ${PHOTOFX_CMAKE_DIR})
# The SONAME carries the major version, so the package promises the same compatibility.
write_basic_package_version_file(${CMAKE_CURRENT_BINARY_DIR}/photofxConfigVersion.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES
  ${CMAKE_CURRENT_BINARY_DIR}/photofxConfig.cmake
  ${CMAKE_CURRENT_BINARY_DIR}/photofxConfigVersion.cmake
  DESTINATION ${PHOTOFX_CMAKE_DIR})

# The pkg-config file finds the prefix from its own location, so an install moved elsewhere, or
# made with `cmake --install --prefix`, still points at itself.
foreach(kind LIBDIR INCLUDEDIR)
  if(IS_ABSOLUTE "${CMAKE_INSTALL_${kind}}")
    set(PHOTOFX_PC_${kind} "${CMAKE_INSTALL_${kind}}")
  else()
    set(PHOTOFX_PC_${kind} "\${prefix}/${CMAKE_INSTALL_${kind}}")
  endif()
endforeach()
if(IS_ABSOLUTE "${CMAKE_INSTALL_LIBDIR}")
  set(PHOTOFX_PC_PREFIX "${CMAKE_INSTALL_PREFIX}")
else()
  file(RELATIVE_PATH PHOTOFX_PC_UP "/root/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/root")
  string(REGEX REPLACE "/$" "" PHOTOFX_PC_UP "${PHOTOFX_PC_UP}")
  set(PHOTOFX_PC_PREFIX "\${pcfiledir}/${PHOTOFX_PC_UP}")
endif()
configure_file(cmake/photofx.pc.in ${CMAKE_CURRENT_BINARY_DIR}/photofx.pc @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/photofx.pc
  DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
