# ZINMOX_SANITIZE: the sanitizers every target of the project is compiled and linked with.
# A sanitized shared library needs the sanitizer's runtime in the program that loads it, so the
# installed libraries pass the link flag on to their consumers (ZIN_SANITIZE_LINK_FLAGS, also
# written into the pkg-config file).
set(ZIN_SANITIZE_LINK_FLAGS "")
if(ZINMOX_SANITIZE)
  set(zin_sanitizers ${ZINMOX_SANITIZE})
  list(SORT zin_sanitizers)
  if(NOT zin_sanitizers STREQUAL "address;undefined" AND NOT zin_sanitizers STREQUAL "address"
     AND NOT zin_sanitizers STREQUAL "undefined" AND NOT zin_sanitizers STREQUAL "thread")
    message(FATAL_ERROR "ZINMOX_SANITIZE=\"${ZINMOX_SANITIZE}\": expected \"address;undefined\", "
      "\"address\", \"undefined\" or \"thread\"")
  endif()
  list(JOIN zin_sanitizers "," zin_sanitize_list)
  set(ZIN_SANITIZE_LINK_FLAGS "-fsanitize=${zin_sanitize_list}")
  add_compile_options(-fsanitize=${zin_sanitize_list} -fno-omit-frame-pointer)
  if(NOT zin_sanitizers STREQUAL "thread")
    add_compile_options(-fno-sanitize-recover=all)
  endif()
  add_link_options(${ZIN_SANITIZE_LINK_FLAGS})
  if(zin_sanitizers STREQUAL "thread" AND CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    # g++ warns that the thread sanitizer does not model std::atomic_thread_fence.
    add_compile_options($<$<COMPILE_LANGUAGE:CXX>:-Wno-tsan>)
  endif()
endif()
# The fuzzers need coverage instrumentation of everything they reach.
if(ZINMOX_BUILD_FUZZERS)
  if(NOT CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    message(FATAL_ERROR "ZINMOX_BUILD_FUZZERS needs clang for libFuzzer (cmake --preset fuzz)")
  endif()
  add_compile_options(-fsanitize=fuzzer-no-link)
endif()
