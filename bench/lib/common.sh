# Sourced by the bench commands: where things are, building what a bench needs,
# and running a bench once per interpreter.
top=$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)
source "$top/scripts/lib/python.sh"
build=${BUILD_DIR:-$top/build}

# The module path of the benchmarks run with a build folder's interpreter.
python_path_for() {
  echo "$1/python:$top/examples:$top/tests/python:$top/bench/lib"
}

# Builds the given targets in each build folder (configuring what is missing);
# then `python` is build/'s interpreter, with its modules on PYTHONPATH.
build_targets() {
  "$top/scripts/install-deps" >/dev/null
  BUILD_TARGETS="$*" "$top/scripts/build" >&2
  python=$(build_python "$build")
  PYTHONPATH=$(python_path_for "$build")
  export PYTHONPATH
}

# Runs `MEASURE BUILD_FOLDER INTERPRETER ARGUMENTS...` for each build folder
# (build/ and build-py3/, or BUILD_DIR); each prints its figures as JSON, and
# they are printed as one table.
side_by_side() {
  local measure=$1 work dir builds figures=()
  shift
  work=$(mktemp -d)
  # shellcheck disable=SC2064  # the folder is known now
  trap "rm -rf '$work'" EXIT
  mapfile -t builds < <(python_build_dirs "$top")
  for dir in "${builds[@]}"; do
    PYTHONPATH=$(python_path_for "$dir") "$measure" "$dir" "$(build_python "$dir")" "$@" \
      >"$work/${#figures[@]}.json"
    figures+=("$(build_python_version "$dir")" "$work/${#figures[@]}.json")
  done
  PYTHONPATH=$top/bench/lib "$(system_python3)" "$top/bench/lib/side_by_side.py" "${figures[@]}"
}
