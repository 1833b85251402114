#!/usr/bin/env bash
# Renders the main window to docs/screenshots/main-window.png (or the file given).
# Usage: scripts/screenshot.sh [OUTPUT.png] [BUILD_DIR] [-- zentra-pulse options]
set -euo pipefail
cd "$(dirname "$0")/.."
out="${1:-docs/screenshots/main-window.png}"
build="${2:-build/release}"
shift $(( $# > 2 ? 2 : $# ))
[ "${1:-}" = "--" ] && shift
gui="$build/app/zentra-pulse"
if [ ! -x "$gui" ]; then
  cmake --preset release
  cmake --build --preset release --target zentra-pulse
  gui=build/release/app/zentra-pulse
fi
mkdir -p "$(dirname "$out")"
if command -v xvfb-run >/dev/null 2>&1; then
  xvfb-run -a -s "-screen 0 1280x1024x24" "$gui" --screenshot "$out" "$@"
else
  QT_QPA_PLATFORM=offscreen "$gui" --screenshot "$out" "$@"
fi
echo "screenshot: $out"
