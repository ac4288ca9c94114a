# Sourced by the bench commands: where things are, and building what a bench needs.
top=$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)
export BUILD_DIR=${BUILD_DIR:-$top/build}
build=$BUILD_DIR
py2=${PYTHON2:-$(pyenv root 2>/dev/null || echo "$HOME/.pyenv")/versions/2.7.18/bin/python2.7}
export PYTHONPATH="$build/python:$top/examples:$top/tests/python:$top/bench/lib"

# Builds the given targets; a fresh build folder gets the whole project.
build_targets() {
  "$top/scripts/install-deps" >/dev/null
  if [[ ! -f $build/CMakeCache.txt ]]; then
    "$top/scripts/build" >&2
  else
    cmake --build "$build" --parallel "$(nproc)" --target "$@" >&2
  fi
}
