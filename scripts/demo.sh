#!/usr/bin/env bash
# Installs what is missing, builds plugin-host with the plug-in and the
# trace-log library, and runs the demonstration session.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
cd "$root"
scripts/setup.sh
cmake -S . -B build -DCMAKE_BUILD_TYPE=RelWithDebInfo >/dev/null
cmake --build build -j"$(nproc)" --target plugin-host QirnLogUtl
build/bin/plugin-host demo
