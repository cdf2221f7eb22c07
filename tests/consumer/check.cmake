# Installs the build tree into a scratch prefix, then configures, builds and runs the consumer.
# The consumer passes no flags of its own: what a sanitized tree needs (its runtime) comes with
# the installed targets and the pkg-config file.
file(REMOVE_RECURSE ${WORK_DIR})
set(prefix ${WORK_DIR}/prefix)
execute_process(COMMAND ${CMAKE_COMMAND} --install ${BUILD_DIR} --config ${CONFIG} --prefix ${prefix}
  RESULT_VARIABLE rc OUTPUT_QUIET)
if(rc)
  message(FATAL_ERROR "install failed: ${rc}")
endif()
set(ENV{PKG_CONFIG_PATH} ${prefix}/${LIBDIR}/pkgconfig)
execute_process(COMMAND ${CMAKE_COMMAND} -S ${CONSUMER_SOURCE} -B ${WORK_DIR}/build
  -DCMAKE_PREFIX_PATH=${prefix} -DCMAKE_BUILD_TYPE=Release -DEXPECTED_VERSION=${VERSION}
  -DEXAMPLE_SOURCE=${EXAMPLE_SOURCE}
  RESULT_VARIABLE rc)
if(rc)
  message(FATAL_ERROR "consumer configure failed: ${rc}")
endif()
execute_process(COMMAND ${CMAKE_COMMAND} --build ${WORK_DIR}/build RESULT_VARIABLE rc)
if(rc)
  message(FATAL_ERROR "consumer build failed: ${rc}")
endif()
foreach(exe consumer_cmake consumer_pkgconfig consumer_info_example)
  execute_process(COMMAND ${WORK_DIR}/build/${exe} RESULT_VARIABLE rc)
  if(rc)
    message(FATAL_ERROR "${exe} failed: ${rc}")
  endif()
endforeach()
