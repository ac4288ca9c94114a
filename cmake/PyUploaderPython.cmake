# Chooses the CPython interpreter the module is built for: PYUPLOADER_PYTHON when
# given (2.7, or 3.8 and later); else the one the environment variable PYTHON2
# names; else pyenv's 2.7.18; else /usr/bin/python3; else python3 on PATH.
# Caches PYUPLOADER_PYTHON_EXECUTABLE (the interpreter) and PYUPLOADER_PYTHON_VERSION
# ("2.7", "3.11", ...) and defines:
#   PYUPLOADER_PYTHON_MAJOR        2 or 3
#   PYUPLOADER_PYTHON_EXT_SUFFIX   the file name ending of an extension module
#   PYUPLOADER_PYTHON_PLATLIB, PYUPLOADER_PYTHON_PURELIB
#                                  the interpreter's site-packages for extension and
#                                  pure modules, relative to its prefix
#   python::headers                the C API headers
#   python::embed                  headers and libpython, for programs that host an
#                                  interpreter of their own
# Unless CMAKE_INSTALL_PREFIX is given, it becomes the interpreter's prefix, so that an
# install lands where the interpreter looks.
set(PYUPLOADER_PYTHON "" CACHE FILEPATH
    "The Python interpreter to build the module for (2.7, or 3.8 and later)")

# The default interpreter and, in _looked_at, every place the rule looked.
function(_pyuploader_default_python out looked_at)
  if(DEFINED ENV{PYTHON2} AND NOT "$ENV{PYTHON2}" STREQUAL "")
    # Named explicitly for the 2.7 build: no falling back to another interpreter.
    set(${out} "$ENV{PYTHON2}" PARENT_SCOPE)
    set(${looked_at} "PYTHON2=$ENV{PYTHON2}" PARENT_SCOPE)
    return()
  endif()
  execute_process(COMMAND pyenv root OUTPUT_VARIABLE _pyenv_root
                  OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET)
  if(NOT _pyenv_root)
    if(DEFINED ENV{PYENV_ROOT} AND NOT "$ENV{PYENV_ROOT}" STREQUAL "")
      set(_pyenv_root "$ENV{PYENV_ROOT}")
    else()
      set(_pyenv_root "$ENV{HOME}/.pyenv")
    endif()
  endif()
  set(_candidates "${_pyenv_root}/versions/2.7.18/bin/python2.7" "/usr/bin/python3")
  find_program(_path_python3 NAMES python3 NO_CACHE)
  if(_path_python3)
    list(APPEND _candidates "${_path_python3}")
  endif()
  set(${looked_at} "${_candidates}" PARENT_SCOPE)
  foreach(_candidate IN LISTS _candidates)
    if(EXISTS "${_candidate}")
      set(${out} "${_candidate}" PARENT_SCOPE)
      return()
    endif()
  endforeach()
  set(${out} "" PARENT_SCOPE)
endfunction()

if(PYUPLOADER_PYTHON)
  set(_python "${PYUPLOADER_PYTHON}")
  set(_looked_at "PYUPLOADER_PYTHON=${PYUPLOADER_PYTHON}")
elseif(PYUPLOADER_PYTHON_EXECUTABLE)
  # Chosen at the first configure; a build folder keeps its interpreter.
  set(_python "${PYUPLOADER_PYTHON_EXECUTABLE}")
  set(_looked_at "${PYUPLOADER_PYTHON_EXECUTABLE}")
else()
  _pyuploader_default_python(_python _looked_at)
endif()
if(NOT _python OR NOT EXISTS "${_python}")
  message(FATAL_ERROR
    "No Python interpreter found (looked for: ${_looked_at}). Name one with "
    "-DPYUPLOADER_PYTHON=/path/to/python (2.7, or 3.8 and later).")
endif()

# Runs with 2.7 and 3.x alike.
execute_process(
  COMMAND "${_python}" -c [=[
import os, sys, sysconfig
paths = sysconfig.get_paths()
for value in ("%d.%d" % sys.version_info[:2], paths["include"],
              sysconfig.get_config_var("LIBDIR"), sysconfig.get_config_var("LDLIBRARY"),
              sysconfig.get_config_var("EXT_SUFFIX") or ".so", sys.prefix,
              os.path.relpath(paths["platlib"], sys.prefix),
              os.path.relpath(paths["purelib"], sys.prefix)):
    print(value)
]=]
  OUTPUT_VARIABLE _info RESULT_VARIABLE _rc OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_VARIABLE _error)
if(NOT _rc EQUAL 0)
  message(FATAL_ERROR "${_python} is not a usable Python interpreter: ${_error}")
endif()
string(REPLACE "\n" ";" _info "${_info}")
list(GET _info 0 _version)
list(GET _info 1 _include_dir)
list(GET _info 2 _libdir)
list(GET _info 3 _ldlibrary)
list(GET _info 4 PYUPLOADER_PYTHON_EXT_SUFFIX)
list(GET _info 5 _prefix)
list(GET _info 6 PYUPLOADER_PYTHON_PLATLIB)
list(GET _info 7 PYUPLOADER_PYTHON_PURELIB)

if(_looked_at MATCHES "^PYTHON2=" AND NOT _version STREQUAL "2.7")
  message(FATAL_ERROR "PYTHON2 names ${_python}, which is Python ${_version}, not 2.7.")
endif()
if(NOT _version STREQUAL "2.7" AND _version VERSION_LESS "3.8")
  message(FATAL_ERROR
    "${_python} is Python ${_version}; the module builds for Python 2.7, or 3.8 and later.")
endif()
if(NOT EXISTS "${_include_dir}/Python.h")
  message(FATAL_ERROR
    "Python ${_version} at ${_python} has no C headers (${_include_dir}/Python.h); "
    "install its development package (Debian: python3-dev).")
endif()
string(REGEX REPLACE "\\..*" "" PYUPLOADER_PYTHON_MAJOR "${_version}")

set(PYUPLOADER_PYTHON_EXECUTABLE "${_python}" CACHE FILEPATH
    "The Python interpreter the module is built for" FORCE)
set(PYUPLOADER_PYTHON_VERSION "${_version}" CACHE STRING
    "Major and minor version of PYUPLOADER_PYTHON_EXECUTABLE" FORCE)
if(CMAKE_INSTALL_PREFIX_INITIALIZED_TO_DEFAULT)
  set(CMAKE_INSTALL_PREFIX "${_prefix}" CACHE PATH
      "Install prefix; the module goes to ${PYUPLOADER_PYTHON_PLATLIB} below it" FORCE)
endif()
message(STATUS "Python ${_version}: ${_python} (headers ${_include_dir})")

add_library(python::headers INTERFACE IMPORTED)
# SYSTEM: the 2.7 headers use 'register', which C++17 warns about.
set_target_properties(python::headers PROPERTIES
  INTERFACE_SYSTEM_INCLUDE_DIRECTORIES "${_include_dir}"
  INTERFACE_INCLUDE_DIRECTORIES "${_include_dir}")

add_library(python::embed INTERFACE IMPORTED)
set_target_properties(python::embed PROPERTIES
  INTERFACE_LINK_LIBRARIES "python::headers;${_libdir}/${_ldlibrary}"
  INTERFACE_LINK_OPTIONS "-Wl,-rpath,${_libdir}")
