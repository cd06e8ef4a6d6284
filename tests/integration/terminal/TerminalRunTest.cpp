// Runs the terminal binary headless as a child process and checks what a user
// or a script sees: exit codes, messages, files, and the saved layout.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>
#include <sstream>

#include "terminal/sim/Market.h"
#include "terminal/store/Store.h"

namespace fs = std::filesystem;

namespace {

struct RunResult {
  int exitCode = -1;
  std::string out, err;
};

fs::path BinDir() {
  const char* bin = std::getenv("MV_BIN");
  return bin ? fs::path(bin) : fs::read_symlink("/proc/self/exe").parent_path().parent_path() / "bin";
}

// Runs bin/terminal with `args`; waits for it with waitpid.
RunResult RunTerminal(const std::vector<std::string>& args) {
  const std::string exe = (BinDir() / "terminal").string();
  int out[2], err[2];
  if (pipe(out) != 0 || pipe(err) != 0) return {};
  const pid_t pid = fork();
  if (pid == 0) {
    dup2(out[1], STDOUT_FILENO);
    dup2(err[1], STDERR_FILENO);
    close(out[0]); close(out[1]); close(err[0]); close(err[1]);
    std::vector<char*> argv{const_cast<char*>(exe.c_str())};
    for (const auto& a : args) argv.push_back(const_cast<char*>(a.c_str()));
    argv.push_back(nullptr);
    execv(exe.c_str(), argv.data());
    _exit(127);
  }
  close(out[1]);
  close(err[1]);
  RunResult r;
  pollfd fds[2] = {{out[0], POLLIN, 0}, {err[0], POLLIN, 0}};
  int open = 2;
  char buf[4096];
  while (open > 0) {
    if (poll(fds, 2, -1) < 0) break;
    for (int i = 0; i < 2; ++i) {
      if (fds[i].fd < 0 || !(fds[i].revents & (POLLIN | POLLHUP | POLLERR))) continue;
      const ssize_t n = read(fds[i].fd, buf, sizeof buf);
      if (n <= 0) { close(fds[i].fd); fds[i].fd = -1; --open; continue; }
      (i == 0 ? r.out : r.err).append(buf, static_cast<std::size_t>(n));
    }
  }
  int status = 0;
  waitpid(pid, &status, 0);
  r.exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
  return r;
}

struct TempDir {
  fs::path path;
  TempDir() {
    std::string tmpl = (fs::temp_directory_path() / "term_run_XXXXXX").string();
    path = mkdtemp(tmpl.data());
  }
  ~TempDir() { fs::remove_all(path); }
};

std::vector<std::string> Lines(const std::string& text) {
  std::vector<std::string> out;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) out.push_back(line);
  return out;
}

std::string ReadFile(const fs::path& p) {
  std::ifstream in(p, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), {}};
}

std::set<std::string> FileNames(const fs::path& dir) {
  std::set<std::string> out;
  if (!fs::exists(dir)) return out;
  for (const auto& e : fs::directory_iterator(dir)) out.insert(e.path().filename().string());
  return out;
}

// Every line on stderr is the terminal's own ("terminal: ...").
void ExpectOnlyOwnLines(const std::string& err) {
  for (const auto& line : Lines(err)) EXPECT_EQ(line.rfind("terminal: ", 0), 0u) << "foreign output: " << line;
}

const std::vector<std::string> kSmallMarket = {"--headless", "--instruments", "200", "--seed", "7"};

std::vector<std::string> With(std::vector<std::string> base, const std::vector<std::string>& more) {
  base.insert(base.end(), more.begin(), more.end());
  return base;
}

}  // namespace

TEST(TerminalRefusal, MissingAddonIsNamedAndRefused) {
  TempDir dir;
  const RunResult r = RunTerminal(With(kSmallMarket, {"--data-dir", dir.path.string(), "--addon", "/nowhere/libmarketviews.so"}));
  EXPECT_EQ(r.exitCode, 1);
  EXPECT_NE(r.err.find("cannot load the add-on /nowhere/libmarketviews.so"), std::string::npos) << r.err;
  EXPECT_EQ(Lines(r.err).size(), 1u) << r.err;
  EXPECT_TRUE(r.out.empty());
  EXPECT_FALSE(fs::exists(dir.path / "terminal.db")) << "a refused start touches no data";
  EXPECT_NE(ReadFile(dir.path / "logs" / "terminal.log").find("cannot load the add-on /nowhere/libmarketviews.so"),
            std::string::npos)
      << "and says why in the log";
}

