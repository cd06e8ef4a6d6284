// The terminal: loads the market views add-on and hosts its views in docks on
// a simulated market. See --help.
#include <QApplication>
#include <QSocketNotifier>
#include <csignal>
#include <fcntl.h>
#include <unistd.h>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "hostconfig/UserSettings.h"
#include "platform/Platform.h"
#include "terminal/app/AddonLoader.h"
#include "terminal/app/MainWindow.h"
#include "terminal/app/Options.h"
#include "terminal/app/TerminalApp.h"
#include "terminal/app/TerminalApplication.h"
#include "terminal/app/SaveChurn.h"
#include "terminal/host/MarketRecording.h"
#include "terminal/host/Services.h"
#include "terminal/sim/Market.h"
#include "terminal/store/SqliteSettingsStorage.h"
#include "terminal/store/Store.h"
#include "terminal/views/TerminalView.h"

namespace {

int Fail(const std::string& message, int code = 1) {
  std::fprintf(stderr, "terminal: %s\n", message.c_str());
  return code;
}

// Prints product id, instrument code, exchange code and name, tab-separated:
// the simulated market's instruments, or a recording's with --replay.
int ListInstruments(const term::Options& o) {
  std::vector<JInstrumentUnderlying> all;
  if (!o.replayFile.empty()) {
    term::rec::Reader reader;
    std::string error;
    if (!reader.Open(o.replayFile, error)) return Fail(error);
    all = reader.Ref().instruments;
  } else {
    sim::MarketConfig config;
    if (o.seed) config.seed = *o.seed;
    if (o.instruments) config.instruments = *o.instruments;
    all = sim::Market(config).Instruments();
  }
  const std::size_t n = *o.listInstruments == 0 ? all.size()
                                                : std::min(all.size(), static_cast<std::size_t>(*o.listInstruments));
  std::string out;
  for (std::size_t i = 0; i < n; ++i) {
    const auto& ins = all[i];
    out += std::to_string(ins.productId) + '\t' + ins.instrumentCode + '\t' + ins.exchangeCode + '\t' +
           ins.instrumentName + '\n';
  }
  std::fwrite(out.data(), 1, out.size(), stdout);
  return 0;
}

// SIGINT and SIGTERM end the terminal the normal way (layout saved), through
// a pipe the event loop watches.
int g_signalPipe[2] = {-1, -1};

void OnSignal(int) {
  const char byte = 1;
  [[maybe_unused]] const auto n = write(g_signalPipe[1], &byte, 1);
}

void QuietQtMessages(QtMsgType type, const QMessageLogContext&, const QString& text) {
  // Qt's own chatter (offscreen platform notes and the like) is not the
  // terminal's progress; only warnings and worse reach stderr.
  if (type == QtDebugMsg || type == QtInfoMsg) return;
  if (text.contains("This plugin does not support")) return;  // offscreen: no window raising etc.
  if (text.startsWith("QStandardPaths: XDG_RUNTIME_DIR")) return;  // Qt picks a fallback itself
  std::fprintf(stderr, "terminal: qt: %s\n", text.toLocal8Bit().constData());
}

}  // namespace

