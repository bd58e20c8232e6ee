#!/usr/bin/env bash
# The main job: builds VXMigrate, copies the shipped sample installations into a fresh folder under
# out/, migrates the Halden installation into the OBX one with the shipped plug-in, and shows what
# the run did. The shipped samples themselves are never changed.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh
cmake --preset native >/dev/null
cmake --build --preset native --target vxmigrate_host halden_to_obx

run="$(pwd)/out/sample-$(date +%Y%m%d-%H%M%S)"
mkdir -p "$run"
cp -a samples/halden "$run/halden"
cp -a samples/obx "$run/obx"
before="$run/obx-before"
cp -a "$run/obx" "$before"

echo "Migrating $run/halden (halsuite 5.5) into $run/obx (obx 3.0)"
set +e
build/native/vxmigrate "-D1:$run/halden" "-D2:$run/obx" -P1:halsuite -P2:obx -V1:5.5 -V2:3.0
result=$?
set -e

echo
echo "Result: $result"
echo "Log: $run/obx/vxmigrate.log"
echo "----- log -----"
cat "$run/obx/vxmigrate.log"
echo "----- files added or changed in the destination -----"
diff -rq "$before" "$run/obx" | sed -e "s|$before|before|g" -e "s|$run/||g" || true
if diff -rq samples/halden "$run/halden" >/dev/null; then
  echo "Source installation unchanged."
else
  echo "WARNING: the source installation changed"; exit 1
fi
exit "$result"
