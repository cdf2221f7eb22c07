# The version header, generated from the project's version: the tool's --version, the Python
# module's __version__ and the library's file version all come from project(VERSION).
set(ZIN_GENERATED_INCLUDE_DIR ${PROJECT_BINARY_DIR}/include)
configure_file(${PROJECT_SOURCE_DIR}/cmake/ZinMOX_Version.h.in
  ${ZIN_GENERATED_INCLUDE_DIR}/ZinMOX/ZinMOX_Version.h @ONLY)