int main(int argc, char** argv) {
  term::Options options;
  std::string error;
  if (!term::ParseOptions(argc, argv, options, error)) return Fail(error, 2);
  if (options.help) {
    std::fputs(term::UsageText(argv[0]).c_str(), stdout);
    return 0;
  }
  if (options.version) {
    std::puts("terminal 1.0");
    return 0;
  }
  if (options.listInstruments) return ListInstruments(options);

  if (options.checkChurn) return term::CheckChurn(options);

  const bool timed = options.headless || options.seconds.has_value();
  if (options.headless) {
    setenv("QT_QPA_PLATFORM", "offscreen", 1);
  } else if (!std::getenv("DISPLAY") && !std::getenv("WAYLAND_DISPLAY") && !std::getenv("QT_QPA_PLATFORM")) {
    return Fail("no display to show the terminal on; run it with --headless (see --help)");
  }
  if (timed) {
    // One clock for the whole process from the first timer on.
    if (!options.realTime) platform::UseVirtualClock();
    auto dialogs = std::make_unique<platform::RecordingDialogService>();
    dialogs->onShown = [](const platform::RecordingDialogService::Shown& s) {
      if (s.kind == platform::RecordingDialogService::Shown::Box)
        std::fprintf(stderr, "terminal: message box \"%s\": %s\n", s.caption.toLocal8Bit().constData(),
                     s.text.toLocal8Bit().constData());
    };
    platform::SetDialogService(std::move(dialogs));
  }
  if (!options.verbose) qInstallMessageHandler(QuietQtMessages);

  // Qt sees only the program name: the options are the terminal's (Qt would
  // take "--style" for its own).
  int qtArgc = 1;
  term::TerminalApplication app(qtArgc, argv);
  QApplication::setApplicationName("marketviews-terminal");

  const std::filesystem::path dataDir =
      options.dataDir.empty() ? term::Store::DefaultDataDir() : std::filesystem::path(options.dataDir);
  // Before the terminal runs, a refusal goes to standard error, the log and,
  // with a window system, a message box: a terminal started from a desktop
  // has nobody reading its standard error.
  auto refuse = [&](const std::string& message, int code) {
    Fail(message, code);
    {
      term::LogFactory log((dataDir / "logs" / "terminal.log").string(), false);
      log.Error(message);
    }
    if (!timed)
      platform::Dialogs().MessageBox(nullptr, QStringLiteral("Brantic Terminal"),
                                     QString::fromStdString("The terminal cannot start: " + message + "."),
                                     platform::Icon::Error, platform::Buttons::Ok);
    return code;
  };

  term::AddonLoader addon;
  const std::string addonPath = options.addonPath.empty() ? term::AddonLoader::DefaultPath() : options.addonPath;
  if (!addon.Load(addonPath, error)) return refuse(error, 1);

  for (const auto& o : options.open) {
    if (addon.Find(o.className) || term::views::FindClass(o.className)) continue;
    std::string known;
    for (const char* c : {"CPriceViewAdv", "CMarketDepthAdv", "CTimeAndSalesAdv", "CTradeSummaryAdv",
                          "CPriceAlertList", "CNewPriceAlertAdv"})
      if (addon.Find(c)) known += std::string(" ") + c;
    for (const QString& c : term::views::ClassNames()) known += " " + c.toStdString();
    return refuse("unknown view class \"" + o.className + "\" in --open; known classes:" + known, 2);
  }

  term::StoreOpenReport report;
  auto store = term::Store::Open(dataDir, report, error);
  if (!store) return refuse(error, 1);
  if (!GetUserSettings().SetStorage(std::make_shared<term::SqliteSettingsStorage>(*store)))
    std::fprintf(stderr, "terminal: warning: some settings could not be read and keep their defaults: %s\n",
                 GetUserSettings().GetErrorInfo().c_str());

  int code = 0;
  {
    term::TerminalApp terminal(options, addon, store.get());
    std::unique_ptr<QSocketNotifier> stopper;
    if (pipe2(g_signalPipe, O_CLOEXEC | O_NONBLOCK) == 0) {
      stopper = std::make_unique<QSocketNotifier>(g_signalPipe[0], QSocketNotifier::Read);
      QObject::connect(stopper.get(), &QSocketNotifier::activated, [&terminal] {
        char buf[16];
        while (read(g_signalPipe[0], buf, sizeof buf) > 0) {
        }
        terminal.RequestStop();
      });
      struct sigaction sa {};
      sa.sa_handler = OnSignal;
      sigemptyset(&sa.sa_mask);
      sa.sa_flags = SA_RESTART;
      sigaction(SIGINT, &sa, nullptr);
      sigaction(SIGTERM, &sa, nullptr);
    }
    if (!terminal.Start(error)) {
      terminal.Shutdown();
      GetUserSettings().SetStorage(nullptr);
      return refuse(error, terminal.StartExitCode());
    }
    if (!report.message.empty()) terminal.ReportProblem(QString::fromStdString(report.message), true);
    code = timed ? terminal.RunTimed() : app.exec();
    terminal.Shutdown();
  }
  // Settings must not outlive the store they write to.
  GetUserSettings().SetStorage(nullptr);
  return code;
}