TEST(TerminalRefusal, LibraryWithoutEntryPointIsRefused) {
  // A real shared library of the project that is not an add-on.
  const fs::path lib = BinDir().parent_path() / "lib" / "libplatform.so";
  ASSERT_TRUE(fs::exists(lib)) << lib;
  const RunResult r = RunTerminal(With(kSmallMarket, {"--addon", lib.string()}));
  EXPECT_EQ(r.exitCode, 1);
  EXPECT_NE(r.err.find("has no GetBaseViewPointer entry point"), std::string::npos) << r.err;
}

TEST(TerminalRefusal, UnknownClassAndBadOptionsAreRefused) {
  TempDir dir;
  RunResult r = RunTerminal(With(kSmallMarket, {"--data-dir", dir.path.string(), "--open", "CPriceView"}));
  EXPECT_EQ(r.exitCode, 2);
  EXPECT_NE(r.err.find("unknown view class \"CPriceView\""), std::string::npos) << r.err;
  EXPECT_NE(r.err.find("CPriceViewAdv"), std::string::npos) << "the message lists the known classes: " << r.err;

  r = RunTerminal({"--seconds", "soon"});
  EXPECT_EQ(r.exitCode, 2);
  EXPECT_NE(r.err.find("--seconds"), std::string::npos) << r.err;

  r = RunTerminal({"--open", "CMarketDepthAdv:x:D05"});
  EXPECT_EQ(r.exitCode, 2);
  EXPECT_NE(r.err.find("product id"), std::string::npos) << r.err;
}

TEST(TerminalRefusal, UnknownInstrumentInOpenEndsAHeadlessRunWithTwo) {
  TempDir dir;
  const RunResult r = RunTerminal(With(kSmallMarket, {"--data-dir", dir.path.string(), "--seconds", "1", "--open",
                                                      "CMarketDepthAdv:101:NOSUCH", "--snapshot",
                                                      (dir.path / "shots").string()}));
  EXPECT_EQ(r.exitCode, 2) << r.err;
  EXPECT_NE(r.err.find("unknown instrument 101:NOSUCH"), std::string::npos) << r.err;
  EXPECT_NE(r.err.find("--list-instruments"), std::string::npos) << "the message says where to look: " << r.err;
  EXPECT_EQ(r.err.find("running"), std::string::npos) << "nothing ran: " << r.err;
  EXPECT_FALSE(fs::exists(dir.path / "shots"));
  EXPECT_NE(ReadFile(dir.path / "logs" / "terminal.log").find("unknown instrument 101:NOSUCH"), std::string::npos);
}

TEST(TerminalList, ListInstrumentsPrintsTabSeparatedRowsDeterministically) {
  const RunResult a = RunTerminal({"--list-instruments", "5", "--seed", "3", "--instruments", "200"});
  const RunResult b = RunTerminal({"--list-instruments", "5", "--seed", "3", "--instruments", "200"});
  ASSERT_EQ(a.exitCode, 0) << a.err;
  EXPECT_TRUE(a.err.empty()) << a.err;
  EXPECT_EQ(a.out, b.out);
  const auto lines = Lines(a.out);
  ASSERT_EQ(lines.size(), 5u);
  for (const auto& line : lines) {
    EXPECT_EQ(std::count(line.begin(), line.end(), '\t'), 3) << line;
    EXPECT_NO_THROW((void)std::stoll(line.substr(0, line.find('\t')))) << line;
  }
  const RunResult all = RunTerminal({"--list-instruments", "--instruments", "200"});
  EXPECT_GE(Lines(all.out).size(), 200u);
}

