# Checks that the chosen parts fit together and finds what they need once, for every folder.
if(ZINMOX_BUILD_TOOLS AND NOT (ZINMOX_BUILD_SIM AND ZINMOX_BUILD_NET))
  message(FATAL_ERROR "ZINMOX_BUILD_TOOLS needs ZINMOX_BUILD_SIM and ZINMOX_BUILD_NET")
endif()
if(ZINMOX_BUILD_PYTHON AND NOT (ZINMOX_BUILD_SIM AND ZINMOX_BUILD_NET))
  message(FATAL_ERROR "ZINMOX_BUILD_PYTHON needs ZINMOX_BUILD_SIM and ZINMOX_BUILD_NET")
endif()
if(ZINMOX_BUILD_PYTHON AND ZINMOX_SANITIZE AND ZINMOX_BUILD_TESTS)
  message(FATAL_ERROR "The Python tests cannot load a module built with ZINMOX_SANITIZE into the "
    "interpreter; configure the sanitized build with -DZINMOX_BUILD_PYTHON=OFF")
endif()

if(ZINMOX_BUILD_PYTHON OR ZINMOX_BUILD_TESTS)
  # The module is installed for, packaged for and tested with one interpreter, and the pytest
  # suites (the module's, the dashboard's, the OpenOCD ones) run under it. On a Debian host that
  # is the system's /usr/bin/python3 (whose pytest and dist-packages the packages use), unless a
  # virtual environment is active or Python3_EXECUTABLE / Python3_ROOT_DIR name another.
  if(NOT DEFINED Python3_EXECUTABLE AND NOT DEFINED Python3_ROOT_DIR
     AND NOT DEFINED ENV{VIRTUAL_ENV} AND EXISTS /usr/bin/python3)
    set(Python3_ROOT_DIR /usr)
  endif()
  if(ZINMOX_BUILD_PYTHON)
    find_package(Python3 COMPONENTS Interpreter Development.Module REQUIRED)
    find_package(pybind11 CONFIG REQUIRED)
  else()
    find_package(Python3 COMPONENTS Interpreter REQUIRED)
  endif()
  if(ZINMOX_BUILD_TESTS)
    execute_process(COMMAND ${Python3_EXECUTABLE} -c "import pytest"
      RESULT_VARIABLE zin_no_pytest OUTPUT_QUIET ERROR_QUIET)
    if(zin_no_pytest)
      message(FATAL_ERROR "The Python tests need pytest for ${Python3_EXECUTABLE} "
        "(Debian: python3-pytest); or choose another interpreter with -DPython3_EXECUTABLE=..., "
        "or configure with -DZINMOX_BUILD_TESTS=OFF")
    endif()
  endif()
endif()
