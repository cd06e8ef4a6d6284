#include "views/instrument/TimeAndSalesAdv.h"

#include <QPainter>
#include <cmath>

#include "addon/Registries.h"
#include "data/MarketStores.h"
#include "hostview/NumberText.h"
#include "hostview/StyleRoles.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "views/instrument/SalesFeed.h"
#include "views/instrument/SalesPaging.h"
#include "views/instrument/TimeASGrid.h"

ADDON_IMPLEMENT_VIEW(CTimeAndSalesAdv)

namespace {

// Panel labels: language entries and the words shown without a language table.
struct Label {
  int entry;
  const wchar_t* fallback;
};
constexpr Label kTimeLabel{605, L"Time"};
constexpr Label kPairLabels[3][2] = {
    {{606, L"High"}, {607, L"Low"}},
    {{608, L"Net Change"}, {609, L"Last"}},
    {{610, L"Total Value"}, {611, L"Total Volume"}},
};

}  // namespace

const addon::ViewClassInfo& CTimeAndSalesAdv::Info() {
  static const addon::ViewClassInfo info =
      InstrumentClassInfo("CTimeAndSalesAdv", &classCTimeAndSalesAdv, 8, L"Time and Sales", "17002");
  return info;
}

CTimeAndSalesAdv::CTimeAndSalesAdv() : CSingleInstrumentView(Info()) {}
CTimeAndSalesAdv::~CTimeAndSalesAdv() = default;

void CTimeAndSalesAdv::OnActivate() { ActivateInstrumentView(); }
void CTimeAndSalesAdv::OnDeactivate() { DeactivateInstrumentView(); }

CInstrumentGrid* CTimeAndSalesAdv::CreateGrid() {
  m_salesGrid = new TimeASGrid(this);
  m_salesGrid->setObjectName(QStringLiteral("TimeASGrid"));
  return m_salesGrid;
}

// ---- Timers ------------------------------------------------------------------------

void CTimeAndSalesAdv::StartTimers(bool activation) {
  // Started once and left running: a view that loses activation keeps
  // drawing new trades and fetching history, and restarting the 10 s timer on
  // every activation would hold paging off while the user moves between views.
  if (!activation || m_timersStarted) return;
  m_timersStarted = true;
  platform::SetTimer(this, kRefreshTimer, kRefreshMs);
  platform::SetTimer(this, kPagingTimer, kPagingMs);
}

void CTimeAndSalesAdv::OnOtherTimer(UINT id) {
  if (id == kPagingTimer) BackgroundPaging();
}

// ---- Selection and requests --------------------------------------------------------------

void CTimeAndSalesAdv::OnInstrumentSelected(const JInstrumentUnderlying& instrument) {
  m_lastStamp = 0;
  if (!m_salesGrid) return;
  const InstrumentKey key{instrument.productId, hv::Widen(instrument.instrumentCode)};
  const std::uint32_t now = platform::TickCount();
  sales::RegisterHeader(key, now);
  m_salesGrid->SetInstrument(key);  // the live page
  update();
}

void CTimeAndSalesAdv::RegisterShownInterest() {
  if (!m_salesGrid || m_salesGrid->Instrument().InstrumentCode.empty()) return;
  const std::uint32_t now = platform::TickCount();
  sales::RegisterHeader(m_salesGrid->Instrument(), now);
  sales::RegisterPage(m_salesGrid->Instrument(), sales::kLivePage, now);
}

void CTimeAndSalesAdv::SendPendingInterest() { sales::SendPending(Sender()); }

void CTimeAndSalesAdv::ExpireMarks(std::uint32_t now) {
  sales::SalesHeaderFeed::Instance().ExpireMarks(now);
  sales::SalesPageFeed::Instance().ExpireMarks(now);
}

CTimeAndSalesAdv* CTimeAndSalesAdv::RequestSender() {
  for (CSuperBaseView* view : addon::UserViews().Views())
    if (view->GetRuntimeClass() == GetRuntimeClass())
      if (auto* first = dynamic_cast<CTimeAndSalesAdv*>(view)) return first;
  return this;
}

