# Warnings that every target of this project is built with; ZINMOX_WERROR makes them errors.
add_library(zin_warnings INTERFACE)
target_compile_options(zin_warnings INTERFACE
  $<$<COMPILE_LANGUAGE:CXX>:-Wall -Wextra -Wpedantic>
  $<$<COMPILE_LANGUAGE:C>:-Wall -Wextra -Wpedantic>
  $<$<BOOL:${ZINMOX_WERROR}>:-Werror>
  # g++ 12 reports -Wrestrict on std::string concatenation of a literal and a temporary in
  # optimised builds, where no overlapping copy exists (a known false positive of that release).
  $<$<CXX_COMPILER_ID:GNU>:-Wno-restrict>)

# zin_add_shared_library(NAME SOURCES...): a shared library with a SOVERSION, a ZinMOX:: alias,
# hidden visibility and the public include tree. Consumers get the C++ standard that its public
# headers need through a compile feature (C++11 unless raised, see cmake/ZinInstall.cmake); a
# sanitized build passes its runtime on to them.
function(zin_add_shared_library name)
  add_library(${name} SHARED ${ARGN})
  add_library(ZinMOX::${name} ALIAS ${name})
  set_target_properties(${name} PROPERTIES
    VERSION ${PROJECT_VERSION} SOVERSION ${PROJECT_VERSION_MAJOR}
    BUILD_RPATH "${PROJECT_BINARY_DIR}/lib")
  target_include_directories(${name} PUBLIC
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>
    $<BUILD_INTERFACE:${ZIN_GENERATED_INCLUDE_DIR}>
    $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
  target_compile_features(${name} PUBLIC cxx_std_11)
  if(ZIN_SANITIZE_LINK_FLAGS)
    target_link_options(${name} INTERFACE ${ZIN_SANITIZE_LINK_FLAGS})
  endif()
  target_link_libraries(${name} PRIVATE zin_warnings)
endfunction()
