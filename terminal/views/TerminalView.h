#pragma once
// The terminal's own views, opened by class name like the add-on's: a trade
// ticket ("CTradeView"), a price chart ("CBranticChartView"), an instrument
// explorer ("CInsExpViewEx"), analytics ("CStockAnalytics") and news ("CFNews").
// They are CSuperBaseView too, so the terminal docks, activates, restyles and
// restores them exactly like the add-on's views. They read the simulated market
// through the host runtime.
#include <QStringList>
#include <functional>
#include <cstdint>
#include <map>
#include <string>

#include "hostview/SuperBaseView.h"
#include "platform/Platform.h"

namespace term {
class HostRuntime;

namespace views {

// The runtime the views read from; set once by the application before any
// view is created, cleared before the runtime goes.
void SetRuntime(HostRuntime* runtime);
HostRuntime* Runtime();

// The five class names, and their descriptors (null for other names).
QStringList ClassNames();
const CRuntimeClass* FindClass(const std::string& className);

// The first object of data[] of a JSON link text, as narrow key -> value; empty
// when the text is not a link text.
std::map<std::string, std::string> ParseLink(const std::wstring& text);

// Shows an instrument in the linked views (what a double-click in the
// explorer does); set by the application, ignored while unset.
using LinkHandler = std::function<void(std::int64_t productId, const std::string& code, CSuperBaseView* from)>;
void SetLinkHandler(LinkHandler handler);
void LinkInstrument(std::int64_t productId, const std::string& code, CSuperBaseView* from);

// Common behaviour: an instrument (from the start parameters or a 310 link),
// a refresh timer on the platform clock, title through 101, colours from the
// style manager.
class CTerminalView : public CSuperBaseView, public platform::TimerHandler {
  Q_OBJECT
 public:
  CTerminalView();
  ~CTerminalView() override;
  std::uint32_t OnHostMessage(UINT message, LPARAM data) override;
  void ChangeStyle(int styleId) override;
  void ApplyLanguage() override;
  void OnTimer(UINT id) override;
  std::wstring GetTitle() override { return m_title; }
  // Views that show one instrument take one dropped on them (from the
  // explorer or a price-view row): see TakesInstrumentDrops().
  bool EnableDropIn() override { return TakesInstrumentDrops(); }
  bool EnableDropIn(const char*) override { return TakesInstrumentDrops(); }
  LRESULT DoDragDrop(UINT message, LPARAM data) override;

  // The market index of the shown instrument, -1 when none.
  int Instrument() const { return m_instrument; }
  // Shows instrument `index` (-1: none); records the start parameters.
  void ShowInstrument(int index);

 protected:
  int OnCreate() override;
  // Builds the children (once).
  virtual void Build() = 0;
  // The view's name in the title ("Trade ticket").
  virtual QString Caption() const = 0;
  // Called after the instrument changed and on every refresh tick.
  virtual void Refresh() = 0;
  // Link data other than the instrument (side, price...).
  virtual void TakeLink(const std::map<std::string, std::string>& link) {}
  virtual void InstrumentChanged() {}
  // Milliseconds between refreshes; 0 for none.
  virtual UINT RefreshInterval() const { return 1000; }
  // Whether an instrument dropped on the view (or linked to it) replaces its own.
  virtual bool TakesInstrumentDrops() const { return false; }
  // Whether the view shows the live market of its instrument (it then counts
  // as watching it, so the market moves it at the watched pace).
  virtual bool WatchesInstrument() const { return true; }
  // Shows the instrument a link text names; false when it names none the market knows.
  bool ShowLinked(const std::wstring& linkText);
  void SendTitle();
  QString InstrumentLabel() const;
  // The class's name for a person, from the language table.
  QString NameFor(const char* className) const;

  int m_instrument = -1;
  int m_watched = -1;  // the instrument whose market this view keeps moving (interest)
  std::wstring m_title;
  bool m_started = false;
};

}  // namespace views
}  // namespace term
