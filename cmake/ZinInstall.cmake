# Installation: libraries, the public include tree, a CMake package and a pkg-config file.
include(CMakePackageConfigHelpers)

install(TARGETS ZinUtil ZinJtag ZinCore ZinMOX ZinSim ZinNet ZinOpenOcd EXPORT ZinMOXTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
  ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR}
  RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR}
  INCLUDES DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/ZinRT ${PROJECT_SOURCE_DIR}/include/ZinMOX
  ${PROJECT_SOURCE_DIR}/include/ZinSim ${PROJECT_SOURCE_DIR}/include/ZinNet
  ${PROJECT_SOURCE_DIR}/include/ZinOpenOcd
  DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})

set(ZIN_CMAKE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/ZinMOX)
install(EXPORT ZinMOXTargets NAMESPACE ZinMOX:: DESTINATION ${ZIN_CMAKE_DIR})
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/ZinMOXConfig.cmake.in
  ${CMAKE_BINARY_DIR}/ZinMOXConfig.cmake INSTALL_DESTINATION ${ZIN_CMAKE_DIR})
write_basic_package_version_file(${CMAKE_BINARY_DIR}/ZinMOXConfigVersion.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_BINARY_DIR}/ZinMOXConfig.cmake ${CMAKE_BINARY_DIR}/ZinMOXConfigVersion.cmake
  DESTINATION ${ZIN_CMAKE_DIR})

# The pkg-config file finds the prefix relative to its own folder, so the tree can be moved.
file(RELATIVE_PATH ZIN_PC_TO_PREFIX "/prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/prefix")
configure_file(${PROJECT_SOURCE_DIR}/cmake/zinmox.pc.in ${CMAKE_BINARY_DIR}/zinmox.pc @ONLY)
install(FILES ${CMAKE_BINARY_DIR}/zinmox.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
