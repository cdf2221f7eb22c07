# zin_verilate(TARGET PREFIX TOP [PARAMS -GNAME=VALUE ...]): verilates the RTL module TOP (file
# rtl/TOP.v, other modules found by name in rtl/) into TARGET as the C++ class PREFIX. The
# generated headers and Verilator's own are system includes, so our warnings stay strict for our
# sources while the generated code builds with modest optimisation.
find_package(verilator 5 REQUIRED HINTS $ENV{VERILATOR_ROOT} /usr/share/verilator)
find_package(Threads REQUIRED)
set(ZINMOX_RTL_DIR ${PROJECT_SOURCE_DIR}/rtl)

function(zin_verilate target prefix top)
  cmake_parse_arguments(ZV "" "" "PARAMS" ${ARGN})
  set(dir ${CMAKE_CURRENT_BINARY_DIR}/${prefix})
  verilate(${target} SOURCES ${ZINMOX_RTL_DIR}/${top}.v TOP_MODULE ${top} PREFIX ${prefix}
    DIRECTORY ${dir} VERILATOR_ARGS -y ${ZINMOX_RTL_DIR} ${ZV_PARAMS}
    OPT_SLOW -O0 OPT_FAST -O1 OPT_GLOBAL -O1)
  target_include_directories(${target} SYSTEM PRIVATE ${dir} ${VERILATOR_ROOT}/include
    ${VERILATOR_ROOT}/include/vltstd)
  target_link_libraries(${target} PRIVATE Threads::Threads)
endfunction()
