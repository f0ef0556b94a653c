#!/usr/bin/env bash
# scripts/build.sh DIR [cmake options...] [-- targets...]: configures and
# builds into DIR; everything, or only the targets named after "--".
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
dir=$1
shift
options=()
while (($#)) && [ "$1" != -- ]; do
    options+=("$1")
    shift
done
targets=()
if (($#)); then
    shift
    targets=(--target "$@")
fi
# ccache makes the repeated builds (the test build, the ThreadSanitizer build,
# a second run) cheap; a build works without it.
launcher=()
command -v ccache >/dev/null && launcher=(-DCMAKE_CXX_COMPILER_LAUNCHER=ccache -DCMAKE_C_COMPILER_LAUNCHER=ccache)
cmake -S "$root" -B "$dir" -DCMAKE_BUILD_TYPE=RelWithDebInfo "${launcher[@]}" "${options[@]}" >/dev/null
cmake --build "$dir" -j"$(nproc)" "${targets[@]}"
