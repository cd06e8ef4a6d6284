#include "views/price/TipDialogs.h"

#include <QPaintEvent>
#include <QPainter>
#include <QWheelEvent>
#include <algorithm>

#include "addon/TextTables.h"
#include "hostview/Statics.h"
#include "hosttitle/BranticTitle.h"

namespace {

QString Q(const std::wstring& s) { return QString::fromStdWString(s); }

std::wstring ForStyle(std::wstring path, int styleId) {
  static const std::wstring tag = L"[styleID]";
  const std::wstring id = std::to_wstring(styleId);
  for (std::size_t at = path.find(tag); at != std::wstring::npos; at = path.find(tag, at + id.size()))
    path.replace(at, tag.size(), id);
  return path;
}

// Dialog size (the template's 233 x 215 dialog units at the template font) and
// the board's rectangle.
constexpr int kDialogWidth = 420;
constexpr int kDialogHeight = 350;
constexpr int kBoardLeft = 20, kBoardTop = 40, kBoardBottom = 310;
constexpr int kTextLineY = 320;

}  // namespace

// ---- CCustomBoard -----------------------------------------------------------------

CCustomBoard::CCustomBoard(QWidget* parent, std::wstring kind) : QWidget(parent), m_kind(std::move(kind)) {
  setObjectName(QStringLiteral("LegendBoard"));
}

void CCustomBoard::SetStyleID(int styleId) {
  m_styleId = styleId;
  update();
}

void CCustomBoard::SetColors(const QColor& back, const QColor& text) {
  m_back = back;
  m_text = text;
  update();
}

void CCustomBoard::SetTexts(std::vector<std::wstring> rows) {
  m_texts = std::move(rows);
  m_first = 0;
  update();
}

void CCustomBoard::SetPairs(std::vector<std::pair<std::wstring, std::wstring>> rows) {
  m_pairs = std::move(rows);
  m_first = 0;
  update();
}

int CCustomBoard::RowCount() const { return int(m_kind == L"Remark" ? m_pairs.size() : m_texts.size()); }

void CCustomBoard::SetFirstRow(int row) {
  const int last = std::max(0, RowCount() - std::max(1, (height() - kFirstRowY) / kRowHeight));
  m_first = std::clamp(row, 0, last);
  update();
}

int CCustomBoard::VisibleRowCount() const {
  const int fit = std::max(0, (height() - kFirstRowY) / kRowHeight);
  return std::min(fit, std::max(0, RowCount() - m_first));
}

QFont CCustomBoard::Font(int id) const {
  if (m_style) return m_style->GetFont(id);
  QFont f = font();
  if (id == kCodeFont) f.setBold(true);
  return f;
}

void CCustomBoard::paintEvent(QPaintEvent*) {
  QPainter p(this);
  const QRect client = rect();
  p.fillRect(client, m_back);
  const bool remark = m_kind == L"Remark";
  if (remark) {
    p.setPen(m_text);
    p.drawLine(client.left(), client.top(), client.right(), client.top());
  }
  if (RowCount() == 0) return;
  p.setPen(m_text);
  p.setBackgroundMode(Qt::TransparentMode);
  const QFont code = Font(kCodeFont);
  const QFont text = Font(kTextFont);
  int y = kFirstRowY;
  for (int i = m_first; i < RowCount() && y < client.height(); ++i, y += kRowHeight) {
    const QRect line(0, y, client.width(), kRowHeight);
    if (remark) {
      const auto& [c, definition] = m_pairs[std::size_t(i)];
      p.setFont(code);
      p.drawText(line.adjusted(2, 0, 0, 0), Qt::AlignLeft | Qt::AlignTop, Q(c));
      p.setFont(text);
      p.drawText(line.adjusted(30, 0, 0, 0), Qt::AlignLeft | Qt::AlignTop, QStringLiteral(": "));
      p.drawText(line.adjusted(38, 0, 0, 0), Qt::AlignLeft | Qt::AlignTop, Q(definition));
    } else {
      const QString row = Q(m_texts[std::size_t(i)]);
      p.setFont(code);
      p.drawText(line.adjusted(2, 0, 0, 0), Qt::AlignLeft | Qt::AlignTop, row.left(4));
      p.setFont(text);
      p.drawText(line.adjusted(74, 0, 0, 0), Qt::AlignLeft | Qt::AlignTop, row.mid(4));
    }
  }
}

void CCustomBoard::wheelEvent(QWheelEvent* e) {
  const int steps = e->angleDelta().y() / 120;
  if (steps != 0) SetFirstRow(m_first - steps);
  e->accept();
}

// ---- CTipDialogBase -------------------------------------------------------------------

CTipDialogBase::CTipDialogBase(QWidget* parent, std::wstring title, std::wstring boardKind, int boardRight)
    : QDialog(parent, Qt::Tool | Qt::FramelessWindowHint),
      m_title(std::move(title)),
      m_boardKind(std::move(boardKind)),
      m_boardRight(boardRight) {
  setWindowTitle(QStringLiteral("Remark Definition"));
  setFixedSize(kDialogWidth, kDialogHeight);
}

CTipDialogBase::~CTipDialogBase() { platform::KillTimer(this, kFontTimer); }

void CTipDialogBase::SetStyleManager(IStyleManager* style) {
  m_style = style;
  if (m_titleBar) m_titleBar->SetStyleManager(style);
  if (m_board) m_board->SetStyleManager(style);
  if (m_link) m_link->SetStyleManager(style);
}

