#!/usr/bin/env bash
# Times a whole host run (Halden 5.5 into OBX 3.0 with the shipped plug-in) on generated
# installations of about 20, 2,000 and 20,000 files against `cp -a` of the source installation and
# `cp -a` of the finished output tree, interleaved in rotating order, and prints medians, ratios,
# growth from size to size and the host's peak resident size as a Markdown table.
#   usage: bench/run_scale.sh            (after: cmake --preset native && cmake --build --preset native)
# Environment: VXM_SCALE_SIZES (default "20 2000 20000"), VXM_SCALE_REPS (default 5),
# VXM_SCALE_DIR (parent of the scratch folder, default /tmp; keep it on the disk to be measured),
# VXM_HOST (default build/native/vxmigrate, with halden_to_obx.so and vxmigrate.ini beside it),
# VXM_SCALE_KEEP=1 keeps the scratch folder. Nothing is deleted between the timed runs of one size:
# ext4 makes file creation right after deletions slower, which would favour whatever ran first.
set -euo pipefail

repo=$(cd "$(dirname "$0")/.." && pwd)
sizes=${VXM_SCALE_SIZES:-20 2000 20000}
reps=${VXM_SCALE_REPS:-5}
host=${VXM_HOST:-$repo/build/native/vxmigrate}
scratch=$(mktemp -d "${VXM_SCALE_DIR:-/tmp}/vxm_scale.XXXXXX")
results=$scratch/results.tsv

for need in "$host" "$(dirname "$host")/halden_to_obx.so" /usr/bin/time; do
  if [[ ! -e $need ]]; then echo "$0: missing $need (build the native preset first)" >&2; exit 2; fi
done
cleanup() { [[ ${VXM_SCALE_KEEP:-0} == 1 ]] || rm -rf "$scratch"; }
trap cleanup EXIT

# Runs a command under /usr/bin/time -v; appends "size kind rep wall user sys rss_kb" to results.
# The wall time is bash's microsecond clock around the whole call (time's own report has only
# hundredths); user and system time and peak RSS are time's.
timed() {
  local size=$1 kind=$2 rep=$3; shift 3
  local report=$scratch/time.txt start end
  sync
  start=$EPOCHREALTIME
  if ! /usr/bin/time -v -o "$report" "$@" >/dev/null 2>"$scratch/stderr.txt"; then
    echo "$0: failed: $*" >&2; cat "$scratch/stderr.txt" >&2; exit 1
  fi
  end=$EPOCHREALTIME
  awk -v size="$size" -v kind="$kind" -v rep="$rep" -v wall="$start $end" '
    BEGIN { split(wall, t, " "); wall = t[2] - t[1] }
    /User time \(seconds\)/ { user = $NF }
    /System time \(seconds\)/ { sys = $NF }
    /Maximum resident set size/ { rss = $NF }
    END { printf "%s\t%s\t%s\t%.4f\t%.2f\t%.2f\t%d\n", size, kind, rep, wall, user, sys, rss }
  ' "$report" >>"$results"
}

# Sets args to the host's options for a run from SOURCE into DESTINATION.
host_args() { args=("-D1:$1" "-D2:$2" -P1:halsuite -P2:obx -V1:5.5 -V2:3.0); }

count_files() { find "$1" -type f | wc -l; }

echo "machine: $(nproc) CPUs, $(awk -F': ' '/model name/ {print $2; exit}' /proc/cpuinfo)," \
     "$(df -T "$scratch" | awk 'NR == 2 {print $2}') at $scratch, load $(cut -d' ' -f1-3 /proc/loadavg)"
: >"$results"
declare -A src_files out_files largest
for size in $sizes; do
  folder=$scratch/$size
  bash "$repo/bench/make_installation.sh" "$size" "$folder/halden" "$folder/obx"
  # The finished output tree that `cp -a` copies; this untimed run also warms the caches.
  cp -a "$folder/obx" "$folder/reference"
  host_args "$folder/halden" "$folder/reference"
  "$host" "${args[@]}" >/dev/null 2>&1
  src_files[$size]=$(count_files "$folder/halden")
  out_files[$size]=$(count_files "$folder/reference")
  largest[$size]=$(find "$folder/halden" "$folder/obx" "$folder/reference" -type f -printf '%s\n' |
                   sort -n | tail -1)
  for rep in $(seq 1 "$reps"); do
    # Rotate the order so that no kind always runs first or last.
    order=(source host output)
    for ((shift = 0; shift < (rep - 1) % 3; shift++)); do order=("${order[@]:1}" "${order[0]}"); done
    for kind in "${order[@]}"; do
      case $kind in
        source) timed "$size" cp_source "$rep" cp -a "$folder/halden" "$folder/cp_source.$rep" ;;
        output) timed "$size" cp_output "$rep" cp -a "$folder/reference" "$folder/cp_output.$rep" ;;
        host)
          cp -a "$folder/obx" "$folder/run.$rep"
          host_args "$folder/halden" "$folder/run.$rep"
          timed "$size" host "$rep" "$host" "${args[@]}"
          ;;
      esac
    done
  done
  # The log and the undo journal hold times and inode numbers of their own run.
  if ! diff -r -x vxmigrate.log -x .vxmigrate "$folder/reference" "$folder/run.1" >/dev/null; then
    echo "$0: warning: the runs of size $size did not give the same tree" >&2
  fi
  [[ ${VXM_SCALE_KEEP:-0} == 1 ]] || { rm -rf "$folder"; sync; }
done

median() {  # median SIZE KIND COLUMN (4 wall, 5 user, 6 sys, 7 rss; 56 user+sys)
  awk -F'\t' -v size="$1" -v kind="$2" -v col="$3" '
    $1 == size && $2 == kind { print (col == 56 ? $5 + $6 : $col) }' "$results" |
    sort -g | awk '{ v[NR] = $1 } END { print (NR % 2 ? v[(NR + 1) / 2] : (v[NR / 2] + v[NR / 2 + 1]) / 2) }'
}
peak() { awk -F'\t' -v size="$1" '$1 == size && $2 == "host" && $7 > m { m = $7 } END { print m }' "$results"; }

echo
echo "Medians of $reps interleaved repetitions; times in seconds, sizes in MB."
echo
echo "| files (source / output) | largest file | cp -a source | cp -a output | host run | host CPU (user+sys) | host / cp source | host / cp output | growth of host run | peak RSS | RSS goal |"
echo "|---|---|---|---|---|---|---|---|---|---|---|"
previous=
for size in $sizes; do
  cps=$(median "$size" cp_source 4) cpo=$(median "$size" cp_output 4) run=$(median "$size" host 4)
  cpu=$(median "$size" host 56) rss=$(peak "$size")
  growth=-
  [[ -n $previous ]] && growth=$(awk -v a="$run" -v b="$previous" 'BEGIN { printf "%.1fx", a / b }')
  awk -v sf="${src_files[$size]}" -v of="${out_files[$size]}" -v big="${largest[$size]}" -v cps="$cps" \
      -v cpo="$cpo" -v run="$run" -v cpu="$cpu" -v growth="$growth" -v rss="$rss" 'BEGIN {
    printf "| %d / %d | %.1f | %.3f | %.3f | %.3f | %.2f | %.1fx | %.1fx | %s | %.1f | %.1f |\n",
           sf, of, big / 1e6, cps, cpo, run, cpu, run / cps, run / cpo, growth, rss / 1024,
           4 * big / 1e6 + 20 }'
  previous=$run
done
echo
echo "Every timed run (size, kind, repetition, wall, user, system, peak RSS in KB):"
cat "$results"
