#include "terminal/app/Options.h"

#include <charconv>
#include <cstring>
#include <limits>

namespace term {

namespace {

template <typename T>
bool ParseNumber(const std::string& text, T& out) {
  const char* end = text.data() + text.size();
  auto [p, ec] = std::from_chars(text.data(), end, out);
  return ec == std::errc() && p == end && !text.empty();
}

bool ParseOpen(const std::string& text, OpenRequest& out, std::string& error) {
  // CLASS or CLASS:PRODUCTID:CODE. The code may itself hold ':'.
  const auto first = text.find(':');
  out.className = text.substr(0, first);
  if (out.className.empty()) {
    error = "--open needs a class name, as in --open CMarketDepthAdv:1:D05";
    return false;
  }
  if (first == std::string::npos) return true;
  const auto second = text.find(':', first + 1);
  if (second == std::string::npos) {
    error = "--open " + text + ": write CLASS or CLASS:PRODUCTID:CODE";
    return false;
  }
  if (!ParseNumber(text.substr(first + 1, second - first - 1), out.productId) || out.productId < 0) {
    error = "--open " + text + ": the product id must be a whole number";
    return false;
  }
  out.instrumentCode = text.substr(second + 1);
  if (out.instrumentCode.empty()) {
    error = "--open " + text + ": the instrument code is missing";
    return false;
  }
  return true;
}

}  // namespace

bool ParseOptions(int argc, char** argv, Options& o, std::string& error) {
  for (int i = 1; i < argc; ++i) {
    std::string arg = argv[i];
    std::string inlineValue;
    bool hasInline = false;
    if (arg.rfind("--", 0) == 0) {
      if (const auto eq = arg.find('='); eq != std::string::npos) {
        inlineValue = arg.substr(eq + 1);
        arg.resize(eq);
        hasInline = true;
      }
    }
    auto value = [&](std::string& out) -> bool {
      if (hasInline) { out = inlineValue; return true; }
      if (i + 1 >= argc) { error = arg + " needs a value"; return false; }
      out = argv[++i];
      return true;
    };
    auto number = [&](auto& out, long long min, long long max) -> bool {
      std::string text;
      if (!value(text)) return false;
      long long n = 0;
      if (!ParseNumber(text, n) || n < min || n > max) {
        error = arg + ": expected a whole number from " + std::to_string(min) + " to " + std::to_string(max) +
                ", got \"" + text + "\"";
        return false;
      }
      out = static_cast<std::remove_reference_t<decltype(*out)>>(n);
      return true;
    };
    // A factor from `min` to `max`: `what` names it, `one` says what 1 means.
    auto factor = [&](std::optional<double>& out, double min, double max, const char* what, const char* one) -> bool {
      std::string text;
      if (!value(text)) return false;
      double x = 0;
      if (!ParseNumber(text, x) || !(x >= min) || !(x <= max)) {
        char range[64];
        std::snprintf(range, sizeof range, "%g to %g", min, max);
        error = arg + ": expected " + what + " from " + range + " (1 is " + one + "), got \"" + text + "\"";
        return false;
      }
      out = x;
      return true;
    };
    if (arg == "-h" || arg == "--help") o.help = true;
    else if (arg == "--version") o.version = true;
    else if (arg == "--headless") o.headless = true;
    else if (arg == "-v" || arg == "--verbose") o.verbose = true;
    else if (arg == "--no-restore") o.restoreLayout = false;
    else if (arg == "--real-time") o.realTime = true;
    else if (arg == "--save-churn") o.saveChurn = true;
    else if (arg == "--soak-report") {
      if (!value(o.soakReport)) return false;
      if (o.soakReport.empty()) { error = "--soak-report needs a file name"; return false; }
    } else if (arg == "--latency-report") {
      if (!value(o.latencyReport)) return false;
      if (o.latencyReport.empty()) { error = "--latency-report needs a file name"; return false; }
    } else if (arg == "--check-churn") {
      if (!number(o.checkChurn, 0, std::numeric_limits<std::int64_t>::max())) return false;
    }
    else if (arg == "--seconds") {
      std::string text;
      if (!value(text)) return false;
      double s = 0;
      if (!ParseNumber(text, s) || !(s >= 0) || s > 1e7) {
        error = "--seconds: expected a number of simulated seconds, got \"" + text + "\"";
        return false;
      }
      o.seconds = s;
    } else if (arg == "--seed") {
      std::string text;
      if (!value(text)) return false;
      std::uint64_t s = 0;
      if (!ParseNumber(text, s)) { error = "--seed: expected a whole number, got \"" + text + "\""; return false; }
      o.seed = s;
    } else if (arg == "--instruments") {
      if (!number(o.instruments, 1, 500000)) return false;
    } else if (arg == "--rate") {
      if (!number(o.rate, 0, 10000000)) return false;
    } else if (arg == "--pace") {
      if (!factor(o.pace, 0.1, 100, "a factor", "the market as it is")) return false;
    } else if (arg == "--open") {
      std::string text;
      if (!value(text)) return false;
      OpenRequest r;
      if (!ParseOpen(text, r, error)) return false;
      o.open.push_back(std::move(r));
    } else if (arg == "--param") {
      std::string text;
      if (!value(text)) return false;
      const auto eq = text.find('=');
      if (o.open.empty()) {
        error = "--param " + text + ": comes after the --open of the view it is for";
        return false;
      }
      if (eq == std::string::npos || eq == 0) {
        error = "--param " + text + ": write KEY=VALUE";
        return false;
      }
      o.open.back().params[text.substr(0, eq)] = text.substr(eq + 1);
    } else if (arg == "--style") {
      std::string text;
      if (!value(text)) return false;
      if (text == "light" || text == "1") o.style = 1;
      else if (text == "dark" || text == "2") o.style = 2;
      else {
        error = "--style: expected light or dark, got \"" + text + "\"";
        return false;
      }
    } else if (arg == "--snapshot") {
      if (!value(o.snapshotDir)) return false;
    } else if (arg == "--dump") {
      if (!value(o.dumpDir)) return false;
    } else if (arg == "--addon") {
      if (!value(o.addonPath)) return false;
    } else if (arg == "--data-dir") {
      if (!value(o.dataDir)) return false;
    } else if (arg == "--record") {
      if (!value(o.recordFile)) return false;
      if (o.recordFile.empty()) { error = "--record needs a file name"; return false; }
    } else if (arg == "--trace-messages") {
      if (!value(o.traceFile)) return false;
      if (o.traceFile.empty()) { error = "--trace-messages needs a file name"; return false; }
    } else if (arg == "--replay") {
      if (!value(o.replayFile)) return false;
      if (o.replayFile.empty()) { error = "--replay needs a file name"; return false; }
    } else if (arg == "--speed") {
      if (!factor(o.speed, 0.1, 1000, "a speed", "real time")) return false;
    } else if (arg == "--list-instruments") {
      // The count is optional: take the next word only when it is a number.
      if (hasInline) {
        if (!number(o.listInstruments, 0, std::numeric_limits<int>::max())) return false;
      } else if (i + 1 < argc && argv[i + 1][0] != '-') {
        if (!number(o.listInstruments, 0, std::numeric_limits<int>::max())) return false;
      } else {
        o.listInstruments = 0;
      }
    } else {
      error = "unknown option \"" + std::string(argv[i]) + "\" (see --help)";
      return false;
    }
  }
  if (o.speed && o.replayFile.empty()) {
    error = "--speed sets the speed of a replay; use it with --replay FILE";
    return false;
  }
  if (!o.recordFile.empty() && o.recordFile == o.replayFile) {
    error = "--record and --replay name the same file";
    return false;
  }
  if ((!o.snapshotDir.empty() || !o.dumpDir.empty()) && !o.seconds && !o.headless) {
    // Snapshots and dumps are taken at the end of a timed run.
    error = "--snapshot and --dump need --seconds N (or --headless)";
    return false;
  }
  const bool timed = o.headless || o.seconds;
  if (o.realTime && !timed) {
    error = "--real-time is for a headless or --seconds run (a run with a window is always on the real clock)";
    return false;
  }
  if (!o.soakReport.empty() && (!timed || o.realTime)) {
    error = "--soak-report measures a run on the virtual clock: use it with --headless or --seconds N";
    return false;
  }
  if (!o.latencyReport.empty() && timed && !o.realTime) {
    error = "--latency-report needs the real clock: add --real-time to --headless or --seconds";
    return false;
  }
  if (o.saveChurn && (!timed || o.realTime)) {
    error = "--save-churn runs with --headless or --seconds N on the virtual clock";
    return false;
  }
  return true;
}

std::string UsageText(const char* program) {
  std::string p = program ? program : "terminal";
  return "Usage: " + p + R"( [options]

The trading terminal with its simulated market. It loads the market views add-on
and shows each view in a dock; the layout is restored from the last session.

Options:
  --addon PATH            the add-on library (default: libmarketviews.so in ../lib
                          next to the executable)
  --data-dir DIR          where settings, watchlists, alerts, layout and logs live
                          (default: $XDG_DATA_HOME/marketviews-terminal)
  --open CLASS[:PRODUCTID:CODE]
                          open a view, optionally on an instrument (repeatable);
                          classes: CPriceViewAdv CMarketDepthAdv CTimeAndSalesAdv
                          CTradeSummaryAdv CPriceAlertList CNewPriceAlertAdv
                          CTradeView CBranticChartView CInsExpViewEx
                          CStockAnalytics CFNews
  --param KEY=VALUE       a start parameter of the view of the --open before it
                          (repeatable), as a saved layout gives it back, e.g.
                          --open CPriceViewAdv --param User_field_display_mode=Board
  --no-restore            do not reopen the saved layout
  --headless              no window system (Qt offscreen) and a virtual clock
  --seconds N             run N simulated seconds as fast as possible, then save
                          and exit (without it, a headless run lasts 10 seconds)
  --seed N                seed of the simulated market (same seed, same market)
  --instruments N         number of simulated instruments (1 to 500000)
  --rate N                the most simulated field updates per second
  --pace X                the watched instruments trade and quote X times as often
                          (0.1 to 100; 10 with --rate 40000: ten times the default feed)
  --style light|dark      the style of this session (the Display menu's choice is kept
                          for the next; this one is not)
  --record FILE           write the market the views receive (reference data and
                          every value, with its market time) to FILE, compressed
  --replay FILE           play a recording instead of the simulated market (a
                          headless run lasts as long as the recording)
  --trace-messages FILE   write every message the views receive (number and record,
                          as the fuzz harnesses read them) to FILE
  --speed X               replay speed, 0.1 to 1000 (default 1: as recorded)
  --real-time             with --headless or --seconds: run on the real clock for N
                          seconds of wall time instead of as fast as possible
  --soak-report FILE      with --headless or --seconds: sample the memory in use
                          (RSS) every simulated minute and time every turn of the
                          event loop; write the figures to FILE and print them
  --latency-report FILE   on the real clock: stamp every value pushed to a view and
                          the end of that view's next paint; write p50, p99 and the
                          worst delay per view class to FILE and print them
  --save-churn            with --headless or --seconds: save watchlists, alerts,
                          settings and the layout again on every step, each save
                          stamped with a generation (a crash-safety test)
  --check-churn MIN       check a store written by --save-churn (every set whole,
                          none older than generation MIN), print it and exit
  --snapshot DIR          at the end, write a PNG of the main window and of each view
  --dump DIR              at the end, write each view's grid as DIR/<Class>-<n>.tsv,
                          the market's quotes of the shown instruments as
                          DIR/market-quotes.tsv, the trade tape of each shown
                          instrument as DIR/market-trades-<code>.tsv, and the
                          volume by price of each trade summary's instrument as
                          DIR/market-summary-<code>.tsv
  --list-instruments [N]  print the first N simulated instruments (all without N):
                          product id, instrument code, exchange code, name;
                          with --replay, the recording's instruments
  -v, --verbose           also print the views' log lines
  -h, --help              this text
)";
}

}  // namespace term
