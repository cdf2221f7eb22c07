# Warnings that every target of this project is built with.
add_library(zin_warnings INTERFACE)
target_compile_options(zin_warnings INTERFACE
  $<$<COMPILE_LANGUAGE:CXX>:-Wall -Wextra -Werror -Wpedantic>
  $<$<COMPILE_LANGUAGE:C>:-Wall -Wextra -Werror -Wpedantic>
  # g++ 12 reports -Wrestrict on std::string concatenation of a literal and a temporary in
  # optimised builds, where no overlapping copy exists (a known false positive of that release).
  $<$<CXX_COMPILER_ID:GNU>:-Wno-restrict>)

# zin_add_shared_library(NAME SOURCES...): a shared library with a SOVERSION, a ZinMOX:: alias,
# hidden visibility and the public include tree.
function(zin_add_shared_library name)
  add_library(${name} SHARED ${ARGN})
  add_library(ZinMOX::${name} ALIAS ${name})
  set_target_properties(${name} PROPERTIES
    VERSION ${PROJECT_VERSION} SOVERSION ${PROJECT_VERSION_MAJOR}
    BUILD_RPATH "${CMAKE_BINARY_DIR}/lib")
  target_include_directories(${name} PUBLIC
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>
    $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
  target_link_libraries(${name} PRIVATE zin_warnings)
endfunction()
