#pragma once
// OnHostMessage of one view class, fed with fuzzed messages through the
// scripted host (the add-on loaded with dlopen, as the terminal loads it).
//
// An input is a run of messages in the encoding of hostview/MessageTrace.h
// (the terminal writes it with --trace-messages; fuzzing/split-trace cuts
// seeds from it). A number the view does not handle is folded onto one it
// does, so every byte goes to a handled message. After the run the virtual
// clock moves on (timers repaint, requests go out) and every grid is dumped:
// a cell showing "nan" or "inf" stops the fuzzer like a crash.
//
// One view lives for the whole process, as in a session; the instrument
// lists the add-on may index in place stay alive until the next 500.
#include <QMetaObject>
#include <QRegularExpression>
#include <QWidget>
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <deque>
#include <memory>
#include <string_view>
#include <vector>

#include "hostview/MessageTrace.h"
#include "mvtest/ScriptedHost.h"

namespace fuzzview {

// Handled by every view (the base's share).
inline const std::vector<UINT> kBaseMessages = {
    hm::Deactivate, hm::Activate,     hm::LinkData,      hm::FieldValue,  hm::RequestField, hm::InstrumentList,
    hm::ExchangeList, hm::ProductList, hm::TextByKey,    hm::MessageText, hm::SystemParameter,
    hm::NoticeParameter, hm::DisplayMode, hm::LinkModeFlag, hm::AltStatus, hm::FindByChartCode, hm::FindByCode,
    hm::MarketInfo,   hm::SettingsChanged};

inline std::vector<UINT> With(std::vector<UINT> extra) {
  std::vector<UINT> all = kBaseMessages;
  all.insert(all.end(), extra.begin(), extra.end());
  return all;
}

// A cell showing a non-finite number, however it is written.
inline bool ShowsNonFinite(const QString& dump) {
  static const QRegularExpression re(QStringLiteral(R"((?i)(^|[\t\n\s+\-(])(nan|inf)(inity)?($|[\t\n\s%)]))"));
  return re.match(dump).hasMatch();
}

class Driver {
 public:
  Driver(const char* className, std::vector<UINT> messages) : m_messages(std::move(messages)) {
    m_host.AnswerValue(hm::ExchangeEnabled, 1);
    m_host.AnswerValue(hm::DisplayMode, 1);
    m_view = m_host.Open(className);
    if (!m_view) {
      std::fprintf(stderr, "cannot open %s: %s\n", className, mvtest::AddonLibrary::Get().Error().c_str());
      std::abort();
    }
  }

  void Run(const std::uint8_t* data, std::size_t size) {
    hv::trace::Reader in(std::string_view(reinterpret_cast<const char*>(data), size));
    for (int n = 0; n < 4096 && !in.AtEnd(); ++n) {
      UINT number = static_cast<UINT>(in.Unsigned());
      if (std::find(m_messages.begin(), m_messages.end(), number) == m_messages.end())
        number = m_messages[number % m_messages.size()];
      auto message = std::make_unique<hv::trace::Message>();
      hv::trace::DecodeAs(number, in, *message);
      if (m_verbose) std::fprintf(stderr, "%u ", number);
      m_host.Send(m_view, number, message->word);
      Keep(std::move(message));
    }
    m_host.Advance(1200);
    // What the host records grows with every run: a session keeps none of it.
    m_host.ClearRequests();
    m_host.dialogs.shown.clear();
    m_host.logs.lines.clear();
    for (auto& logger : m_host.logs.loggers) logger->lines.clear();
    m_host.style.fontReads.clear();
    m_host.style.imageReads.clear();
    for (QWidget* w : m_view->findChildren<QWidget*>()) {
      if (w->metaObject()->indexOfMethod("dumpTsv()") < 0) continue;
      QString tsv;
      QMetaObject::invokeMethod(w, "dumpTsv", Qt::DirectConnection, Q_RETURN_ARG(QString, tsv));
      if (m_verbose) std::fprintf(stderr, "\n%s:\n%s\n", qPrintable(w->objectName()), qPrintable(tsv.left(1500)));
      if (ShowsNonFinite(tsv)) {
        std::fprintf(stderr, "a cell shows a non-finite number:\n%s\n", tsv.left(4000).toUtf8().constData());
        __builtin_trap();
      }
    }
  }

 private:
  // The terminal keeps a 500 list, and the instruments 550/551 pointed at,
  // alive until its next 500.
  void Keep(std::unique_ptr<hv::trace::Message> message) {
    const UINT n = message->number;
    if (n == hm::InstrumentList && message->word && message->instrumentMsg.instruments) {
      m_lookups.clear();
      m_lists.push_back(std::move(message));
      while (m_lists.size() > 2) m_lists.pop_front();
    } else if ((n == hm::FindByChartCode || n == hm::FindByCode) && message->word) {
      m_lookups.push_back(std::move(message));
      if (m_lookups.size() > 1000) m_lookups.erase(m_lookups.begin(), m_lookups.begin() + 500);
    }
  }

  std::vector<UINT> m_messages;
  // MV_FUZZ_VERBOSE=1: each run's message numbers and grids on standard error.
  const bool m_verbose = std::getenv("MV_FUZZ_VERBOSE") != nullptr;
  mvtest::ScriptedHost m_host;
  CSuperBaseView* m_view = nullptr;
  std::deque<std::unique_ptr<hv::trace::Message>> m_lists;
  std::vector<std::unique_ptr<hv::trace::Message>> m_lookups;
};

}  // namespace fuzzview

// One harness per view class: the class and the messages it handles beyond the base's.
#define MV_VIEW_HARNESS(className, ...)                                                      \
  extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {        \
    static fuzzview::Driver* driver = new fuzzview::Driver(className, fuzzview::With(__VA_ARGS__)); \
    driver->Run(data, size);                                                                  \
    return 0;                                                                                 \
  }
