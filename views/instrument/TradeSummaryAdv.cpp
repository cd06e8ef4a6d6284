#include "views/instrument/TradeSummaryAdv.h"

#include <QScrollBar>
#include <algorithm>

#include "addon/Channel.h"
#include "hostview/NumberText.h"
#include "hostview/Services.h"
#include "hostview/StyleRoles.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "skin/Skin.h"
#include "views/instrument/SummaryFeed.h"
#include "views/instrument/TradeSGrid.h"

ADDON_IMPLEMENT_VIEW(CTradeSummaryAdv)

namespace {

// Style colour of the chart's grid lines, style font of its labels (the table's).
constexpr int kChartGridLine = 104;
constexpr int kChartLabelFont = 16;
// Below this width the chart goes under the table instead of beside it.
constexpr int kSideBySideWidth = 640;

std::int64_t WholeOf(const QuoteCell& cell) { return cell.text.empty() ? 0 : static_cast<std::int64_t>(cell.value); }

}  // namespace

const addon::ViewClassInfo& CTradeSummaryAdv::Info() {
  static const addon::ViewClassInfo info =
      InstrumentClassInfo("CTradeSummaryAdv", &classCTradeSummaryAdv, 10, L"Trade Summary", "17003");
  return info;
}

CTradeSummaryAdv::CTradeSummaryAdv() : CSingleInstrumentView(Info()) {}
CTradeSummaryAdv::~CTradeSummaryAdv() = default;

void CTradeSummaryAdv::OnActivate() { ActivateInstrumentView(); }
void CTradeSummaryAdv::OnDeactivate() { DeactivateInstrumentView(); }

// ---- Creation and layout ----------------------------------------------------------

CInstrumentGrid* CTradeSummaryAdv::CreateGrid() {
  m_summaryGrid = new TradeSGrid(this);
  m_summaryGrid->setObjectName(QStringLiteral("TradeSGrid"));
  connect(m_summaryGrid, &TradeSGrid::topRowChanged, this, [this](int row) { FollowGrid(row); });
  return m_summaryGrid;
}

int CTradeSummaryAdv::OnCreate() {
  const int result = CSingleInstrumentView::OnCreate();
  m_chart = new CBarChart(this);
  m_chart->setObjectName(QStringLiteral("SummaryChart"));
  m_chart->SetOrientation(Qt::Horizontal);
  m_chart->SetWindowSize(kChartLines);
  m_chart->AddSeries(QStringLiteral("Ask"), kAskColor);
  m_chart->AddSeries(QStringLiteral("Bid"), kBidColor);
  m_chart->AddSeries(QStringLiteral("Blocks"), kBlocksColor);
  m_chart->SetupRange(kRangeMinimum, kRangeHeadroom);
  connect(m_chart, &CBarChart::scrollPosChanged, this, [this](int first) { FollowChart(first); });
  ApplyChartStyle();
  m_chart->show();
  Relayout();
  return result;
}

void CTradeSummaryAdv::LayoutBody(const QRect& area) {
  if (!m_chart) {
    CSingleInstrumentView::LayoutBody(area);
    return;
  }
  if (area.width() >= kSideBySideWidth) {
    // Table on the left at the width its five columns read well in, chart beside it.
    const int tableWidth = std::clamp(area.width() * 2 / 5, 360, 600);
    if (m_summaryGrid) m_summaryGrid->setGeometry(area.x(), area.y(), tableWidth, area.height());
    m_chart->setGeometry(area.x() + tableWidth, area.y(), area.width() - tableWidth, area.height());
  } else {
    const int tableHeight = area.height() / 2;
    if (m_summaryGrid) m_summaryGrid->setGeometry(area.x(), area.y(), area.width(), tableHeight);
    m_chart->setGeometry(area.x(), area.y() + tableHeight, area.width(), area.height() - tableHeight);
  }
}

void CTradeSummaryAdv::SetStyleManager(IStyleManager* styleManager) {
  CSingleInstrumentView::SetStyleManager(styleManager);
  ApplyChartStyle();
}

