#!/usr/bin/env bash
# The main job: builds VXMigrate, copies the two sample installations of one shipped plug-in into a
# fresh folder under out/, runs the host there with the plug-in's command file (samples/runs/), and
# shows what the run did. The shipped samples themselves are never changed.
#   scripts/run-sample.sh [plug-in]     plug-in: halden_to_obx (default), log_to_log,
#                                       halsuite_to_halsuite, obx_to_obx
set -euo pipefail
cd "$(dirname "$0")/.."

plugin="${1:-halden_to_obx}"
command_file="samples/runs/$plugin/migcmd.ini"
if [ ! -f "$command_file" ]; then
  echo "No sample run for '$plugin'; choose one of: $(ls samples/runs | tr '\n' ' ')" >&2
  exit 2
fi
# The command file names the two installations as folders of samples/.
main_value() { sed -n "s/^$1=//p" "$command_file" | tr -d '\r' | head -n 1; }
source_name=$(main_value D1)
destination_name=$(main_value D2)

bash scripts/install-deps.sh
cmake --preset native >/dev/null
cmake --build --preset native --target vxmigrate_host "$plugin"

run="$(pwd)/out/sample-$plugin-$(date +%Y%m%d-%H%M%S)"
mkdir -p "$run"
cp -a "samples/$source_name" "$run/$source_name"
cp -a "samples/$destination_name" "$run/$destination_name"
cp "$command_file" "$run/migcmd.ini"
before="$run/before"
cp -a "$run/$destination_name" "$before"

echo "Running $plugin in $run with:"
sed -n '/^\[/,$p' "$command_file"
set +e
(cd "$run" && "$OLDPWD/build/native/vxmigrate" -cmd:./migcmd.ini)
result=$?
set -e

log="$run/$destination_name/vxmigrate.log"
echo
echo "Result: $result"
echo "Log: $log"
echo "----- log -----"
cat "$log"
echo "----- files added or changed in the destination -----"
diff -rq "$before" "$run/$destination_name" | sed -e "s|$before|before|g" -e "s|$run/||g" || true
if diff -rq "samples/$source_name" "$run/$source_name" >/dev/null; then
  echo "Source installation unchanged."
else
  echo "WARNING: the source installation changed"; exit 1
fi
exit "$result"