// One headless session with docks of add-on and terminal classes, then a second
// session that must come back with the same docks from the saved layout.
TEST(TerminalHeadless, RunWritesFilesAndLayoutRoundTrips) {
  TempDir dir;
  const fs::path data = dir.path / "data";
  const RunResult list = RunTerminal({"--list-instruments", "1", "--seed", "7", "--instruments", "200"});
  ASSERT_EQ(list.exitCode, 0);
  const std::string first = Lines(list.out).at(0);
  const std::string pid = first.substr(0, first.find('\t'));
  const std::string code = first.substr(first.find('\t') + 1, first.find('\t', first.find('\t') + 1) - first.find('\t') - 1);
  const std::string link = ":" + pid + ":" + code;

  const RunResult r = RunTerminal(With(kSmallMarket,
      {"--data-dir", data.string(), "--seconds", "3", "--open", "CPriceViewAdv", "--open", "CMarketDepthAdv" + link,
       "--open", "CMarketDepthAdv" + link, "--open", "CTradeView" + link, "--open", "CInsExpViewEx",
       "--open", "CStockAnalytics" + link, "--dump", (dir.path / "dump1").string(), "--snapshot",
       (dir.path / "shots1").string()}));
  ASSERT_EQ(r.exitCode, 0) << r.err;
  ExpectOnlyOwnLines(r.err);
  EXPECT_TRUE(r.out.empty()) << r.out;

  const std::set<std::string> shots = FileNames(dir.path / "shots1");
  for (const char* name : {"terminal.png", "CPriceViewAdv-1.png", "CMarketDepthAdv-1.png", "CMarketDepthAdv-2.png",
                           "CTradeView-1.png", "CInsExpViewEx-1.png", "CStockAnalytics-1.png"})
    EXPECT_TRUE(shots.count(name)) << name;
  EXPECT_EQ(ReadFile(dir.path / "shots1" / "terminal.png").substr(1, 3), "PNG");

  // The terminal's own tables follow the dump convention.
  const auto explorer = Lines(ReadFile(dir.path / "dump1" / "CInsExpViewEx-1.tsv"));
  ASSERT_GE(explorer.size(), 2u);
  EXPECT_EQ(explorer[0], "Product\tCode\tExchange\tName\tType");
  EXPECT_EQ(explorer[1].substr(0, explorer[1].find('\t')), pid);
  const auto analytics = ReadFile(dir.path / "dump1" / "CStockAnalytics-1.tsv");
  EXPECT_NE(analytics.find("Instrument\t"), std::string::npos) << analytics;
  EXPECT_NE(analytics.find("Last\t"), std::string::npos) << analytics;

  // The layout in the database.
  {
    term::StoreOpenReport report;
    std::string error;
    auto store = term::Store::Open(data, report, error);
    ASSERT_TRUE(store) << error;
    const auto layout = store->LoadLayout();
    std::vector<std::string> classes;
    for (const auto& v : layout.views) classes.push_back(v.className);
    EXPECT_EQ(classes, (std::vector<std::string>{"CPriceViewAdv", "CMarketDepthAdv", "CMarketDepthAdv", "CTradeView",
                                                 "CInsExpViewEx", "CStockAnalytics"}));
    EXPECT_EQ(layout.views[3].productId, std::stoll(pid));
    EXPECT_EQ(layout.views[3].instrumentCode, code);
    EXPECT_FALSE(layout.windowState.empty());
  }

  // Second session: nothing opened on the command line; the saved docks come back.
  const RunResult again = RunTerminal(With(kSmallMarket, {"--data-dir", data.string(), "--seconds", "1", "--snapshot",
                                                    (dir.path / "shots2").string(), "--dump",
                                                    (dir.path / "dump2").string()}));
  ASSERT_EQ(again.exitCode, 0) << again.err;
  ExpectOnlyOwnLines(again.err);
  EXPECT_EQ(FileNames(dir.path / "shots2"), shots);
  // The analytics view came back on its instrument.
  const auto analytics2 = ReadFile(dir.path / "dump2" / "CStockAnalytics-1.tsv");
  EXPECT_NE(analytics2.find("Instrument\t" + code), std::string::npos) << analytics2;
}

TEST(TerminalHeadless, CorruptDatabaseIsSetAsideAndReported) {
  TempDir dir;
  const std::string garbage(4096, 'z');
  { std::ofstream(dir.path / "terminal.db", std::ios::binary) << garbage; }
  const RunResult r = RunTerminal(With(kSmallMarket, {"--data-dir", dir.path.string(), "--seconds", "0.2", "--open",
                                                "CInsExpViewEx"}));
  ASSERT_EQ(r.exitCode, 0) << r.err;
  EXPECT_NE(r.err.find("cannot be read"), std::string::npos) << r.err;
  EXPECT_NE(r.err.find("kept as"), std::string::npos) << r.err;
  int kept = 0;
  for (const auto& name : FileNames(dir.path))
    if (name.rfind("terminal.db.corrupt-", 0) == 0 && ReadFile(dir.path / name) == garbage) ++kept;
  EXPECT_EQ(kept, 1);
  EXPECT_NE(ReadFile(dir.path / "logs" / "terminal.log").find("cannot be read"), std::string::npos)
      << "the log says it too";
}

