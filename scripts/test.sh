#!/usr/bin/env bash
# Builds everything and runs every test: installs what is missing, configures build/
# (RelWithDebInfo, Ninja), builds all targets and runs ctest.
#
#   scripts/test.sh [extra CMake options...]
#
# TARN_BUILD_DIR chooses another build folder (CI uses one per configuration).
set -euo pipefail

build="$("$(dirname "${BASH_SOURCE[0]}")/configure.sh" "$@")"
cmake --build "$build" -j2
ctest --test-dir "$build" --output-on-failure -j2
