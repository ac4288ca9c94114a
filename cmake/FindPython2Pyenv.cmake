# Finds the CPython 2.7 interpreter the module is built for: the one named by
# the environment variable PYTHON2, else pyenv's 2.7.18. Defines PYTHON2_EXECUTABLE,
# the imported target python2::headers (and python2::embed for tests that host an
# interpreter), and PYTHON2_PLATLIB and PYTHON2_PURELIB: the interpreter's
# site-packages for extension and pure modules, relative to its prefix. Unless
# CMAKE_INSTALL_PREFIX is given, it becomes that prefix, so that an install
# lands where the interpreter looks.
set(_py2_candidates "")
if(DEFINED ENV{PYTHON2} AND NOT "$ENV{PYTHON2}" STREQUAL "")
  list(APPEND _py2_candidates "$ENV{PYTHON2}")
else()
  execute_process(COMMAND pyenv root OUTPUT_VARIABLE _pyenv_root
                  OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET)
  if(NOT _pyenv_root)
    set(_pyenv_root "$ENV{HOME}/.pyenv")
  endif()
  list(APPEND _py2_candidates "${_pyenv_root}/versions/2.7.18/bin/python2.7"
                              "/root/.pyenv/versions/2.7.18/bin/python2.7")
endif()

set(PYTHON2_EXECUTABLE "")
foreach(_cand IN LISTS _py2_candidates)
  if(EXISTS "${_cand}")
    set(PYTHON2_EXECUTABLE "${_cand}")
    break()
  endif()
endforeach()
if(NOT PYTHON2_EXECUTABLE)
  message(FATAL_ERROR
    "No Python 2.7 interpreter found (looked for: ${_py2_candidates}). "
    "Install pyenv's 2.7.18 or set PYTHON2 to a Python 2.7 interpreter with a shared libpython.")
endif()

execute_process(
  COMMAND "${PYTHON2_EXECUTABLE}" -c
    "import os, sys, sysconfig; assert sys.version_info[:2] == (2, 7); paths = sysconfig.get_paths(); print(paths['include']); print(sysconfig.get_config_var('LIBDIR')); print(sysconfig.get_config_var('LDLIBRARY')); print(sys.prefix); print(os.path.relpath(paths['platlib'], sys.prefix)); print(os.path.relpath(paths['purelib'], sys.prefix))"
  OUTPUT_VARIABLE _py2_info RESULT_VARIABLE _py2_rc OUTPUT_STRIP_TRAILING_WHITESPACE)
if(NOT _py2_rc EQUAL 0)
  message(FATAL_ERROR "${PYTHON2_EXECUTABLE} is not a usable Python 2.7 interpreter.")
endif()
string(REPLACE "\n" ";" _py2_info "${_py2_info}")
list(GET _py2_info 0 PYTHON2_INCLUDE_DIR)
list(GET _py2_info 1 PYTHON2_LIBDIR)
list(GET _py2_info 2 PYTHON2_LDLIBRARY)
list(GET _py2_info 3 PYTHON2_PREFIX)
list(GET _py2_info 4 PYTHON2_PLATLIB)
list(GET _py2_info 5 PYTHON2_PURELIB)
if(CMAKE_INSTALL_PREFIX_INITIALIZED_TO_DEFAULT)
  set(CMAKE_INSTALL_PREFIX "${PYTHON2_PREFIX}" CACHE PATH
      "Install prefix; the module goes to ${PYTHON2_PLATLIB} below it" FORCE)
endif()
message(STATUS "Python 2.7: ${PYTHON2_EXECUTABLE} (headers ${PYTHON2_INCLUDE_DIR})")

add_library(python2::headers INTERFACE IMPORTED)
# SYSTEM: the 2.7 headers use 'register', which C++17 warns about.
set_target_properties(python2::headers PROPERTIES
  INTERFACE_SYSTEM_INCLUDE_DIRECTORIES "${PYTHON2_INCLUDE_DIR}"
  INTERFACE_INCLUDE_DIRECTORIES "${PYTHON2_INCLUDE_DIR}")

add_library(python2::embed INTERFACE IMPORTED)
set_target_properties(python2::embed PROPERTIES
  INTERFACE_LINK_LIBRARIES "python2::headers;${PYTHON2_LIBDIR}/${PYTHON2_LDLIBRARY}"
  INTERFACE_LINK_OPTIONS "-Wl,-rpath,${PYTHON2_LIBDIR}")
