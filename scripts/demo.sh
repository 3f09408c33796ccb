#!/usr/bin/env bash
# Builds and runs the demo program: installs what is missing, configures build/ (RelWithDebInfo,
# Ninja), builds tarn_demo only and runs it. The demo's last line on stderr is the error text the
# library publishes for a property that is not there.
set -euo pipefail

build="$("$(dirname "${BASH_SOURCE[0]}")/configure.sh" "$@")"
cmake --build "$build" -j2 --target tarn_demo
echo
"$build/examples/tarn_demo"
