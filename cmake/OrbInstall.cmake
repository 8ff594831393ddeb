# SPDX-License-Identifier: MIT
include(CMakePackageConfigHelpers)
set(orb_package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/OrbRTL)

install(TARGETS OrbRTL EXPORT OrbRTLTargets FILE_SET HEADERS)
if(TARGET orb-import)
  install(TARGETS orb-import orb-rename)
endif()
install(EXPORT OrbRTLTargets NAMESPACE OrbRTL:: DESTINATION ${orb_package_dir})

configure_package_config_file(cmake/OrbRTLConfig.cmake.in ${PROJECT_BINARY_DIR}/OrbRTLConfig.cmake
  INSTALL_DESTINATION ${orb_package_dir})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/OrbRTLConfigVersion.cmake
  COMPATIBILITY SameMinorVersion)
install(FILES
  ${PROJECT_BINARY_DIR}/OrbRTLConfig.cmake
  ${PROJECT_BINARY_DIR}/OrbRTLConfigVersion.cmake
  DESTINATION ${orb_package_dir})

# The .pc file finds the installation from where it lies, so that a moved one still works.
file(RELATIVE_PATH orb_prefix_from_pc /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
configure_file(cmake/OrbRTL.pc.in ${PROJECT_BINARY_DIR}/OrbRTL.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/OrbRTL.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