// The very first start: the price view, and depth and trades of the busiest
// stock (not an index, which has no book).
TEST(TerminalHeadless, FirstStartShowsTheDepthAndTradesOfALiquidStock) {
  TempDir dir;
  const RunResult r = RunTerminal(With(kSmallMarket, {"--data-dir", dir.path.string(), "--seconds", "2", "--dump",
                                                      (dir.path / "dump").string()}));
  ASSERT_EQ(r.exitCode, 0) << r.err;
  sim::MarketConfig config;
  config.seed = 7;
  config.instruments = 200;
  sim::Market market(config);
  const auto& stock = market.Instruments().at(static_cast<std::size_t>(market.LiquidStock()));
  ASSERT_EQ(stock.productType, "ES");
  term::StoreOpenReport report;
  std::string error;
  auto store = term::Store::Open(dir.path, report, error);
  ASSERT_TRUE(store) << error;
  int onStock = 0;
  for (const auto& v : store->LoadLayout().views) {
    if (v.className != "CMarketDepthAdv" && v.className != "CTimeAndSalesAdv") continue;
    EXPECT_EQ(v.productId, stock.productId) << v.className;
    EXPECT_EQ(v.instrumentCode, stock.instrumentCode) << v.className;
    ++onStock;
  }
  EXPECT_EQ(onStock, 2);
  // The depth grid has a book: a bid below an ask on the first line.
  const auto depth = Lines(ReadFile(dir.path / "dump" / "CMarketDepthAdv-1.tsv"));
  ASSERT_GE(depth.size(), 3u);
  auto cells = [](const std::string& line) {
    std::vector<std::string> out;
    std::istringstream in(line);
    for (std::string cell; std::getline(in, cell, '\t');) out.push_back(cell);
    return out;
  };
  const auto heads = cells(depth[0]), first = cells(depth[1]);
  const auto bidAt = std::find(heads.begin(), heads.end(), "Bid") - heads.begin();
  const auto askAt = std::find(heads.begin(), heads.end(), "Ask") - heads.begin();
  ASSERT_LT(std::size_t(std::max(bidAt, askAt)), first.size()) << depth[0] << "\n" << depth[1];
  const double bid = std::stod(first[std::size_t(bidAt)]), ask = std::stod(first[std::size_t(askAt)]);
  EXPECT_GT(bid, 0);
  EXPECT_LT(bid, ask);
}

// Killed with SIGTERM in the middle of a long run: the terminal stops, saves its
// layout and exits normally.
TEST(TerminalHeadless, TermSignalStopsTheRunAndKeepsTheLayout) {
  TempDir dir;
  const std::string exe = (BinDir() / "terminal").string();
  int err[2];
  ASSERT_EQ(pipe(err), 0);
  const pid_t pid = fork();
  if (pid == 0) {
    dup2(err[1], STDERR_FILENO);
    close(err[0]);
    close(err[1]);
    execl(exe.c_str(), exe.c_str(), "--headless", "--instruments", "100", "--data-dir", dir.path.c_str(), "--seconds",
          "1000000", "--open", "CTradeView", "--open", "CFNews", static_cast<char*>(nullptr));
    _exit(127);
  }
  close(err[1]);
  std::string text;
  char buf[512];
  bool signalled = false;
  for (ssize_t n; (n = read(err[0], buf, sizeof buf)) > 0;) {
    text.append(buf, static_cast<std::size_t>(n));
    if (!signalled && text.find("running") != std::string::npos) {
      kill(pid, SIGTERM);
      signalled = true;
    }
  }
  close(err[0]);
  int status = 0;
  ASSERT_EQ(waitpid(pid, &status, 0), pid);
  ASSERT_TRUE(signalled) << text;
  ASSERT_TRUE(WIFEXITED(status)) << "ended by a signal: " << text;
  EXPECT_EQ(WEXITSTATUS(status), 0) << text;
  EXPECT_NE(text.find("stopping"), std::string::npos) << text;

  term::StoreOpenReport report;
  std::string error;
  auto store = term::Store::Open(dir.path, report, error);
  ASSERT_TRUE(store) << error;
  EXPECT_EQ(store->LoadLayout().views.size(), 2u);
}
