# Sourced by the scripts: which interpreters this machine has, and which one a
# build folder was configured for. The build picks its default the same way:
# PYTHON2, else pyenv's 2.7.18, else the system's python3.

# pyenv's root, also where pyenv itself is not on PATH.
pyenv_root() {
  pyenv root 2>/dev/null || echo "${PYENV_ROOT:-$HOME/.pyenv}"
}

# Where the 2.7 interpreter is looked for: PYTHON2 when set, else pyenv's 2.7.18.
python2_path() {
  if [[ -n ${PYTHON2:-} ]]; then
    echo "$PYTHON2"
  else
    echo "$(pyenv_root)/versions/2.7.18/bin/python2.7"
  fi
}

# pyenv's newest interpreter of a release line (say 3.13); nothing when it has none.
newest_pyenv_python() {
  local line=$1
  { compgen -G "$(pyenv_root)/versions/$line*/bin/python$line" || true; } | sort -V | tail -n 1
}

have_python2() {
  [[ -x $(python2_path) ]]
}

# Why there is no 2.7 interpreter, where PYTHON2 does not name one: the place looked at.
python2_missing_reason() {
  echo "no Python 2.7 interpreter found (PYTHON2 is not set, nothing at $(python2_path))"
}

# The system's Python 3: Debian's, else the first on PATH.
system_python3() {
  if [[ -x /usr/bin/python3 ]]; then
    echo /usr/bin/python3
  else
    command -v python3
  fi
}

# A setting of a configured build folder: build_setting DIR NAME.
build_setting() {
  sed -n "s/^$2:[A-Z]*=//p" "$1/CMakeCache.txt" 2>/dev/null
}

build_python() {
  build_setting "$1" PYUPLOADER_PYTHON_EXECUTABLE
}

build_python_version() {
  build_setting "$1" PYUPLOADER_PYTHON_VERSION
}

# The build folders of scripts/build: BUILD_DIR alone when set, else build/
# and, beside a 2.7 build, build-py3/ when it has been configured.
python_build_dirs() {
  local top=$1
  if [[ -n ${BUILD_DIR:-} ]]; then
    echo "$BUILD_DIR"
    return
  fi
  echo "$top/build"
  if [[ -f $top/build-py3/CMakeCache.txt ]]; then
    echo "$top/build-py3"
  fi
}
