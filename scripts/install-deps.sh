#!/usr/bin/env bash
# Installs what a fresh Debian 12 x86-64 machine lacks to build and test VXMigrate natively, as
# i386, under the sanitizers and as fuzz targets (clang and its libFuzzer runtime). Safe to run
# again: it installs only missing packages.
set -euo pipefail

packages=(cmake ninja-build g++ g++-multilib pkgconf nettle-dev nettle-dev:i386 libgtest-dev
          libgtest-dev:i386 libbenchmark-dev clang libclang-rt-dev)

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

# The i386 tests must run, not only build. A kernel without 32-bit support runs them through QEMU's
# user-mode emulator, registered with binfmt_misc so that i386 programs started by the tests (the
# host, plug-ins' hosts, children) run the same way.
can_run_i386() {
  local dir rc
  dir=$(mktemp -d)
  printf 'int main(void) { return 0; }\n' > "$dir/probe.c"
  gcc -m32 "$dir/probe.c" -o "$dir/probe" 2>/dev/null && "$dir/probe" 2>/dev/null
  rc=$?
  rm -rf "$dir"
  return $rc
}

if ! can_run_i386; then
  echo "This kernel does not run i386 programs; using QEMU user-mode emulation for them."
  if ! dpkg-query -W -f='${Status}' qemu-user-static 2>/dev/null | grep -q "install ok installed"; then
    "${sudo_cmd[@]}" apt-get update || true
    DEBIAN_FRONTEND=noninteractive "${sudo_cmd[@]}" apt-get install -y --no-install-recommends qemu-user-static
  fi
  binfmt=/proc/sys/fs/binfmt_misc
  [ -e "$binfmt/register" ] || "${sudo_cmd[@]}" mount -t binfmt_misc binfmt_misc "$binfmt"
  if [ ! -e "$binfmt/qemu-i386" ]; then
    printf '%s' ':qemu-i386:M::\x7fELF\x01\x01\x01\x00\x00\x00\x00\x00\x00\x00\x00\x00\x02\x00\x03\x00:\xff\xff\xff\xff\xff\xfe\xfe\x00\xff\xff\xff\xff\xff\xff\xff\xff\xfe\xff\xff\xff:/usr/bin/qemu-i386-static:F' \
      | "${sudo_cmd[@]}" tee "$binfmt/register" >/dev/null
  fi
  can_run_i386 || { echo "i386 programs still cannot run here" >&2; exit 1; }
fi
