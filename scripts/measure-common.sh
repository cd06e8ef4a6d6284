# Shared by scripts/soak, scripts/latency and scripts/crash-churn (sourced).
root="$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)"
terminal="${MV_BIN:-$root/build/bin}/terminal"

# Builds the terminal and the add-on when the build tree is there, else sets it up.
build_terminal() {
  if [ -f "$root/build/build.ninja" ]; then
    cmake --build "$root/build" --target terminal marketviews >/dev/null
  else
    "$root/scripts/setup.sh" build build -DCMAKE_BUILD_TYPE=RelWithDebInfo >/dev/null
  fi
}

# Copies the terminal and the add-on into `$1` and points `terminal` at the
# copy, so a rebuild during a long run does not pull the files from under it.
stage_terminal() {
  mkdir -p "$1/bin" "$1/lib"
  cp "$terminal" "$1/bin/terminal"
  cp "$(dirname "$terminal")"/../lib/*.so "$1/lib/"
  export LD_LIBRARY_PATH="$1/lib${LD_LIBRARY_PATH:+:$LD_LIBRARY_PATH}"
  terminal="$1/bin/terminal"
}

# "PRODUCTID:CODE" of the busiest stock, the one a first start shows: a
# zero-second run with the first-start layout dumps the market of what it shows.
busiest_stock() {
  local dir
  dir=$(mktemp -d /tmp/mv-busiest.XXXXXX)
  "$terminal" --headless --no-restore --seconds 0 --data-dir "$dir/data" --dump "$dir/dump" >/dev/null 2>&1
  local files code
  files=("$dir"/dump/market-trades-*.tsv)
  if [ ! -e "${files[0]}" ]; then
    rm -rf "$dir"
    echo "cannot find the busiest stock" >&2
    return 1
  fi
  code=$(basename "${files[0]}" .tsv); code=${code#market-trades-}
  rm -rf "$dir"
  # The whole list is read (an early exit would break the terminal's pipe).
  "$terminal" --list-instruments | awk -F'\t' -v c="$code" '$2 == c && !n++ { print $1 ":" $2 }'
}

# The six add-on views, the price view twice (one a board), on `$1`.
six_views() {
  echo --open CPriceViewAdv --open CPriceViewAdv --param User_field_display_mode=Board \
       --open "CMarketDepthAdv:$1" --open "CTimeAndSalesAdv:$1" --open "CTradeSummaryAdv:$1" \
       --open CPriceAlertList --open CNewPriceAlertAdv
}
