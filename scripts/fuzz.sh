#!/usr/bin/env bash
# scripts/fuzz.sh [SECONDS]: builds the libFuzzer targets with clang
# (build-fuzz/) and runs each for SECONDS (default 30), two at a time, from a
# copy of its corpus, so that new inputs never land in the repository. Any
# crash, leak or sanitizer report fails the run; the input that found it is
# left in build-fuzz/findings/ to be kept as a named corpus file.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
seconds=${1:-30}
cd "$root"

# target, corpus folder, dictionary (or -)
targets=(
    "fuzz_xml2json fuzz/xml2json/corpus -"
    "fuzz_recserver fuzz/recserver/corpus -"
    "fuzz_all_schedule_rec_info fuzz/translation/corpus fuzz/translation/translation.dict"
    "fuzz_timecard_compose fuzz/control/corpus/compose -"
    "fuzz_camera_list_edit fuzz/control/corpus/camera_list_edit fuzz/control/camera_list_edit.dict"
)

names=()
for entry in "${targets[@]}"; do names+=("${entry%% *}"); done
CC=clang CXX=clang++ scripts/build.sh build-fuzz -DRECSCHED_FUZZ=ON -DBUILD_TESTING=OFF \
    -DRECSCHED_BENCH=OFF -- "${names[@]}"

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
mkdir -p build-fuzz/findings

run() {
    local name=$1 corpus=$2 dict=$3
    local args=(-max_total_time="$seconds" -artifact_prefix="build-fuzz/findings/$name-" -print_final_stats=1)
    [ "$dict" = - ] || args+=(-dict="$dict")
    mkdir -p "$work/$name"
    cp -r "$corpus"/. "$work/$name/"
    if build-fuzz/bin/"$name" "${args[@]}" "$work/$name" >"$work/$name.log" 2>&1; then
        echo "$name: $(grep -m1 -o 'stat::number_of_executed_units: *[0-9]*' "$work/$name.log" | grep -o '[0-9]*$') runs in ${seconds}s, clean"
    else
        echo "$name: FOUND A FAULT (input in build-fuzz/findings/)"
        tail -40 "$work/$name.log"
        return 1
    fi
}

status=0
pids=()
for entry in "${targets[@]}"; do
    read -r name corpus dict <<<"$entry"
    run "$name" "$corpus" "$dict" &
    pids+=($!)
    if ((${#pids[@]} == 2)); then
        wait "${pids[0]}" || status=1
        pids=("${pids[1]}")
    fi
done
for pid in "${pids[@]}"; do wait "$pid" || status=1; done
exit $status