void CTipDialogBase::Create() {
  if (m_board) return;
  m_titleBar = new CBranticTitle(this);
  m_titleBar->SetMDIChild(true);
  m_titleBar->SubClassWnd(this);
  m_titleBar->SetTitleText(m_title);
  m_titleBar->SetStyleManager(m_style);
  m_titleBar->SetCommandHandler([this](int id) {
    if (id == kCloseCommand) accept();
  });
  m_board = new CCustomBoard(this, m_boardKind);
  m_board->SetStyleManager(m_style);
  m_board->setGeometry(QRect(QPoint(kBoardLeft, ContentTop() + kBoardTop - 20), QPoint(m_boardRight, ContentTop() + kBoardBottom - 20)));
  m_board->show();
  m_link = new CHyperlinkStatic(this);
  m_link->setObjectName(QStringLiteral("LegendLink"));
  m_link->SetStyleManager(m_style);
  m_link->setGeometry(300, ContentTop() + kTextLineY - 20, 100, 16);
  m_link->SetCaption(L"");
  OnCreated();
}

int CTipDialogBase::ContentTop() const { return m_titleBar ? m_titleBar->GetTitleHeight() : 0; }

void CTipDialogBase::ApplyStyle(int styleId) {
  m_styleId = styleId;
  if (m_titleBar) {
    m_titleBar->RemoveAllQuickButtons();
    m_titleBar->AddQuickButton(kCloseCommand, ForStyle(kCloseImage, styleId), L"Close");
    m_titleBar->UpdateTitleStyle(styleId);
  }
  if (m_style) {
    m_back = m_style->Color(101);
    m_text = m_style->Color(204);
  }
  if (m_board) {
    m_board->SetStyleID(styleId);
    m_board->SetColors(m_back, m_text);
  }
  if (m_link && m_style) m_link->SetLinkColor(m_style->GetColor(24));
  platform::SetTimer(this, kFontTimer, kFontTimerMs);
  update();
}

void CTipDialogBase::OnTimer(UINT id) {
  if (id != kFontTimer) return;
  platform::KillTimer(this, kFontTimer);
  if (m_link && m_style) m_link->setFont(m_style->GetFont(kLinkFont));
  update();
}

std::wstring CTipDialogBase::LanguageText(int entry) const {
  return m_language ? m_language->GetText(addon::kLanguageSection, entry) : std::wstring();
}

void CTipDialogBase::paintEvent(QPaintEvent*) {
  QPainter p(this);
  p.fillRect(rect(), m_back);
  p.setPen(m_text);
  p.setBackgroundMode(Qt::TransparentMode);
  p.setFont(m_style ? m_style->GetFont(20) : font());
  // The fixed places of the layout count from below the caption bar.
  PaintTexts(p, ContentTop() - 20);
}

// ---- CLSTipDlg ----------------------------------------------------------------------------

CLSTipDlg::CLSTipDlg(QWidget* parent) : CTipDialogBase(parent, L"L/S Regend", L"LS", 400) {
  setObjectName(QStringLiteral("LSTipDlg"));
}

std::vector<std::wstring> CLSTipDlg::LegendTexts() {
  return {L"L/S :New trades for both Long and Short", L"L/- :New trades for Long only",
          L"-/S :New trades for Short only", L"-/- :No new trades allowed; liquidation trades only",
          L"Call:Call Brantic CFD for manual quote"};
}

void CLSTipDlg::OnCreated() { m_board->SetTexts(LegendTexts()); }

void CLSTipDlg::PaintTexts(QPainter& p, int top) {
  p.drawText(QPoint(20, top + 20 + p.fontMetrics().ascent()), Q(LanguageText(36)));
  if (m_link && m_link->GetCaption() != L" ") m_link->SetCaption(L" ");
}

// ---- CRemTipDlg -----------------------------------------------------------------------------

CRemTipDlg::CRemTipDlg(QWidget* parent) : CTipDialogBase(parent, L"SGX Remark Definition", L"Remark", 320) {
  setObjectName(QStringLiteral("RemTipDlg"));
}

int CRemTipDlg::ClickTextX(const std::wstring& text) {
  return text.size() > 1 && text.find(L"click", 1) != std::wstring::npos ? 120 : 177;
}

void CRemTipDlg::OnCreated() {
  m_link->SetCaption(L"");
  m_link->SetHyperlink(kBrokerSite);
}

void CRemTipDlg::PaintTexts(QPainter& p, int top) {
  const int ascent = p.fontMetrics().ascent();
  p.drawText(QPoint(20, top + 20 + ascent), Q(LanguageText(29)));
  const std::wstring line = LanguageText(30);
  const int x = ClickTextX(line);
  p.drawText(QPoint(x, top + kTextLineY + ascent), Q(line));
  if (m_link) {
    const std::wstring caption = LanguageText(31);
    if (m_link->GetCaption() != caption) m_link->SetCaption(caption);
    // The link follows the sentence that leads to it.
    const int after = x + p.fontMetrics().horizontalAdvance(Q(line)) + 4;
    const QRect place(after, top + kTextLineY, std::max(20, width() - after - 4), p.fontMetrics().height());
    if (m_link->geometry() != place) m_link->setGeometry(place);
  }
}

void CRemTipDlg::done(int result) {
  m_closed = true;
  CTipDialogBase::done(result);
}
