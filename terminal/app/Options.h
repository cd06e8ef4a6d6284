#pragma once
// The terminal's command line.
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace term {

// One --open: a class name, optionally with the instrument it starts on.
struct OpenRequest {
  std::string className;
  std::int64_t productId = -1;
  std::string instrumentCode;  // empty: none
  // Start parameters (--param KEY=VALUE after the --open), as a saved layout gives them.
  std::map<std::string, std::string> params;
};

struct Options {
  bool help = false;
  bool version = false;
  bool headless = false;
  bool verbose = false;             // also show the views' log lines on stderr
  bool restoreLayout = true;        // --no-restore: start without the saved layout
  std::optional<double> seconds;    // simulated seconds to run, as fast as possible
  std::optional<std::uint64_t> seed;
  std::optional<int> instruments;
  std::optional<int> rate;          // field updates per second
  std::optional<double> pace;       // --pace: the watched instruments trade and quote X times as often
  std::optional<int> style;         // 1 light, 2 dark: this session only
  std::vector<OpenRequest> open;
  std::string snapshotDir;
  std::string dumpDir;
  std::optional<int> listInstruments;  // set: print the first N instruments and exit (0: all)
  std::string addonPath;
  std::string dataDir;
  std::string recordFile;           // --record: write the market the views receive here
  std::string traceFile;            // --trace-messages: every message a view receives, written here
  std::string replayFile;           // --replay: the market is this recording
  std::optional<double> speed;      // --speed: replay speed (needs --replay)
  // --real-time: a headless or --seconds run on the real clock (N wall seconds).
  bool realTime = false;
  std::string soakReport;           // --soak-report: memory and event-loop figures of a timed run
  std::string latencyReport;        // --latency-report: feed-to-pixel latency per view class
  bool saveChurn = false;           // --save-churn: save generation-stamped user data on every step
  std::optional<std::int64_t> checkChurn;  // --check-churn MIN: check the churned store and exit
};

// Parses argv. On a bad command line returns false with a one-line `error`.
bool ParseOptions(int argc, char** argv, Options& options, std::string& error);

// The --help text.
std::string UsageText(const char* program);

}  // namespace term
