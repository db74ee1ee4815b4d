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

configure_file(cmake/VeltmarquistDLL.pc.in ${PROJECT_BINARY_DIR}/VeltmarquistDLL.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/VeltmarquistDLL.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
