# Debian packages, one per install component (cmake/ZinInstall.cmake), made with
# `cpack -G DEB` in the build folder. The framework stand-ins are a package of their own, which the
# others only recommend: a host that has the real framework installs libZinMOX without them.
set(CPACK_PACKAGE_NAME zinmox)
set(CPACK_PACKAGE_VENDOR "libZinMOX developers")
set(CPACK_PACKAGE_CONTACT "libZinMOX developers <zinmox@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "${PROJECT_DESCRIPTION}")
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_GENERATOR DEB)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_STRIP_FILES ON)

set(CPACK_COMPONENTS_ALL framework framework-dev runtime dev)
if(TARGET zinmox)
  list(APPEND CPACK_COMPONENTS_ALL tool)
endif()
if(TARGET zinmox_python)
  list(APPEND CPACK_COMPONENTS_ALL python)
endif()

set(zin_so libzinmox${PROJECT_VERSION_MAJOR})
set(zin_v "(= ${PROJECT_VERSION})")
set(CPACK_DEBIAN_FRAMEWORK_PACKAGE_NAME libzinmox-framework)
set(CPACK_COMPONENT_FRAMEWORK_DESCRIPTION "Stand-ins for the framework libraries of libZinMOX
 libZinCore, libZinJtag and libZinUtil as libZinMOX calls them, in a private folder
 (/usr/lib/.../zinmox-framework) so that they never clash with an installed framework.")
set(CPACK_DEBIAN_FRAMEWORK-DEV_PACKAGE_NAME libzinmox-framework-dev)
set(CPACK_DEBIAN_FRAMEWORK-DEV_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_FRAMEWORK-DEV_PACKAGE_DEPENDS "libzinmox-framework ${zin_v}")
set(CPACK_COMPONENT_FRAMEWORK-DEV_DESCRIPTION "Headers of the libZinMOX framework stand-ins
 The framework's session, core and conversion headers, the link names of the stand-in
 libraries and the pkg-config file zinmox-framework.")
set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME ${zin_so})
set(CPACK_DEBIAN_RUNTIME_PACKAGE_RECOMMENDS "libzinmox-framework ${zin_v}")
set(CPACK_COMPONENT_RUNTIME_DESCRIPTION "${PROJECT_DESCRIPTION}
 libZinMOX names the port bits of MOX debug cores, writes outputs and reads inputs; libZinSim
 simulates a target and libZinNet serves one target over TCP.")
set(CPACK_DEBIAN_DEV_PACKAGE_NAME libzinmox-dev)
set(CPACK_DEBIAN_DEV_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEV_PACKAGE_DEPENDS "${zin_so} ${zin_v}, libzinmox-framework-dev ${zin_v}")
set(CPACK_COMPONENT_DEV_DESCRIPTION "Development files of libZinMOX
 Headers, the CMake package ZinMOX and the pkg-config file zinmox.")
set(CPACK_DEBIAN_TOOL_PACKAGE_NAME zinmox)
set(CPACK_DEBIAN_TOOL_PACKAGE_SECTION devel)
set(CPACK_DEBIAN_TOOL_PACKAGE_RECOMMENDS "libzinmox-framework ${zin_v}")
set(CPACK_COMPONENT_TOOL_DESCRIPTION "Command-line tool for MOX debug cores
 zinmox scans a target, names port bits, drives outputs, reads and watches inputs, and serves a
 simulated target over TCP.")
set(CPACK_DEBIAN_PYTHON_PACKAGE_NAME python3-zinmox)
set(CPACK_DEBIAN_PYTHON_PACKAGE_SECTION python)
set(CPACK_DEBIAN_PYTHON_PACKAGE_RECOMMENDS "libzinmox-framework ${zin_v}")
set(CPACK_COMPONENT_PYTHON_DESCRIPTION "Python module for MOX debug cores
 The zinmox module: sessions, named signals, pulse trains and the simulated target for test
 benches.")

# The packages' dependencies on the system's libraries come from dpkg-shlibdeps, run when the
# packages are made (cmake/ZinPackageDepends.cmake); these are their dependencies on each other.
set(ZIN_PACKAGE_BINARIES_RUNTIME "")
foreach(target ${ZIN_LIBRARY_TARGETS})
  list(APPEND ZIN_PACKAGE_BINARIES_RUNTIME $<TARGET_FILE:${target}>)
endforeach()
set(ZIN_PACKAGE_BINARIES_FRAMEWORK
  $<TARGET_FILE:ZinUtil> $<TARGET_FILE:ZinJtag> $<TARGET_FILE:ZinCore>)
set(ZIN_PACKAGE_OWN_RUNTIME "")
set(ZIN_PACKAGE_OWN_FRAMEWORK "")
set(ZIN_PACKAGE_OWN_TOOL "${zin_so} ${zin_v}")
set(ZIN_PACKAGE_OWN_PYTHON "${zin_so} ${zin_v}")
if(TARGET zinmox)
  set(ZIN_PACKAGE_BINARIES_TOOL $<TARGET_FILE:zinmox>)
endif()
if(TARGET zinmox_python)
  set(ZIN_PACKAGE_BINARIES_PYTHON $<TARGET_FILE:zinmox_python>)
  math(EXPR zin_py_next "${Python3_VERSION_MINOR} + 1")
  string(APPEND ZIN_PACKAGE_OWN_PYTHON ", python3 (>= ${Python3_VERSION_MAJOR}.${Python3_VERSION_MINOR}~)"
    ", python3 (<< ${Python3_VERSION_MAJOR}.${zin_py_next})")
endif()
configure_file(${PROJECT_SOURCE_DIR}/cmake/ZinPackageDepends.cmake.in
  ${PROJECT_BINARY_DIR}/ZinPackageDepends.cmake.in @ONLY)
# One file per configuration (multi-configuration generators package the one cpack -C names).
file(GENERATE OUTPUT ${PROJECT_BINARY_DIR}/ZinPackageDepends-$<CONFIG>.cmake
  INPUT ${PROJECT_BINARY_DIR}/ZinPackageDepends.cmake.in)
string(REPLACE "@DIR@" "${PROJECT_BINARY_DIR}" zin_depends_loader [=[
if(CPACK_BUILD_CONFIG)
  include("@DIR@/ZinPackageDepends-${CPACK_BUILD_CONFIG}.cmake")
else()
  file(GLOB zin_depends "@DIR@/ZinPackageDepends-*.cmake")
  list(GET zin_depends 0 zin_depends)
  include("${zin_depends}")
endif()
]=])
file(WRITE ${PROJECT_BINARY_DIR}/ZinPackageDepends.cmake "${zin_depends_loader}")
set(CPACK_PROJECT_CONFIG_FILE ${PROJECT_BINARY_DIR}/ZinPackageDepends.cmake)
include(CPack)
