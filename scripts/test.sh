#!/usr/bin/env bash
# Builds everything and runs every test: installs what is missing, configures build/
# (RelWithDebInfo, Ninja), builds all targets and runs ctest.
#
#   scripts/test.sh [extra CMake options...]
#
# TARN_BUILD_DIR chooses another build folder (CI uses one per configuration).
set -euo pipefail

root="$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)"
build="${TARN_BUILD_DIR:-$root/build}"

"$root/scripts/install-deps.sh"

generator=(-G Ninja)
if [ -f "$build/CMakeCache.txt" ]; then
    generator=()  # keep the generator the folder was made with
fi
cmake -S "$root" -B "$build" "${generator[@]}" -DCMAKE_BUILD_TYPE=RelWithDebInfo "$@" >/dev/null
cmake --build "$build" -j2
ctest --test-dir "$build" --output-on-failure -j2
