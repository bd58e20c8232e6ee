#!/usr/bin/env bash
# Checks the SDK as a plug-in author meets it: installs a build of VXMigrate into a fresh prefix,
# builds examples/plugin out of tree through find_package and through pkg-config, installs each
# build beside the installed host and runs the host with it on copies of a sample installation.
#   scripts/check-sdk.sh [build folder]     (default build/native, which must be built)
set -euo pipefail
cd "$(dirname "$0")/.."
build="${1:-build/native}"

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
prefix="$work/prefix"
fail() { echo "check-sdk: $*" >&2; exit 1; }

cmake --install "$build" --prefix "$prefix" >/dev/null
[ -z "$(find "$prefix/include" -path '*internal*')" ] || fail "internal headers are installed"
[ "$(readlink "$prefix/bin/vxmigrate")" = "../lib/vxmigrate/vxmigrate" ] || fail "bin/vxmigrate is no link to the host"
pc=$(find "$prefix" -name vxmigrate.pc)
[ -n "$pc" ] || fail "no vxmigrate.pc installed"

# Through find_package: the example's own CMake project installs into VXMigrate_PLUGIN_DIR.
cmake -S examples/plugin -B "$work/by-cmake" -G Ninja -DCMAKE_PREFIX_PATH="$prefix" >/dev/null
cmake --build "$work/by-cmake" >/dev/null || fail "the example does not build through find_package"
cmake --install "$work/by-cmake" >/dev/null

# Through pkg-config: one compiler call, the plug-in folder from the package's variable.
export PKG_CONFIG_PATH="$(dirname "$pc")"
plugindir=$(pkg-config --variable=plugindir vxmigrate)
mkdir -p "$work/by-pkg-config"
# shellcheck disable=SC2046  # the flags are meant to split
c++ -shared -fPIC -o "$work/by-pkg-config/mirror_upgrade.so" examples/plugin/mirror_upgrade.cpp \
  $(pkg-config --cflags --libs vxmigrate)

# Runs the installed host on fresh copies of the Halden samples, taken as the mirror suite.
run_example() {
  local run="$work/run-$1"
  mkdir -p "$run"
  cp -a samples/halden "$run/old"
  cp -a samples/halden-6.5 "$run/new"
  # Through the installed link, which must find the plug-ins beside the real host.
  "$prefix/bin/vxmigrate" "-D1:$run/old" "-D2:$run/new" -P1:mirsuite -P2:mirsuite -V1:5.5 -V2:6.5 \
    -PFLog:shop.wlp >/dev/null || fail "$1: the host failed"
  grep -q "Example plug-in migrating the mirror suite from 5.5" "$run/new/vxmigrate.log" ||
    fail "$1: the example plug-in did not run"
  [ -f "$run/new/vxm_log/datfiles/shop_vxmigrate.wlp" ] || fail "$1: the selected profile is missing"
  [ ! -e "$run/new/vxm_log/datfiles/cluster_vxmigrate.wlp" ] || fail "$1: an unselected profile came along"
  diff -r samples/halden "$run/old" >/dev/null || fail "$1: the source installation changed"
  echo "check-sdk: example plug-in built through $1 runs beside the installed host"
}
[ -f "$plugindir/mirror_upgrade.so" ] || fail "find_package build not installed in $plugindir"
run_example find_package
cp "$work/by-pkg-config/mirror_upgrade.so" "$plugindir/mirror_upgrade.so"
run_example pkg-config