void CTimeAndSalesAdv::BackgroundPaging() {
  if (!m_salesGrid || m_salesGrid->Instrument().InstrumentCode.empty()) return;
  sales::PagingContext ctx;
  ctx.uid = RegistrationValue();
  ctx.key = m_salesGrid->Instrument();
  ctx.rows = m_salesGrid->GetNumberRows();
  ctx.now = platform::TickCount();
  // The batch ends leave through the view that asked for the pages.
  ctx.send = RequestSender()->Sender();
  ctx.log = [this](const std::string& line) { LogLine("%s", line.c_str()); };
  ctx.registerPage = [](const InstrumentKey& key, int page, std::uint32_t now) { sales::RegisterPage(key, page, now); };
  SalesSummaryRecord header;
  const bool hasHeader = sales::ReadHeader(ctx.key, header);
  sales::BackgroundStep(ctx, hasHeader ? &header : nullptr);
}

// ---- Values ------------------------------------------------------------------------------------

std::uint32_t CTimeAndSalesAdv::OnInstrumentViewMessage(UINT message, LPARAM data) {
  if (message == hm::FieldValue || message == hm::RequestField) ApplyFieldUpdate(message, *FromLParam<const FieldUpdate>(data));
  return 0;
}

void CTimeAndSalesAdv::ApplyFieldUpdate(UINT message, const FieldUpdate& u) {
  if (u.kind != sales::kKind || !(sales::IsHeader(u.param) || sales::IsPage(u.param))) return;
  // Pushes reach every view of the class: one of them applies them.
  if (message == hm::FieldValue && !IsCurrentRegistration()) return;
  if (message == hm::RequestField && u.value.empty()) {
    // No value yet: asked again, once per answer, with the same param.
    FieldRequest again;
    again.productId = u.productId;
    again.instrumentCode = u.instrumentCode;
    again.fieldName = u.fieldName;
    again.param = u.param;
    again.kind = u.kind;
    SendChildFeedback(hm::FetchFields, ToLParam(&again));
    return;
  }
  const sales::Applied applied = sales::ApplyUpdate(u, platform::TickCount());
  if (applied == sales::Applied::Header && u.fieldName == "PAGECOUNT") {
    LogLine("(Uid:%d) : Code(%s) Page Count is %s.", RegistrationValue(), u.instrumentCode.c_str(), u.value.c_str());
  } else if (applied == sales::Applied::Page && u.fieldName == "TRADEDATA") {
    if (message == hm::FieldValue)
      LogLine("(Uid:%d) : Code(%s) Page(%d) receive.", RegistrationValue(), u.instrumentCode.c_str(), u.param);
    else
      LogLine("(Uid:%d) : Code(%s) Page(%d) receive old.", RegistrationValue(), u.instrumentCode.c_str(), u.param);
  }
}

// ---- Refresh -------------------------------------------------------------------------------------

void CTimeAndSalesAdv::OnRefreshTick() {
  if (!m_salesGrid) return;
  const std::uint64_t stamp = m_salesGrid->NewestStamp();
  if (stamp == 0 || stamp <= m_lastStamp) return;
  m_lastStamp = stamp;
  if (m_salesGrid->GetNumberRows() > 0) m_salesGrid->SetMessage({});
  m_salesGrid->Redraw();
  update(m_panel);
}

std::wstring CTimeAndSalesAdv::EmptyStateText() {
  std::wstring text = LanguageText(kEmptyStateTextId);
  return text.empty() ? std::wstring(L"No trades yet.") : text;
}

// ---- Layout and the information panel ----------------------------------------------------------

