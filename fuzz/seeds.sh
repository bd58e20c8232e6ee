#!/usr/bin/env bash
# Lays out each fuzz target's seed folder under the given folder (default build/fuzz/seeds) from the
# shipped sample installations, plus the entries committed under fuzz/corpus/<target>. Seeds are
# made, not committed: the samples stay their one source. Safe to run again.
set -euo pipefail
root="$(cd "$(dirname "$0")/.." && pwd)"
out="${1:-$root/build/fuzz/seeds}"
samples="$root/samples"

seed() {  # seed <target> <name> <file>...: the files joined by form feeds
  local target=$1 name=$2
  shift 2
  mkdir -p "$out/$target"
  local first=1
  for f in "$@"; do
    if [ $first -eq 0 ]; then printf '\f'; fi
    cat "$f"
    first=0
  done > "$out/$target/$name"
}

for target in protected_value ini_file command_line command_file template_conversion \
              profile_conversion data_file_merge keyword_merge; do
  mkdir -p "$out/$target"
  if [ -d "$root/fuzz/corpus/$target" ]; then cp "$root/fuzz/corpus/$target"/* "$out/$target/"; fi
done

# Settings files of every kind: the INI reader and the template conversion's standard template.
while IFS= read -r f; do
  rel=${f#"$samples"/}
  seed ini_file "${rel//\//_}" "$f"
done < <(find "$samples" -type f \( -name '*.ini' -o -name '*.wlp' -o -name '*.mss' -o -name '*.wct' \
                                   -o -name '*.evt' -o -name '*.alp' \) | sort)

for run in "$samples"/runs/*/; do
  name=$(basename "$run")
  seed command_file "$name" "$run/migcmd.ini"
  # The same run as arguments, one a line.
  sed -n '/^\[main\]/,/^\[/{s/^\([A-Z0-9]*\)=\(.*\)/-\1:\2/p}' "$run/migcmd.ini" > "$out/command_line/$name"
done

for f in "$samples"/halden*/vxm_log/datfiles/*.mss; do
  seed template_conversion "$(basename "$(dirname "$(dirname "$(dirname "$f")")")")_$(basename "$f")" "$f"
done

# The profile conversion's first line chooses the product pair: 0 edition, 1 log, 2 OBX.
profile_seeds() {  # profile_seeds <selector> <file>...
  local selector=$1
  shift
  for f in "$@"; do
    { echo "$selector"; cat "$f"; } > "$out/profile_conversion/${selector}_$(basename "$(dirname "$f")")_$(basename "$f")"
  done
}
profile_seeds 0 "$samples"/halden/vxm_log/datfiles/*.wlp
profile_seeds 1 "$samples"/log-6.0/vxm_log/datfiles/*.wlp
profile_seeds 2 $(find "$samples"/obx-2.5 -name '*.wlp' -type f | sort)

# Merges: the old installation's file, a form feed, the new one's.
for pair in halden:halden-6.5 log-6.0:log-6.5 obx-2.5:obx; do
  old=${pair%%:*} new=${pair#*:}
  seed keyword_merge "$old" "$samples/$old/keywords.ini" "$samples/$new/keywords.ini"
  for data in vxintra.txt adviews.txt; do
    seed data_file_merge "${old}_$data" "$samples/$old/$data" "$samples/$new/$data"
  done
done
