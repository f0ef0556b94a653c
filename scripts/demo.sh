#!/usr/bin/env bash
# Installs what is missing, builds, and runs the demonstration session.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
cd "$root"
scripts/setup.sh
scripts/build.sh build
if [ -x build/bin/plugin-host ]; then
    build/bin/plugin-host demo
else
    ctest --test-dir build --output-on-failure
fi
