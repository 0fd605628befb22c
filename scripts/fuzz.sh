#!/usr/bin/env bash
# Builds the five libFuzzer programs (clang, AddressSanitizer + UBSan, coverage on every library
# they link) in build-fuzz/ and runs each for a fixed time on a copy of its committed seed corpus
# (tests/fuzz/corpus/<target>/, plus ../shared/testdata where present). Exits 1 on the first
# target that crashes, leaks, hangs or runs out of memory, naming the input that did it.
#   scripts/fuzz.sh              every target, 30 s each
#   scripts/fuzz.sh 300 al       one target, 5 minutes
# Replay a reported input:  ./build-fuzz/tests/fuzz/<target>_fuzz <input>
set -euo pipefail
cd "$(dirname "$0")/.."

seconds="${1:-30}"
shift $(( $# > 0 ? 1 : 0 ))
targets=("$@")
if [ "${#targets[@]}" -eq 0 ]; then
	targets=(dds collada al ambient level)
fi
dir=build-fuzz

launcher=()
if command -v ccache >/dev/null; then
	launcher=(-DCMAKE_C_COMPILER_LAUNCHER=ccache -DCMAKE_CXX_COMPILER_LAUNCHER=ccache)
fi
CC=clang CXX=clang++ cmake -S . -B "$dir" -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo -DLUMORA_FUZZ=ON \
	-DLUMORA_BUILD_TESTS=OFF -DLUMORA_BUILD_BENCH=OFF "${launcher[@]}" >/dev/null
cmake --build "$dir" -j "$(nproc)" --target "${targets[@]/%/_fuzz}"

# Inputs up to these sizes (bytes): the seeds' sizes with room to grow.
declare -A max_len=([dds]=70000 [collada]=60000 [al]=20000 [ambient]=20000 [level]=40000)
declare -A shared=([dds]=../shared/testdata/dds [collada]=../shared/testdata/collada)

status=0
passed=0
for target in "${targets[@]}"; do
	# Absolute: the level target works in a scratch directory of its own.
	work="$PWD/$dir/fuzz-run/$target"
	rm -rf "$work"
	mkdir -p "$work/corpus" "$work/artifacts"
	cp tests/fuzz/corpus/"$target"/* "$work/corpus/"
	if [ -n "${shared[$target]:-}" ] && [ -d "${shared[$target]}" ]; then
		find "${shared[$target]}" -maxdepth 1 -type f -size -"${max_len[$target]}"c \
			\( -iname '*.dds' -o -iname '*.dae' \) -exec cp {} "$work/corpus/" \;
	fi
	# Mesa's threads keep allocations until exit: the facade's target runs without the leak check.
	leaks=1
	[ "$target" = level ] && leaks=0
	echo "fuzz: $target for ${seconds}s on $(ls "$work/corpus" | wc -l) seeds"
	if ! ASAN_OPTIONS="detect_leaks=$leaks" UBSAN_OPTIONS=print_stacktrace=1 \
		"$dir/tests/fuzz/${target}_fuzz" -max_total_time="$seconds" -max_len="${max_len[$target]}" \
		-timeout=20 -rss_limit_mb=4096 -detect_leaks="$leaks" -print_final_stats=1 \
		-artifact_prefix="$work/artifacts/" "$work/corpus" >"$work/log.txt" 2>&1; then
		tail -n 60 "$work/log.txt"
		for input in "$work"/artifacts/*; do
			[ -e "$input" ] && echo "fuzz: $target failed on $input (replay: $dir/tests/fuzz/${target}_fuzz $input)"
		done
		echo "fuzz: $target failed; its log is $work/log.txt"
		status=1
		break
	fi
	grep -E '^stat::number_of_executed_units|^Done ' "$work/log.txt" | sed "s/^/fuzz: $target: /" || true
	passed=$((passed + 1))
done
echo "fuzz: $passed passed, $((${#targets[@]} - passed)) failed"
exit "$status"
