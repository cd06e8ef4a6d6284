#!/usr/bin/env bash
# Shared set-up for ./run and ./test: installs what is missing (Debian 12),
# then configures and builds one build tree incrementally.
#   scripts/setup.sh install
#   scripts/setup.sh build <dir> [extra cmake args...]
set -euo pipefail
root="$(cd "$(dirname "$0")/.." && pwd)"

packages=(
  g++ cmake ninja-build pkg-config binutils
  qt6-base-dev qt6-charts-dev libqt6opengl6-dev libgl-dev
  libjsoncpp-dev libfmt-dev libspdlog-dev libsqlite3-dev
  libgtest-dev libgmock-dev libbenchmark-dev libzstd-dev
  fonts-dejavu-core
)

install_missing() {
  local missing=()
  for p in "${packages[@]}"; do
    dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
  done
  [ ${#missing[@]} -eq 0 ] && return 0
  echo "== installing: ${missing[*]}"
  local sudo=""
  [ "$(id -u)" -eq 0 ] || sudo="sudo"
  $sudo apt-get update -qq
  DEBIAN_FRONTEND=noninteractive $sudo apt-get install -y -qq --no-install-recommends "${missing[@]}" >/dev/null
}

configure_and_build() {
  local dir="$1"; shift
  local launcher=()
  command -v ccache >/dev/null 2>&1 && launcher=(-DCMAKE_CXX_COMPILER_LAUNCHER=ccache)
  if [ ! -f "$root/$dir/build.ninja" ]; then
    cmake -S "$root" -B "$root/$dir" -G Ninja "${launcher[@]}" "$@" >/dev/null
  fi
  cmake --build "$root/$dir" -j "$(nproc)"
}

case "${1:-}" in
  install) install_missing ;;
  build) shift; configure_and_build "$@" ;;
  *) echo "usage: $0 install | build <dir> [cmake args]" >&2; exit 2 ;;
esac
