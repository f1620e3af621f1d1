#!/usr/bin/env bash
# Installs the build into a scratch prefix and runs the installed restzones,
# started through bin/, on the bundled example with only the suite's
# variables set (KVLTMPDIR, KVLLANG): it must find its message files on its
# own (the banner is line 139 of text/textg.fr) and write the same stock2.bin,
# byte for byte, as the build tree's program given TXTPATH.
#   install_check.sh CMAKE BUILD_DIR SOURCE_DIR BUILT_RESTZONES
set -euo pipefail
cmake=$1 build=$2 source=$3 built=$4
scratch=$(mktemp -d "${TMPDIR:-/tmp}/zt_install.XXXXXX")
trap 'rm -rf "$scratch"' EXIT
prefix=$scratch/prefix
fail() { echo "install_check: FAILED: $*"; exit 1; }

"$cmake" --install "$build" --prefix "$prefix" >"$scratch/install.log" || { cat "$scratch/install.log"; fail "cmake --install"; }
for p in restzones zonetool; do
  [ -x "$prefix/bin/$p" ] || fail "no $prefix/bin/$p"
done

run() {  # run DIR PROGRAM [VAR=VALUE...]: the example's data files in DIR, PROGRAM run there
  local dir=$1 program=$2
  shift 2
  mkdir -p "$dir"
  cp "$source"/examples/pocket/{contour.bin,stock1.bin,grid.tmp,zstock.ok} "$dir/"
  (cd "$dir" && env -i PATH=/usr/bin:/bin KVLTMPDIR="$dir" KVLLANG=fr "$@" "$program" >"$dir/out.txt" 2>"$dir/err.txt") ||
    fail "$program ended with status $?"
  if ls "$dir"/erreur.tmp* >/dev/null 2>&1 || [ ! -s "$dir/stock2.bin" ]; then
    cat "$dir/out.txt" "$dir/err.txt"
    fail "$program left its status marker or no stock2.bin in $dir"
  fi
}
run "$scratch/built" "$built" TXTPATH="$source/examples/pocket"
run "$scratch/installed" "$prefix/bin/restzones"

banner=$(sed -n 139p "$source/examples/pocket/textg.fr")
grep -qF "$banner" "$scratch/installed/out.txt" || { cat "$scratch/installed/out.txt"; fail "the installed program did not show its banner \"$banner\""; }
cmp "$scratch/built/stock2.bin" "$scratch/installed/stock2.bin" || fail "stock2.bin differs between the build tree's and the installed program"
"$prefix/bin/zonetool" dump "$scratch/installed/stock2.bin" >/dev/null || fail "the installed zonetool cannot read stock2.bin"
echo "install_check: the installed restzones wrote the same stock2.bin ($(wc -c <"$scratch/installed/stock2.bin") bytes) as the build tree's"
