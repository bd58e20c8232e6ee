#!/usr/bin/env bash
# Builds VXMigrate and runs every test natively, as 32-bit x86 and under AddressSanitizer and
# UndefinedBehaviorSanitizer. Installs missing packages first.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh

presets=(native i386 asan)
if [ $# -gt 0 ]; then presets=("$@"); fi

for preset in "${presets[@]}"; do
  echo "=== $preset ==="
  cmake --preset "$preset" >/dev/null
  cmake --build --preset "$preset"
  ctest --preset "$preset"
  # The SDK as plug-in authors meet it: installed, built against out of tree, run.
  if [ "$preset" = native ]; then bash scripts/check-sdk.sh build/native; fi
done
echo "All tests passed: ${presets[*]}"
