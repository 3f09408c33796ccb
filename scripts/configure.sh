#!/usr/bin/env bash
# Installs what is missing and configures the build folder the quick-start scripts share:
# build/ (or $TARN_BUILD_DIR), RelWithDebInfo, Ninja. Prints the folder.
#
#   scripts/configure.sh [extra CMake options...]
set -euo pipefail

root="$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)"
build="${TARN_BUILD_DIR:-$root/build}"

"$root/scripts/install-deps.sh" >&2

generator=(-G Ninja)
if [ -f "$build/CMakeCache.txt" ]; then
    generator=()  # keep the generator the folder was made with
fi
cmake -S "$root" -B "$build" "${generator[@]}" -DCMAKE_BUILD_TYPE=RelWithDebInfo "$@" >/dev/null
echo "$build"
