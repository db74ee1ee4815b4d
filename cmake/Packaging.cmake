# Install rules, the CMake package (find_package(VeltmarquistDLL) gives the
# imported target Veltmarquist::VeltmarquistDLL) and a pkg-config file.
include(CMakePackageConfigHelpers)

install(TARGETS VeltmarquistDLL EXPORT VeltmarquistDLLTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
  ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR}
  RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR}
  PUBLIC_HEADER DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/veltmarquist)

set(VELTMARQUIST_CMAKE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/VeltmarquistDLL)
install(EXPORT VeltmarquistDLLTargets NAMESPACE Veltmarquist:: DESTINATION ${VELTMARQUIST_CMAKE_DIR})
export(EXPORT VeltmarquistDLLTargets NAMESPACE Veltmarquist::
  FILE ${PROJECT_BINARY_DIR}/VeltmarquistDLLTargets.cmake)

configure_package_config_file(cmake/VeltmarquistDLLConfig.cmake.in
  ${PROJECT_BINARY_DIR}/VeltmarquistDLLConfig.cmake INSTALL_DESTINATION ${VELTMARQUIST_CMAKE_DIR})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/VeltmarquistDLLConfigVersion.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/VeltmarquistDLLConfig.cmake
  ${PROJECT_BINARY_DIR}/VeltmarquistDLLConfigVersion.cmake DESTINATION ${VELTMARQUIST_CMAKE_DIR})

# The .pc file finds its prefix from its own place, so the package can be
# installed with any --prefix.
file(RELATIVE_PATH VELTMARQUIST_PC_TO_PREFIX ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
string(REGEX REPLACE "/$" "" VELTMARQUIST_PC_TO_PREFIX "${VELTMARQUIST_PC_TO_PREFIX}")
configure_file(cmake/VeltmarquistDLL.pc.in ${PROJECT_BINARY_DIR}/VeltmarquistDLL.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/VeltmarquistDLL.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
