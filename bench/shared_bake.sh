#!/bin/bash
# Benchmark: the command line's whole bake of a level (ambient bounces, then every room's
# cubemap) in one process against the same bake shared by N processes (lumora bake --jobs N).
#
#   bench/shared_bake.sh [LEVEL] [BOUNCES] [JOBS] [RUNS]      defaults: sample_large 3 2 3
#
# Run from the repository root after the build. Each run bakes a fresh copy of the level
# (without its bakes) made from data/, the two kinds of run taking turns. Prints, per run,
# the ambient bake's milliseconds per probe per bounce and the reflection bake's seconds per
# room as the tool reports them (wall clock, the helpers' start included), then the medians,
# and checks that the shared bake wrote the one-process bake's files byte for byte.
set -euo pipefail
level=${1:-sample_large}
bounces=${2:-3}
jobs=${3:-2}
runs=${4:-3}
root=$(pwd)
lumora="$root/build/tools/lumora/lumora"
[ -x "$lumora" ] || { echo "no $lumora: build first" >&2; exit 1; }
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cp -r "$root/data" "$scratch/data"

fresh() {
	rm -rf "$scratch/data/Cubemaps/$level" "$scratch/data/XML/levels/$level/ambient.sh" \
		"$scratch/data/XML/levels/$level/bake.json"
}

declare -A ambient rooms
for run in $(seq "$runs"); do
	for count in 1 "$jobs"; do
		fresh
		output=$(cd "$scratch" && "$lumora" bake "$level" --bounces "$bounces" --jobs "$count")
		# "... 351 probes rendered over 3 bounces in 1.3 s ..." and "... (0.21 s per room ..."
		perProbe=$(echo "$output" | sed -n 's/^ambient: .* \([0-9]*\) probes rendered over .* in \([0-9.]*\) s.*/\2 \1/p' |
			awk '{ printf "%.2f", $1 * 1000 / $2 }')
		perRoom=$(echo "$output" | sed -n 's/^reflections: .*(\([0-9.]*\) s per room.*/\1/p')
		echo "run $run, $count process(es): ambient $perProbe ms per probe per bounce, reflections $perRoom s per room"
		ambient[$count]+="$perProbe "
		rooms[$count]+="$perRoom "
		mkdir -p "$scratch/out$count"
		cp "$scratch/data/XML/levels/$level/ambient.sh" "$scratch/out$count/"
		cp -r "$scratch/data/Cubemaps/$level" "$scratch/out$count/cubemaps"
	done
	if ! diff -r "$scratch/out1" "$scratch/out$jobs" >/dev/null; then
		echo "the shared bake's files differ from the one-process bake's" >&2
		exit 1
	fi
done
median() { tr ' ' '\n' | grep -v '^$' | sort -g | awk '{ v[NR] = $1 } END { print v[int((NR + 1) / 2)] }'; }
for count in 1 "$jobs"; do
	echo "median, $count process(es): ambient $(echo "${ambient[$count]}" | median) ms per probe per bounce, reflections $(echo "${rooms[$count]}" | median) s per room"
done
echo "the shared bake's files equal the one-process bake's, byte for byte"
