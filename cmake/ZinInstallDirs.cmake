# Where the parts are installed, and how the installed binaries find the libraries.
#
# The framework stand-ins keep the framework's library names (libZinMOX is linked against those
# names, so a host's own framework can take their place), but are installed in a private folder,
# <libdir>/zinmox-framework, with their headers under <includedir>/zinmox-framework: they never
# overwrite or shadow a real framework installed on the same host.
set(ZIN_FRAMEWORK_LIBDIR ${CMAKE_INSTALL_LIBDIR}/zinmox-framework)
set(ZIN_FRAMEWORK_INCLUDEDIR ${CMAKE_INSTALL_INCLUDEDIR}/zinmox-framework)

# The Python module's folder, relative to the prefix. With Debian's interpreter this is the
# dist-packages folder of the system layout (lib/python3/dist-packages, where /usr/bin/python3
# looks for modules of the /usr prefix); elsewhere the interpreter's own platform library folder.
if(ZINMOX_BUILD_PYTHON AND NOT DEFINED ZINMOX_PYTHON_INSTALL_DIR)
  execute_process(COMMAND ${Python3_EXECUTABLE} -c [=[
import os, sysconfig
scheme = "deb_system" if "deb_system" in sysconfig.get_scheme_names() else "posix_prefix"
path = sysconfig.get_path("platlib", scheme, vars={"base": "/P", "platbase": "/P"})
print(os.path.relpath(path, "/P"), end="")
]=] OUTPUT_VARIABLE zin_python_dir RESULT_VARIABLE rc)
  if(rc)
    message(FATAL_ERROR "could not ask ${Python3_EXECUTABLE} for its module folder")
  endif()
  set(ZINMOX_PYTHON_INSTALL_DIR ${zin_python_dir} CACHE STRING
    "Folder of the installed Python module, relative to the install prefix")
endif()

# zin_install_rpath(TARGET DIR): the installed TARGET, placed in DIR (relative to the prefix),
# finds the libraries and the framework stand-ins relative to itself.
function(zin_install_rpath target dir)
  file(RELATIVE_PATH to_lib /prefix/${dir} /prefix/${CMAKE_INSTALL_LIBDIR})
  file(RELATIVE_PATH to_framework /prefix/${dir} /prefix/${ZIN_FRAMEWORK_LIBDIR})
  set(rpath "")
  foreach(rel ${to_lib} ${to_framework})
    if(rel STREQUAL "")
      list(APPEND rpath "$ORIGIN")
    else()
      list(APPEND rpath "$ORIGIN/${rel}")
    endif()
  endforeach()
  list(REMOVE_DUPLICATES rpath)
  set_target_properties(${target} PROPERTIES INSTALL_RPATH "${rpath}")
endfunction()
