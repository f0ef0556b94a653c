#!/usr/bin/env bash
# scripts/tidy.sh [BUILD_DIR]: clang-tidy with the repository's .clang-tidy
# over the product's sources (everything outside tests/, bench/ and fuzz/),
# using the compile commands of an existing build (default build/). Any
# finding fails the run.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
build=${1:-build}
cd "$root"
git ls-files '*.cpp' | grep -v -E '^(tests|bench|fuzz)/' |
    xargs -P"$(nproc)" -n4 clang-tidy -p "$build" --quiet --warnings-as-errors='*' 2>/dev/null
echo "clang-tidy: clean"
