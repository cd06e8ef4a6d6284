#pragma once
// Name changes of instruments, told to the leading price view (the first price
// view the terminal still hosts) as 414 with a FieldUpdate {product id,
// instrument code, "INSTRNAME", the new name, 0, 0}. No other view receives
// them. A price view that becomes the leading one (the first, or the next
// after the leading one closed) gets every rename of the session once it has
// been activated, so a view opened after a rename shows the new name too.
//
// Remark changes are not told here: every view that shows a remark holds a
// "REMARKS" subscription and gets the change as a 410. (A 414 "REMARKS" could
// not be replayed faithfully: a recording holds a remark from the first time
// anyone read it, so a replay could not tell a change from a first reading.)
//
// The names are read through the market source, so a recording holds them as
// values of "INSTRNAME" (read by nothing else) and a replay tells them again.
#include <QPointer>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "hostview/SuperBaseView.h"

namespace term {

class MarketSource;
class ViewDirectory;

class InstrumentNotices {
 public:
  InstrumentNotices(MarketSource& market, ViewDirectory& views);
  InstrumentNotices(const InstrumentNotices&) = delete;
  InstrumentNotices& operator=(const InstrumentNotices&) = delete;

  // The market's changes of one pump (MarketSource::ChangeBits).
  void Note(const std::vector<std::pair<int, std::uint32_t>>& changed);
  // Sends what was noted to the leading price view.
  void Deliver();
  // Instruments renamed this session.
  std::size_t Changed() const { return current_.size(); }

 private:
  void Send(CSuperBaseView* view, int index, const std::string& name);

  MarketSource& market_;
  ViewDirectory& views_;
  std::map<int, std::string> current_;  // current names that differ from the reference, by instrument index
  std::vector<int> noted_;              // renamed since the last Deliver
  QPointer<CSuperBaseView> told_;                // the leading price view that knows every change
};

}  // namespace term
