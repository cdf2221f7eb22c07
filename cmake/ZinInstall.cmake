# Installation, split into components that the packages follow (cmake/ZinPackage.cmake):
#   framework      the framework stand-ins' libraries, in <libdir>/zinmox-framework
#   framework-dev  their headers (<includedir>/zinmox-framework), link names, pkg-config file
#   runtime        libZinMOX, libZinSim, libZinNet
#   dev            the library's headers, link names, the CMake package, the pkg-config file
#   tool           the zinmox tool and its manual page
#   python         the zinmox Python module and its type stub
include(CMakePackageConfigHelpers)

set(ZIN_FRAMEWORK_TARGETS ZinUtil ZinJtag ZinCore)
set(ZIN_LIBRARY_TARGETS ZinMOX)
set(ZIN_HEADER_DIRS ${PROJECT_SOURCE_DIR}/include/ZinMOX)
foreach(part ZinSim ZinNet)
  if(TARGET ${part})
    list(APPEND ZIN_LIBRARY_TARGETS ${part})
    list(APPEND ZIN_HEADER_DIRS ${PROJECT_SOURCE_DIR}/include/${part})
  endif()
endforeach()

foreach(target ${ZIN_FRAMEWORK_TARGETS})
  target_include_directories(${target} INTERFACE $<INSTALL_INTERFACE:${ZIN_FRAMEWORK_INCLUDEDIR}>)
  zin_install_rpath(${target} ${ZIN_FRAMEWORK_LIBDIR})
endforeach()
foreach(target ${ZIN_LIBRARY_TARGETS})
  zin_install_rpath(${target} ${CMAKE_INSTALL_LIBDIR})
endforeach()
# The simulated target's and the network library's headers use std::string_view and std::optional.
foreach(target ZinSim ZinNet)
  if(TARGET ${target})
    target_compile_features(${target} PUBLIC cxx_std_17)
  endif()
endforeach()

install(TARGETS ${ZIN_FRAMEWORK_TARGETS} EXPORT ZinMOXTargets
  LIBRARY DESTINATION ${ZIN_FRAMEWORK_LIBDIR} COMPONENT framework
    NAMELINK_COMPONENT framework-dev)
install(TARGETS ${ZIN_LIBRARY_TARGETS} EXPORT ZinMOXTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT dev
  INCLUDES DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/ZinRT DESTINATION ${ZIN_FRAMEWORK_INCLUDEDIR}
  COMPONENT framework-dev)
install(DIRECTORY ${ZIN_HEADER_DIRS} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT dev)
install(FILES ${ZIN_GENERATED_INCLUDE_DIR}/ZinMOX/ZinMOX_Version.h
  DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/ZinMOX COMPONENT dev)

set(ZIN_CMAKE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/ZinMOX)
install(EXPORT ZinMOXTargets NAMESPACE ZinMOX:: DESTINATION ${ZIN_CMAKE_DIR} COMPONENT dev)
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/ZinMOXConfig.cmake.in
  ${PROJECT_BINARY_DIR}/ZinMOXConfig.cmake INSTALL_DESTINATION ${ZIN_CMAKE_DIR})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/ZinMOXConfigVersion.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/ZinMOXConfig.cmake ${PROJECT_BINARY_DIR}/ZinMOXConfigVersion.cmake
  DESTINATION ${ZIN_CMAKE_DIR} COMPONENT dev)

# The pkg-config files find the prefix relative to their own folder, so the tree can be moved.
file(RELATIVE_PATH ZIN_PC_TO_PREFIX "/prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/prefix")
configure_file(${PROJECT_SOURCE_DIR}/cmake/zinmox.pc.in ${PROJECT_BINARY_DIR}/zinmox.pc @ONLY)
configure_file(${PROJECT_SOURCE_DIR}/cmake/zinmox-framework.pc.in
  ${PROJECT_BINARY_DIR}/zinmox-framework.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/zinmox.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig
  COMPONENT dev)
install(FILES ${PROJECT_BINARY_DIR}/zinmox-framework.pc
  DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT framework-dev)

if(TARGET zinmox)
  zin_install_rpath(zinmox ${CMAKE_INSTALL_BINDIR})
  install(TARGETS zinmox RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT tool)
  include(cmake/ZinManPage.cmake)
endif()

if(TARGET zinmox_python)
  zin_install_rpath(zinmox_python ${ZINMOX_PYTHON_INSTALL_DIR})
  install(TARGETS zinmox_python LIBRARY DESTINATION ${ZINMOX_PYTHON_INSTALL_DIR} COMPONENT python)
  install(FILES ${PROJECT_SOURCE_DIR}/python/zinmox.pyi DESTINATION ${ZINMOX_PYTHON_INSTALL_DIR}
    COMPONENT python)
endif()
