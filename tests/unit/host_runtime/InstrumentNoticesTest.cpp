// Renames in the simulated market reach the leading price view as 414, and no
// other view; remark changes reach the views that show the remark as 410.
#include <gtest/gtest.h>

#include <set>

#include "RecordingView.h"

namespace {

// Pumps a second at a time until `done` or two hours of market time passed.
template <class Done>
bool PumpUntil(Harness& h, Done done) {
  for (int s = 0; s < 7200 && !done(); ++s) h.Pump(1000);
  return done();
}

std::vector<const RecordingView::Note*> Fields(const RecordingView& v, const std::string& field) {
  std::vector<const RecordingView::Note*> out;
  for (const auto* n : v.Of(hm::InstrumentFieldUpdate))
    if (n->update.fieldName == field) out.push_back(n);
  return out;
}

// Instruments whose name differs from their reference record.
std::set<int> Renamed(sim::Market& m) {
  std::set<int> out;
  for (int i = 0; i < int(m.Instruments().size()); ++i)
    if (m.NameOf(i) != m.Instruments()[std::size_t(i)].instrumentName) out.insert(i);
  return out;
}

}  // namespace

TEST(InstrumentNotices, ARenameReachesTheLeadingPriceViewOnly) {
  Harness h;
  RecordingView& lead = h.View("CPriceViewAdv");
  RecordingView& second = h.View("CPriceViewAdv");
  RecordingView& depth = h.View("CMarketDepthAdv");
  RecordingView& alerts = h.View("CPriceAlertList");
  for (RecordingView* v : {&lead, &second, &depth, &alerts}) h.runtime->Activate(v);
  sim::Market& m = h.runtime->Market();

  ASSERT_TRUE(PumpUntil(h, [&] { return Fields(lead, "INSTRNAME").size() >= 3; }))
      << "two hours of market without three renames";
  for (const auto* n : Fields(lead, "INSTRNAME")) {
    const int i = m.Find(n->update.productId, n->update.instrumentCode);
    ASSERT_GE(i, 0) << n->update.instrumentCode;
    EXPECT_EQ(n->update.value, m.NameOf(i));
    EXPECT_NE(n->update.value, m.Instruments()[std::size_t(i)].instrumentName) << "a change, not the old name";
    EXPECT_EQ(n->update.param, 0);
    EXPECT_EQ(n->update.kind, 0);
  }
  EXPECT_EQ(Fields(lead, "INSTRNAME").size(), lead.Of(hm::InstrumentFieldUpdate).size()) << "names only";
  // Every renamed instrument was told (twins share their company's rename).
  std::set<int> told;
  for (const auto* n : Fields(lead, "INSTRNAME")) told.insert(m.Find(n->update.productId, n->update.instrumentCode));
  EXPECT_EQ(told.size(), Fields(lead, "INSTRNAME").size()) << "each once";
  EXPECT_EQ(told, Renamed(m));
  EXPECT_TRUE(second.Of(hm::InstrumentFieldUpdate).empty());
  EXPECT_TRUE(depth.Of(hm::InstrumentFieldUpdate).empty());
  EXPECT_TRUE(alerts.Of(hm::InstrumentFieldUpdate).empty());
  for (RecordingView* v : {&lead, &second, &depth, &alerts})
    for (const auto* n : v->Of(hm::FieldValue)) EXPECT_NE(n->update.fieldName, "INSTRNAME");
}

TEST(InstrumentNotices, APriceViewThatBecomesTheLeadingOneIsToldEveryChangeOnceActivated) {
  Harness h;
  RecordingView& lead = h.View("CPriceViewAdv");
  h.runtime->Activate(&lead);
  sim::Market& m = h.runtime->Market();
  ASSERT_TRUE(PumpUntil(h, [&] { return Renamed(m).size() >= 2; }));

  // Opened later and not activated yet: it could not place a change, so it waits.
  RecordingView& later = h.View("CPriceViewAdv");
  h.runtime->DestroyView(&lead);
  h.Pump(100);
  EXPECT_TRUE(later.Of(hm::InstrumentFieldUpdate).empty());
  h.runtime->Activate(&later);
  h.Pump(100);
  std::set<int> told;
  for (const auto* n : Fields(later, "INSTRNAME")) {
    const int i = m.Find(n->update.productId, n->update.instrumentCode);
    EXPECT_EQ(n->update.value, m.NameOf(i));
    EXPECT_TRUE(told.insert(i).second) << "told once: " << n->update.instrumentCode;
  }
  EXPECT_EQ(told, Renamed(m));
  // Told once: the next pump repeats nothing.
  later.Clear();
  h.Pump(100);
  EXPECT_TRUE(later.Of(hm::InstrumentFieldUpdate).empty());
}

TEST(InstrumentNotices, ARemarkChangeIsPushedToItsSubscribersAsA410) {
  Harness h;
  RecordingView& list = h.View("CPriceAlertList");
  h.runtime->Activate(&list);
  sim::Market& m = h.runtime->Market();
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  list.Subscribe(ins.productId, ins.instrumentCode, {"LAST", "REMARKS"});
  const std::string before = m.FieldValue(i, "REMARKS", 0, 0);
  // A watched company gets half of the changes.
  ASSERT_TRUE(PumpUntil(h, [&] { return m.FieldValue(i, "REMARKS", 0, 0) != before; }));
  h.Pump(100);
  std::vector<std::string> pushed;
  for (const auto* n : list.Of(hm::FieldValue))
    if (n->update.fieldName == "REMARKS") pushed.push_back(n->update.value);
  ASSERT_FALSE(pushed.empty());
  EXPECT_EQ(pushed.back(), m.FieldValue(i, "REMARKS", 0, 0));
  EXPECT_NE(pushed.front(), before);
}