void CTradeSummaryAdv::ApplyChartStyle() {
  if (!m_chart) return;
  CBarChart::Palette palette;
  if (m_pStyleManager) {
    palette.back = m_pStyleManager->Color(hv::style::kWindowBackground);
    palette.text = m_pStyleManager->Color(hv::style::kWindowText);
    palette.gridLine = m_pStyleManager->Color(kChartGridLine);
  }
  m_chart->SetPalette(palette);
  if (m_pStyleManager) {
    // Labels a size below the table's text: ten prices must fit down the side.
    QFont labels = m_pStyleManager->GetFont(kChartLabelFont);
    labels.setPointSizeF(std::max(6.0, labels.pointSizeF() - 1));
    m_chart->SetLabelFont(labels);
    // The chart's scroll bar in the colours of the table's.
    skin::SkinColors sc = skin::ColorsFromStyle(m_pStyleManager);
    sc.back = palette.back;
    sc.track = QColor((sc.back.red() * 3 + sc.face.red()) / 4, (sc.back.green() * 3 + sc.face.green()) / 4,
                      (sc.back.blue() * 3 + sc.face.blue()) / 4);
    skin::ApplySkin(m_chart->ScrollBar(), sc);
  }
}

// ---- Timers ------------------------------------------------------------------------

void CTradeSummaryAdv::StartTimers(bool) {
  platform::SetTimer(this, kRefreshTimer, kRefreshMs);
  platform::SetTimer(this, kPageCountTimer, kPageCountMs);
}

void CTradeSummaryAdv::OnOtherTimer(UINT id) {
  if (id == kPageCountTimer) CheckPageCount();
}

void CTradeSummaryAdv::CheckPageCount() {
  if (!m_summaryGrid) return;
  m_summaryGrid->RegisterPagesUpTo(summary::PageCount(m_summaryGrid->Instrument()));
}

void CTradeSummaryAdv::RegisterShownInterest() {
  if (!m_summaryGrid) return;
  const InstrumentKey& key = m_summaryGrid->Instrument();
  const std::uint32_t now = platform::TickCount();
  for (int page = 1; page <= m_summaryGrid->RegisteredPages(); ++page) summary::RegisterPage(key, page, now);
}

void CTradeSummaryAdv::SendPendingInterest() {
  const addon::FeedbackSender send = Sender();
  for (const auto& pending : addon::SummaryPageFeed::Instance().TakePending()) {
    const addon::FieldTarget target{pending.key.ProductID, hv::Narrow(pending.key.InstrumentCode)};
    addon::SendRequestBatch(send, target, addon::fields::kSummary, addon::BatchTag{summary::kKind, pending.params});
  }
}

void CTradeSummaryAdv::ExpireMarks(std::uint32_t now) { summary::ExpireMarks(now); }

void CTradeSummaryAdv::OnRefreshTick() {
  // Redraw when something moved since the last drawing.
  if (!m_summaryGrid) return;
  const std::uint64_t stamp = m_summaryGrid->NewestStamp();
  const int filled = m_summaryGrid->FilledLines();
  // The stamp adds the versions of two stores: a page count that shrinks the
  // table can lower it, so any difference (or another row count) is news.
  if (stamp == 0 || (stamp == m_lastStamp && filled == m_lastFilled)) return;
  m_lastStamp = stamp;
  m_lastFilled = filled;
  bool firstRows = false;
  if (m_summaryGrid->GetNumberRows() > 0) {
    m_summaryGrid->SetMessage({});
    if (!m_rowsShown) m_rowsShown = firstRows = true;
  }
  m_summaryGrid->Redraw();
  if (firstRows || ChartWindowChanged()) BuildChart();
  update();
}

bool CTradeSummaryAdv::ChartWindowChanged() const {
  if (!m_chart || !m_summaryGrid) return false;
  const InstrumentKey& key = m_summaryGrid->Instrument();
  if (summary::PageCount(key) <= 0) return false;
  const int first = m_chart->ScrollPos() + 1;
  return summary::NewestVersion(key, first, first + kChartLines - 1) > m_chartVersion;
}

// ---- Chart ---------------------------------------------------------------------------

CBarChart::Group CTradeSummaryAdv::ChartGroupOf(const SummaryLineRecord& line) {
  const std::int64_t ask = WholeOf(line[SummaryLineLayout::Ask]);
  const std::int64_t bid = WholeOf(line[SummaryLineLayout::Bid]);
  const std::int64_t trades = WholeOf(line[SummaryLineLayout::Tradable]);
  const QString price = QString::fromStdWString(line[SummaryLineLayout::Price].text);
  CBarChart::Group group;
  group.label = price;
  group.values = {double(ask), double(bid), double(trades)};
  group.tooltip = QStringLiteral("Price:") + price + QStringLiteral(" | Ask:") + QString::fromStdString(Integer2Str(ask)) +
                  QStringLiteral(" | Bid:") + QString::fromStdString(Integer2Str(bid)) + QStringLiteral(" | Blocks:") +
                  QString::fromStdString(Integer2Str(trades));
  return group;
}

