#!/usr/bin/env bash
# Installs what a fresh Debian 12 x86-64 machine lacks to build and test VXMigrate natively, as
# i386 and under the sanitizers. Safe to run again: it installs only missing packages.
set -euo pipefail

packages=(cmake ninja-build g++ g++-multilib nettle-dev nettle-dev:i386 libgtest-dev
          libgtest-dev:i386 libbenchmark-dev)

sudo_cmd=()
if [ "$(id -u)" -ne 0 ]; then sudo_cmd=(sudo); fi

if ! dpkg --print-foreign-architectures | grep -qx i386; then
  "${sudo_cmd[@]}" dpkg --add-architecture i386
fi

missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done

if [ ${#missing[@]} -gt 0 ]; then
  echo "Installing: ${missing[*]}"
  # A mirror that is mid-sync can fail one index; the others are still usable.
  "${sudo_cmd[@]}" apt-get update || true
  DEBIAN_FRONTEND=noninteractive "${sudo_cmd[@]}" apt-get install -y --no-install-recommends "${missing[@]}"
fi