void CTimeAndSalesAdv::LayoutBody(const QRect& area) {
  // Compact layout: the grid takes the whole area, as with the header.
  if (SaveSpace() != 0 || area.height() <= kPanelHeight) {
    m_panel = QRect();
    CSingleInstrumentView::LayoutBody(area);
    return;
  }
  m_panel = QRect(area.left(), area.top(), area.width(), kPanelHeight);
  CSingleInstrumentView::LayoutBody(area.adjusted(0, kPanelHeight, 0, 0));
}

QStringList CTimeAndSalesAdv::panelTexts() const {
  auto label = [this](const Label& l) {
    const std::wstring text = LanguageText(l.entry);
    return QString::fromStdWString(text.empty() ? std::wstring(l.fallback) : text);
  };
  SalesSummaryRecord header;
  const bool has = m_salesGrid && !m_salesGrid->Instrument().InstrumentCode.empty() &&
                   sales::ReadHeader(m_salesGrid->Instrument(), header);
  auto cell = [&](int field) -> const QuoteCell* {
    if (!has) return nullptr;
    const QuoteCell& c = header[std::size_t(field)];
    return c.filled && !c.text.empty() ? &c : nullptr;
  };
  auto asReceived = [&](int field) {
    const QuoteCell* c = cell(field);
    return c ? QString::fromStdWString(c->text) : QString();
  };
  QStringList out;
  out << label(kTimeLabel) << asReceived(SalesSummaryLayout::DTime);
  const int fields[3][2] = {{SalesSummaryLayout::High, SalesSummaryLayout::Low},
                            {SalesSummaryLayout::NetChange, SalesSummaryLayout::Last},
                            {SalesSummaryLayout::TotalValue, SalesSummaryLayout::TotalVolume}};
  for (int line = 0; line < 3; ++line) {
    for (int side = 0; side < 2; ++side) {
      out << label(kPairLabels[line][side]);
      const int field = fields[line][side];
      const QuoteCell* c = cell(field);
      if (field == SalesSummaryLayout::TotalValue)
        out << (c ? QString::fromStdString(Integer2Str(static_cast<std::int64_t>(std::trunc(c->value)))) : QString());
      else if (field == SalesSummaryLayout::TotalVolume)
        out << (c ? QString::fromStdString(Double2Str(c->value, 0)) : QString());
      else
        out << asReceived(field);
    }
  }
  return out;
}

void CTimeAndSalesAdv::paintEvent(QPaintEvent* e) {
  CSingleInstrumentView::paintEvent(e);
  if (m_panel.isEmpty()) return;
  QPainter p(this);
  IStyleManager* style = m_pStyleManager;
  if (style) p.setFont(style->GetFont(kPanelFontId));
  p.setPen(style ? style->Color(hv::style::kWindowText) : palette().windowText().color());
  const QStringList texts = panelTexts();
  const int left = m_panel.left();
  const int right = m_panel.right() + 1;
  const int middle = left + m_panel.width() / 2;
  auto lineRect = [&](int line, int x0, int x1) {
    return QRect(x0, m_panel.top() + kPanelTop + line * kPanelLineHeight, std::max(0, x1 - x0), kPanelLineHeight);
  };
  const int vcenter = Qt::AlignVCenter | Qt::TextSingleLine;
  p.drawText(lineRect(0, left + 10, left + 110), Qt::AlignLeft | vcenter, texts[0]);
  p.drawText(lineRect(0, left + 110, right - 5), Qt::AlignLeft | vcenter, texts[1]);
  for (int line = 1; line <= 3; ++line) {
    const int k = 2 + (line - 1) * 4;
    p.drawText(lineRect(line, left + 10, middle - 5), Qt::AlignLeft | vcenter, texts[k]);
    p.drawText(lineRect(line, left + 10, middle - 5), Qt::AlignRight | vcenter, texts[k + 1]);
    p.drawText(lineRect(line, middle + 10, right - 5), Qt::AlignLeft | vcenter, texts[k + 2]);
    p.drawText(lineRect(line, middle + 10, right - 5), Qt::AlignRight | vcenter, texts[k + 3]);
  }
}
