#!/usr/bin/env bash
# Installs what is missing, builds, and runs every test: the whole suite in a
# normal build, then the threaded tests again under ThreadSanitizer.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
cd "$root"
scripts/setup.sh

scripts/build.sh build
ctest --test-dir build --output-on-failure -j"$(nproc)"

# Debian's Qt is not built for ThreadSanitizer; see tests/tsan.supp.
scripts/build.sh build-tsan -DRECSCHED_TSAN=ON -DRECSCHED_BENCH=OFF
TSAN_OPTIONS="suppressions=$root/tests/tsan.supp halt_on_error=1 second_deadlock_stack=1" \
    ctest --test-dir build-tsan --output-on-failure -j"$(nproc)" -L threads
