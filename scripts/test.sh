#!/usr/bin/env bash
# Installs what is missing, builds, and runs every test: the whole suite built
# with AddressSanitizer and UndefinedBehaviorSanitizer, leak detection on (the
# fuzz corpora replayed among it), clang-tidy over the product's sources, the
# threaded tests again under ThreadSanitizer, and each fuzz target for a short
# run.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
cd "$root"
scripts/setup.sh

scripts/build.sh build-asan -DRECSCHED_SANITIZE=ON
ASAN_OPTIONS=detect_leaks=1 ctest --test-dir build-asan --output-on-failure -j"$(nproc)"

scripts/tidy.sh build-asan

# Debian's Qt is not built for ThreadSanitizer; see tests/tsan.supp.
scripts/build.sh build-tsan -DRECSCHED_TSAN=ON -DRECSCHED_BENCH=OFF
TSAN_OPTIONS="suppressions=$root/tests/tsan.supp halt_on_error=1 second_deadlock_stack=1" \
    ctest --test-dir build-tsan --output-on-failure -j"$(nproc)" -L threads

scripts/fuzz.sh "${FUZZ_SECONDS:-30}"
