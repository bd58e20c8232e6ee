#!/usr/bin/env bash
# Builds VXMigrate and runs every test natively, as 32-bit x86 and under AddressSanitizer and
# UndefinedBehaviorSanitizer, then runs each fuzz target over its seeds for a short while
# (FUZZ_SMOKE_SECONDS each, default 20). Installs missing packages first. Arguments choose presets.
set -euo pipefail
cd "$(dirname "$0")/.."

bash scripts/install-deps.sh

presets=(native i386 asan fuzz)
if [ $# -gt 0 ]; then presets=("$@"); fi

for preset in "${presets[@]}"; do
  echo "=== $preset ==="
  if [ "$preset" = fuzz ]; then
    bash scripts/fuzz.sh "${FUZZ_SMOKE_SECONDS:-20}"
    continue
  fi
  cmake --preset "$preset" >/dev/null
  cmake --build --preset "$preset"
  ctest --preset "$preset"
  # The SDK as plug-in authors meet it: installed, built against out of tree, run.
  if [ "$preset" = native ]; then bash scripts/check-sdk.sh build/native; fi
done
echo "All tests passed: ${presets[*]}"
