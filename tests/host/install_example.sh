#!/bin/sh
# Installs a Belvane build tree into a fresh prefix, builds the example host
# against the installed package alone (with Qt, PostgreSQL and SQLite kept
# out of its configure step: a headless host needs none of them), runs it
# on the sample catalogue and checks what it printed. The work folder is the same on every run, so that
# ccache finds the example's object from the run before.
set -eu

launcher="" config="" flags="" generator="Ninja"
while [ $# -gt 0 ]; do
  case "$1" in
    --build-tree) tree=$2 ;;
    --example) example=$2 ;;
    --work) work=$2 ;;
    --catalogue) catalogue=$2 ;;
    --generator) generator=$2 ;;
    --cxx) cxx=$2 ;;
    --launcher) launcher=$2 ;;
    --config) config=$2 ;;
    --flags) flags=$2 ;;
    *) echo "install_example.sh: unknown option $1" >&2; exit 2 ;;
  esac
  shift 2
done

fail() { echo "FAIL: $*" >&2; exit 1; }

for required in "$tree" "$example" "$work" "$catalogue" "$cxx"; do
  test -n "$required" || { echo "install_example.sh: an option is missing" >&2; exit 2; }
done

rm -rf "$work"
mkdir -p "$work"
prefix=$work/prefix

cmake --install "$tree" ${config:+--config "$config"} --prefix "$prefix" >"$work/install.log" || {
  cat "$work/install.log" >&2; fail "cmake --install"; }
# The host builds against the prefix only: nothing of the source tree.
test -f "$prefix/include/belvane/belvane.hpp" || fail "no public header installed"
test -f "$prefix/include/belvane/labour/frm_labour.hpp" || fail "the editors' headers are not installed"
test -f "$prefix/lib/cmake/Belvane/BelvaneConfig.cmake" || fail "no package config installed"
test -x "$prefix/bin/belvane" || fail "the command-line tool is not installed"
# Only belvane/ lands on a host's include path, and the headers include one
# another as <belvane/...>.
for generic in text data grid forms host labour; do
  test ! -e "$prefix/include/$generic" || fail "include/$generic installed beside include/belvane"
done
if grep -rqE '#include "(text|data|grid|forms|cipher|host|editor|labour|entry)/' "$prefix/include/belvane"; then
  fail "an installed header includes another by its source-tree path"
fi

cmake -S "$example" -B "$work/build" -G "$generator" \
  -DCMAKE_PREFIX_PATH="$prefix" \
  -DCMAKE_CXX_COMPILER="$cxx" \
  -DCMAKE_CXX_COMPILER_LAUNCHER="$launcher" \
  -DCMAKE_BUILD_TYPE="$config" \
  -DCMAKE_DISABLE_FIND_PACKAGE_Qt6=ON \
  -DCMAKE_DISABLE_FIND_PACKAGE_PostgreSQL=ON \
  -DCMAKE_DISABLE_FIND_PACKAGE_SQLite3=ON \
  -DCMAKE_CXX_FLAGS="$flags" \
  -DCMAKE_EXE_LINKER_FLAGS="$flags" >"$work/configure.log" 2>&1 || {
  cat "$work/configure.log" >&2; fail "configuring the example against the package"; }
cmake --build "$work/build" ${config:+--config "$config"} >"$work/build.log" 2>&1 || {
  cat "$work/build.log" >&2; fail "building the example against the package"; }

# The sample's first model: NRMA schedule N20000, body 10011.
status=0
"$work/build/belvane-example-host" "$catalogue" N20000 10011 >"$work/out.txt" 2>"$work/err.txt" ||
  status=$?
if [ "$status" -ne 0 ]; then
  cat "$work/out.txt" "$work/err.txt" >&2
  fail "the example host exited with status $status"
fi
cat "$work/out.txt"

# The one record the estimator made: the chosen item's R&R at 2.5 hours
# with the quote's R&R rate, shown and not deleted.
item=$(sed -n 's/^Estimator: R&R of item \([^ ]*\) .*/\1/p' "$work/out.txt")
test -n "$item" || fail "the estimator found no R&R hours in schedule N20000"
grep -qx "Schedule: NRMA" "$work/out.txt" || fail "schedule type not NRMA"
grep -qx "Records: 1" "$work/out.txt" || fail "expected exactly one record"
grep -q "^Q1001/0 $item \".*\" R&R rrhour=2.5 rr_rate2=55 tag=1 DELITEM=False\$" "$work/out.txt" ||
  fail "the record is not the R&R of item $item at 2.5 hours"
test ! -s "$work/err.txt" || { cat "$work/err.txt" >&2; fail "the example wrote errors"; }
echo "PASS"
