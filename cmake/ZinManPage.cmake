# The zinmox manual page, made by help2man from the tool's own --help and --version (so it never
# drifts from the tool), with the subcommands and examples from cmake/zinmox.h2m, and installed
# compressed, as Debian expects.
find_program(ZIN_HELP2MAN help2man)
find_program(ZIN_GZIP gzip)
if(NOT ZIN_HELP2MAN OR NOT ZIN_GZIP)
  message(STATUS "help2man or gzip not found: the zinmox manual page is not built")
  return()
endif()
set(zin_man ${PROJECT_BINARY_DIR}/man/zinmox.1)
add_custom_command(OUTPUT ${zin_man}.gz
  COMMAND ${CMAKE_COMMAND} -E make_directory ${PROJECT_BINARY_DIR}/man
  COMMAND ${ZIN_HELP2MAN} --no-info --section=1 "--source=libZinMOX ${PROJECT_VERSION}"
          "--name=drive and read the MOX debug cores of a target"
          --include=${PROJECT_SOURCE_DIR}/cmake/zinmox.h2m --output=${zin_man} $<TARGET_FILE:zinmox>
  COMMAND ${ZIN_GZIP} -9nf ${zin_man}
  DEPENDS zinmox ${PROJECT_SOURCE_DIR}/cmake/zinmox.h2m
  COMMENT "Writing the zinmox manual page"
  VERBATIM)
add_custom_target(zinmox_manpage ALL DEPENDS ${zin_man}.gz)
install(FILES ${zin_man}.gz DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT tool)