void CTradeSummaryAdv::BuildChart() {
  if (!m_chart || !m_summaryGrid) return;
  const InstrumentKey& key = m_summaryGrid->Instrument();
  std::vector<CBarChart::Group> groups;
  const int limit = summary::LineLimit(key);
  for (int line = 1; line <= limit && !key.InstrumentCode.empty(); ++line) {
    SummaryLineRecord record;
    if (!summary::ReadLine(key, line, record) || record[SummaryLineLayout::Price].text.empty()) break;
    groups.push_back(ChartGroupOf(record));
  }
  m_chart->SetGroups(std::move(groups));
  m_following = true;
  m_chart->SetScrollPos(std::max(0, m_summaryGrid->GetTopRow()));
  m_following = false;
  m_chart->SetupRange(kRangeMinimum, kRangeHeadroom);
  const int first = m_chart->ScrollPos() + 1;
  m_chartVersion = summary::NewestVersion(key, first, first + kChartLines - 1);
  m_chart->Redraw();
  update();
}

void CTradeSummaryAdv::FollowGrid(int) {
  if (m_following || !m_chart || m_chart->GroupCount() == 0) return;
  // Lines outside the window may have changed since the last build.
  BuildChart();
}

void CTradeSummaryAdv::FollowChart(int first) {
  if (m_following || !m_summaryGrid) return;
  m_following = true;
  m_summaryGrid->SetTopRow(first);
  m_following = false;
  BuildChart();
}

// ---- Selection and data ---------------------------------------------------------------

void CTradeSummaryAdv::OnInstrumentSelected(const JInstrumentUnderlying& instrument) {
  m_lastStamp = 0;
  m_lastFilled = 0;
  m_rowsShown = false;
  m_chartVersion = 0;
  if (m_chart) m_chart->Clear();
  if (m_summaryGrid) m_summaryGrid->SetInstrument(InstrumentKey{instrument.productId, hv::Widen(instrument.instrumentCode)});
}

void CTradeSummaryAdv::ShowRefusedColumns() {
  // The table is reset; the chart must not keep the previous instrument's bars.
  m_lastStamp = 0;
  m_lastFilled = 0;
  m_rowsShown = false;
  if (m_chart) {
    m_chart->Clear();
    m_chart->Redraw();
  }
}

std::wstring CTradeSummaryAdv::EmptyStateText() {
  std::wstring text = LanguageText(kEmptyStateEntry);
  return text.empty() ? std::wstring(kEmptyStateFallback) : text;
}

std::uint32_t CTradeSummaryAdv::OnInstrumentViewMessage(UINT message, LPARAM data) {
  if (message == hm::FieldValue || message == hm::RequestField)
    ApplyFieldUpdate(*FromLParam<const FieldUpdate>(data), message);
  return 0;
}

void CTradeSummaryAdv::ApplyFieldUpdate(const FieldUpdate& update, UINT message) {
  if (!summary::IsSummaryParam(update.kind, update.param)) return;
  // Every trade-summary view may be handed the same push: one of them applies it.
  if (message == hm::FieldValue && !IsCurrentRegistration()) return;
  if (message == hm::RequestField && update.value.empty()) {
    FieldRequest again;
    again.productId = update.productId;
    again.instrumentCode = update.instrumentCode;
    again.fieldName = update.fieldName;
    again.param = update.param;
    again.kind = update.kind;
    SendChildFeedback(hm::FetchFields, ToLParam(&again));
    return;
  }
  if (update.fieldName == "COUNT")
    LogLine("(Uid:%d) : Code(%s) Line Count is %s.", RegistrationValue(), update.instrumentCode.c_str(),
            update.value.c_str());
  else if (update.fieldName == "PAGECOUNT")
    LogLine("(Uid:%d) : Code(%s) Page Count is %s.", RegistrationValue(), update.instrumentCode.c_str(),
            update.value.c_str());
  summary::ApplyUpdate(update, platform::TickCount());
}
