#include "controls/BoardTypeEx.h"

#include <QLinearGradient>
#include <QLocale>
#include <cmath>
#include <QPainterPath>
#include <mutex>

#include "data/MarketDelayCache.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "grid/GridCtrl.h"
#include "grid/GridDropList.h"
#include "hostview/HostLists.h"
#include "hostview/MessageIds.h"
#include "hostview/Services.h"
#include "hostview/SuperBaseView.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "skin/Skin.h"

namespace {

// Every tile drawing in the process runs under this lock.
std::mutex& TileLock() {
  static std::mutex* lock = new std::mutex;  // made on first use, never destroyed
  return *lock;
}

QString Q(const std::wstring& s) { return QString::fromStdWString(s); }

// Volumes on a tile are read at a glance: whole numbers with separators, and
// millions or billions shortened.
QString TileVolume(const QuoteCell& cell) {
  if (cell.text.empty()) return {};
  const double v = cell.value;
  if (!std::isfinite(v)) return Q(cell.text);
  const double a = std::fabs(v);
  if (a >= 1e9) return QString::number(v / 1e9, 'f', 2) + QLatin1Char('B');
  if (a >= 1e6) return QString::number(v / 1e6, 'f', 2) + QLatin1Char('M');
  if (a != std::floor(a)) return QLocale(QLocale::English).toString(v, 'f', 2);
  return QLocale(QLocale::English).toString(static_cast<qlonglong>(v));
}

QColor Mix(const QColor& a, const QColor& b, double t) {
  return QColor(int(a.red() * (1 - t) + b.red() * t), int(a.green() * (1 - t) + b.green() * t),
                int(a.blue() * (1 - t) + b.blue() * t));
}

}  // namespace

QString PBoardTypeEx::VolumeText(const QuoteCell& cell) { return TileVolume(cell); }

QString PBoardTypeEx::ChangeText(const QuoteCell& change) {
  QString text = Q(change.text);
  if (change.value > 0 && !text.isEmpty() && !text.startsWith(QLatin1Char('+'))) text.prepend(QLatin1Char('+'));
  return text;
}

QString PBoardTypeEx::PercentText(const QuoteCell& percent) {
  QString text = Q(percent.text);
  if (text.isEmpty()) return text;
  if (percent.value > 0 && !text.startsWith(QLatin1Char('+'))) text.prepend(QLatin1Char('+'));
  return text + QLatin1Char('%');
}

QString PBoardTypeEx::NameText(const JInstrumentUnderlying& instrument) {
  return Q(hv::Widen(instrument.instrumentName)).trimmed();
}

QString PBoardTypeEx::CodeText(const JInstrumentUnderlying& instrument) {
  return Q(hv::Widen(instrument.displayCode.empty() ? instrument.symbol : instrument.displayCode)).trimmed();
}

PBoardTypeEx::PBoardTypeEx(CGridCtrl* grid) : CGridDropListType(grid), m_companyInfo(kCompanyInfoPicture) {}

PBoardTypeEx::~PBoardTypeEx() = default;

// ---- Areas -------------------------------------------------------------------

PBoardTypeEx::Box PBoardTypeEx::AreaBox(const QRect& cell, Area area) {
  // Edges as the terminal counts them: right and bottom one past the last pixel.
  const int L = cell.left(), T = cell.top(), R = cell.left() + cell.width(), B = cell.top() + cell.height();
  const Box body{L + 4, T + 4, R - 4, B - 4};
  const Box title{body.l + 1, body.t + 1, body.r - 1, body.t + 20};
  const Box second{body.l + 1, body.t + 21, body.r - 1, body.t + 39};
  const Box bar{body.l + 1, body.b - 21, body.r - 1, body.b - 1};
  switch (area) {
    case kBody: return body;
    case kTitleStrip: return title;
    case kTitleButton: return {title.r - 3 - (title.Height() - 5), title.t + 2, title.r - 3, title.b - 3};
    case kSecondStrip: return second;
    case kSecondButton: return {second.l + 2, second.t + 1, second.l + second.Height(), second.b - 2};
    case kBottomBar: return bar;
    case kQtyField: return {bar.l + 80, bar.t + 2, bar.r - 3 - (bar.Height() - 4), bar.b - 2};
    case kQtyListButton: return {bar.r - 2 - (bar.Height() - 4), bar.t + 2, bar.r - 2, bar.b - 2};
    case kBidBox:
    case kAskBox: {
      // The trading parts: two halves of the band under the last price.
      const int top = second.b + 29, bottom = top + 29;
      const int mid = (body.l + body.r) / 2;
      return area == kBidBox ? Box{body.l + 4, top, mid - 2, bottom} : Box{mid + 2, top, body.r - 4, bottom};
    }
    case kNone: break;
  }
  return {};
}

PBoardTypeEx::Area PBoardTypeEx::HitArea(const QRect& cell, const QPoint& pt) {
  for (Area a : {kTitleButton, kSecondButton, kQtyListButton, kQtyField, kBidBox, kAskBox, kTitleStrip,
                 kSecondStrip, kBottomBar, kBody})
    if (AreaBox(cell, a).Contains(pt)) return a;
  return kNone;
}

PBoardTypeEx::Area PBoardTypeEx::TileArea(int col, int row, const QRect& rect, const QPoint& pt) const {
  const Area area = HitArea(rect, pt);
  if (area != kTitleButton || !m_grid || col < 0 || row < 0) return area;
  CGridCell cell;
  m_grid->GetCell(col, row, cell);
  return cell.flags & kFlagFixedTile ? kTitleStrip : area;
}

QRect PBoardTypeEx::EditRect(int, int, const QRect& cellRect) { return AreaBox(cellRect, kQtyField).ToRect(); }

QString PBoardTypeEx::Caption(int id) const {
  if (m_language) {
    const std::wstring t = m_language->GetText(13, id);
    if (!t.empty()) return Q(t);
  }
  switch (id) {
    case 201: return QStringLiteral("Bid");
    case 202: return QStringLiteral("Ask");
    case 203: return QStringLiteral("Vol");
    case 204: return QStringLiteral("Chg");
    case 205: return QStringLiteral("Delay");
    default: return {};
  }
}

// ---- Mouse -------------------------------------------------------------------

void PBoardTypeEx::ClearPress() {
  if (m_grid && m_pressCol >= 0 && m_pressRow >= 0) {
    m_grid->SetCellFlags(m_pressCol, m_pressRow,
                         m_grid->GetCellFlags(m_pressCol, m_pressRow) & ~(kPressedSecond | kPressedTitle));
    m_grid->RedrawCell(m_pressCol, m_pressRow);
  }
  m_pressCol = m_pressRow = -1;
  m_state = 0;
}

bool PBoardTypeEx::OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) {
  if (!m_grid) return true;
  if (!pressed) {
    const int state = m_state;
    const bool same = col == m_pressCol && row == m_pressRow && col >= 0 && row >= 0;
    const Area area = same ? TileArea(col, row, rect, pt) : kNone;
    const int pc = m_pressCol, pr = m_pressRow;
    ClearPress();
    if (same && state == 1 && area == kSecondButton) Notify(pc, pr, kCodeSecondButton, 0);
    else if (same && state == 2 && area == kTitleButton) Notify(pc, pr, kCodeTitleButton, 0);
    else if (same && state == 3 && area == kQtyField) m_grid->StartEdit(pc, pr);
    return true;
  }
  const Area area = TileArea(col, row, rect, pt);
  m_lastPress = area;
  switch (area) {
    case kQtyListButton: {
      const bool openHere = IsListOpen() && ListCol() == col && ListRow() == row;
      if (openHere) {
        CloseList();
      } else {
        const QStringList items = m_quantities ? m_quantities(col, row) : QStringList();
        const Box bar = AreaBox(rect, kBottomBar);
        OpenList(col, row, QRect(QPoint(bar.l + 80, bar.t), QPoint(bar.r, bar.b)), items);
      }
      return true;
    }
    case kSecondButton:
      m_pressCol = col;
      m_pressRow = row;
      m_state = 1;
      m_grid->SetCellFlags(col, row, m_grid->GetCellFlags(col, row) | kPressedSecond);
      m_grid->RedrawCell(col, row);
      return true;
    case kTitleButton:
      m_pressCol = col;
      m_pressRow = row;
      m_state = 2;
      m_grid->SetCellFlags(col, row, m_grid->GetCellFlags(col, row) | kPressedTitle);
      m_grid->RedrawCell(col, row);
      return true;
    case kQtyField:
      m_pressCol = col;
      m_pressRow = row;
      m_state = 3;
      return true;
    default:
      m_pressCol = col;
      m_pressRow = row;
      m_state = 0;
      CloseList();
      Notify(col, row, kCodePress, 0);
      return true;
  }
}

bool PBoardTypeEx::OnDClicked(int col, int row, const QRect& rect, const QPoint& pt) {
  const Area area = TileArea(col, row, rect, pt);
  // Double clicks on the buttons and the quantity are their own business.
  if (area == kTitleButton || area == kSecondButton || area == kQtyField || area == kQtyListButton) return true;
  m_lastPress = area;
  Notify(col, row, kCodeDoubleClick, area);
  return true;
}

bool PBoardTypeEx::OnRClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) {
  if (!pressed) return false;  // the grid's own right click (its menu) follows on release
  const Area area = HitArea(rect, pt);
  m_lastPress = area;
  Notify(col, row, kCodeRightClick, area);
  return false;
}

void PBoardTypeEx::OnMouseMove(int col, int row, const QRect& rect, const QPoint& pt) {
  const Area area = col >= 0 && row >= 0 ? TileArea(col, row, rect, pt) : kNone;
  const bool active = area == kTitleButton || area == kSecondButton || area == kQtyField || area == kQtyListButton ||
                      area == kBidBox || area == kAskBox;
  if (m_grid && col >= 0) m_grid->SetGridCursor(active ? Qt::PointingHandCursor : Qt::ArrowCursor);
  const int h85 = area == kTitleButton ? int(area) : 0;
  const int h86 = area == kSecondButton ? int(area) : 0;
  // Leaving a cell ends both tips of that cell.
  const int c = col >= 0 ? col : m_hotCol, r = row >= 0 ? row : m_hotRow;
  if (h85 != (m_hot85 < 0 ? 0 : m_hot85)) Notify(c, r, kCodeHoverTitle, h85);
  if (h86 != (m_hot86 < 0 ? 0 : m_hot86)) Notify(c, r, kCodeHoverSecond, h86);
  m_hot85 = h85;
  m_hot86 = h86;
  m_hotCol = col;
  m_hotRow = row;
}

void PBoardTypeEx::OnDropListSelected(int col, int row, int index, const QString& text) {
  Notify(col, row, kNotifyDropSelected, index);
}

QString PBoardTypeEx::QuantityListText(int index) { return DropList() ? DropList()->ItemText(index) : QString(); }

// ---- Drawing -----------------------------------------------------------------

QString PBoardTypeEx::MarketDelay(std::int64_t productId, const std::string& exchange) {
  auto& cache = MarketDelayCache::Instance();
  const std::wstring wexch = hv::Widen(exchange);
  std::wstring text;
  if (cache.Find(productId, wexch, text)) return Q(text);
  // A miss: ask the terminal (it answers before SendChildFeedback returns).
  // Each key is asked once, so an unknown exchange does not cost a request per paint.
  if (m_owner && m_asked.insert({productId, exchange}).second) {
    JMarketInfoRequest req;
    req.productId = productId;
    req.exchangeCode = exchange;
    m_owner->SendChildFeedback(hm::MarketInfo, ToLParam(&req));
    cache.Find(productId, wexch, text);
  }
  return Q(text);
}

void PBoardTypeEx::OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
                          bool current) {
  std::lock_guard<std::mutex> guard(TileLock());
  DrawTile(p, rect, cell, selected || (cell.flags & kFlagSelectedTile));
}

void PBoardTypeEx::DrawTile(QPainter& p, const QRect& rect, const CGridCell& cell, bool selected) {
  const IStyleManager* style = m_style;
  const QColor gridBack = cell.backColor.isValid() ? cell.backColor : QColor(255, 255, 255);
  p.fillRect(rect, gridBack);

  // The instrument: by position in the writable or the read-only store.
  if (!cell.hasParam || cell.param < 0) return;
  JInstrumentUnderlying ins;
  if (cell.param >= kWritableBase) {
    const auto& recs = InstrumentMgr().Records();
    const std::size_t i = std::size_t(cell.param - kWritableBase);
    if (i >= recs.size()) return;
    ins = recs[i];
  } else {
    const auto& recs = InstrumentMgr_ReadOnly().Records();
    const std::size_t i = std::size_t(cell.param);
    if (i >= recs.size()) return;
    ins = recs[i];
  }
  const QuoteRecord quote = QuoteStore::Instance().Get(InstrumentKeyOf(ins), platform::TickCount());

  // Colours of the style.
  const QColor body = style ? style->Color(skin::kRowEven) : QColor(252, 252, 252);
  const QColor text = style ? style->Color(skin::kCellText) : QColor(30, 30, 30);
  const QColor frame = style ? style->Color(skin::kFrame) : QColor(190, 196, 204);
  const QColor head = style ? style->Color(skin::kHeadBack) : QColor(44, 82, 140);
  const QColor headText = style ? style->Color(skin::kHeadText) : QColor(255, 255, 255);
  const QColor muted = Mix(text, body, 0.45);
  // Rise and fall, and a fresh change, in the colours the quote table uses.
  const QColor up = style ? style->Color(kStyleRise) : QColor(0, 150, 0);
  const QColor down = style ? style->Color(kStyleFall) : QColor(250, 0, 0);
  const QColor flashText = style ? style->Color(kStyleChangedText) : QColor(20, 20, 20);
  const QColor riseBack = style ? style->Color(kStyleRiseBack) : QColor(214, 245, 214);
  const QColor fallBack = style ? style->Color(kStyleFallBack) : QColor(252, 218, 218);
  const QColor editBack = style ? style->Color(skin::kEditBack) : QColor(255, 255, 255);
  const QColor editText = style ? style->Color(skin::kEditText) : QColor(20, 20, 20);
  const QColor bidTint(38, 110, 200), askTint(210, 60, 50);

  QFont base = m_grid ? m_grid->GetDefFont() : QFont();
  QFont bold = base;
  bold.setBold(true);
  QFont small = base;
  small.setPointSizeF(std::max(6.0, base.pointSizeF() - 1));
  QFont big = base;
  big.setBold(true);
  big.setPointSizeF(base.pointSizeF() + 5);

  const Box bodyBox = AreaBox(rect, kBody);
  const QRect bodyR = bodyBox.ToRect();
  p.save();
  p.setBrush(Qt::NoBrush);
  p.fillRect(bodyR, body);
  p.setPen(selected ? Mix(head, QColor(255, 160, 0), 0.7) : frame);
  p.drawRect(bodyR.adjusted(0, 0, -1, -1));
  if (selected) p.drawRect(bodyR.adjusted(1, 1, -2, -2));

  // Title strip: product picture, name, remove button.
  const QRect title = AreaBox(rect, kTitleStrip).ToRect();
  QLinearGradient g(title.topLeft(), title.bottomLeft());
  g.setColorAt(0, head.lighter(118));
  g.setColorAt(1, head);
  p.fillRect(title, g);
  int x = title.left() + 3;
  {
    const auto product = ProductMgr().FindPtr(ins.productId);
    const std::wstring type = product ? hv::Widen(product->productType) : hv::Widen(ins.productType);
    // The product record names its picture; a product without one shows its type.
    const std::wstring picture = product ? hv::Widen(product->pictureFile) : std::wstring();
    QPixmap pm;
    if (!picture.empty()) pm = m_productImages.try_emplace(picture, picture).first->second.Get(style, m_styleId);
    const QRect badge(x, title.top() + 3, 22, title.height() - 6);
    if (!pm.isNull()) {
      p.drawPixmap(badge.topLeft(), pm.scaled(badge.size(), Qt::KeepAspectRatio, Qt::SmoothTransformation));
    } else if (!type.empty()) {
      // No picture for the product: its type as a small badge.
      p.setRenderHint(QPainter::Antialiasing, true);
      p.setPen(Qt::NoPen);
      p.setBrush(headText);
      p.drawRoundedRect(QRectF(badge).adjusted(0.5, 0.5, -0.5, -0.5), 3, 3);
      p.setRenderHint(QPainter::Antialiasing, false);
      QFont f = small;
      f.setBold(true);
      f.setPointSizeF(std::max(5.0, small.pointSizeF() - 1));
      p.setFont(f);
      p.setPen(head);
      p.drawText(badge, Qt::AlignCenter, Q(type).left(3));
      p.setBrush(Qt::NoBrush);
    }
    x = badge.right() + 5;
  }
  const Box tb = AreaBox(rect, kTitleButton);
  const bool removable = !(cell.flags & kFlagFixedTile);
  int nameRight = removable ? tb.l - 4 : title.right() - 3;
  {
    // The market delay, when there is one, sits before the remove button.
    const QString delay = MarketDelay(ins.productId, ins.exchangeCode);
    if (!delay.isEmpty()) {
      p.setFont(small);
      const QString t = Caption(205) + QLatin1Char(' ') + delay;
      const int w = p.fontMetrics().horizontalAdvance(t) + 8;
      const QRect badge(nameRight - w, title.top() + 3, w, title.height() - 6);
      p.setRenderHint(QPainter::Antialiasing, true);
      p.setPen(Qt::NoPen);
      p.setBrush(QColor(240, 160, 40));
      p.drawRoundedRect(QRectF(badge).adjusted(0.5, 0.5, -0.5, -0.5), 3, 3);
      p.setRenderHint(QPainter::Antialiasing, false);
      p.setPen(QColor(40, 30, 10));
      p.drawText(badge, Qt::AlignCenter, t);
      p.setBrush(Qt::NoBrush);
      nameRight = badge.left() - 4;
    }
  }
  p.setFont(bold);
  p.setPen(headText);
  const QRect nameRect(x, title.top(), nameRight - x, title.height());
  p.drawText(nameRect, Qt::AlignVCenter | Qt::AlignLeft,
             p.fontMetrics().elidedText(NameText(ins), Qt::ElideRight, nameRect.width()));
  if (removable) {
    const bool pushed = cell.flags & kPressedTitle;
    const QRect b = tb.ToRect();
    p.fillRect(b, pushed ? head.darker(130) : head.lighter(135));
    p.setPen(headText);
    p.setRenderHint(QPainter::Antialiasing, true);
    const QRectF c = QRectF(b).adjusted(4, 4, -3, -3).translated(pushed ? 1 : 0, pushed ? 1 : 0);
    p.setPen(QPen(headText, 1.6));
    p.drawLine(c.topLeft(), c.bottomRight());
    p.drawLine(c.topRight(), c.bottomLeft());
    p.setRenderHint(QPainter::Antialiasing, false);
  }

  // Second strip: company-information button, code and exchange, delay.
  const QRect second = AreaBox(rect, kSecondStrip).ToRect();
  p.fillRect(second, Mix(body, head, 0.10));
  {
    const bool pushed = cell.flags & kPressedSecond;
    const QRect b = AreaBox(rect, kSecondButton).ToRect();
    const QPixmap& pm = m_companyInfo.Get(style, m_styleId);
    p.fillRect(b, pushed ? Mix(body, head, 0.35) : body);
    p.setPen(frame);
    p.drawRect(b.adjusted(0, 0, -1, -1));
    const QRect inner = b.adjusted(2, 2, -2, -2).translated(pushed ? 1 : 0, pushed ? 1 : 0);
    if (!pm.isNull()) p.drawPixmap(inner, pm);
    else PArrowButtonTypeEx::DrawInfoGlyph(p, inner, QColor(40, 110, 190));
    const QString code = CodeText(ins);
    const QString exch = Q(hv::Widen(ins.exchangeCode)).trimmed();
    p.setFont(base);
    p.setPen(text);
    const QRect codeRect(b.right() + 5, second.top(), second.width() - b.width() - 10, second.height());
    p.drawText(codeRect, Qt::AlignVCenter | Qt::AlignLeft, code + QStringLiteral("  ") + exch);
    const QString vol = TileVolume(quote[QuoteLayout::Vol]);
    if (!vol.isEmpty()) {
      p.setFont(small);
      const int w = p.fontMetrics().horizontalAdvance(vol);
      p.setPen(text);
      p.drawText(codeRect.adjusted(0, 0, -2, 0), Qt::AlignVCenter | Qt::AlignRight, vol);
      p.setPen(muted);
      p.drawText(codeRect.adjusted(0, 0, -w - 6, 0), Qt::AlignVCenter | Qt::AlignRight, Caption(203));
    }
  }

  // Last price with its change, coloured by sign; a fresh change flashes.
  const auto& last = quote[QuoteLayout::Last];
  const auto& chg = quote[QuoteLayout::Change];
  const auto& pchg = quote[QuoteLayout::PChange];
  const int lastTop = second.bottom() + 2;
  const QRect lastRect(bodyR.left() + 6, lastTop, bodyR.width() - 12, 26);
  const bool flashing = last.mark == kMarkUp || last.mark == kMarkDown;
  if (flashing)
    p.fillRect(QRect(lastRect.left() - 2, lastRect.top(), lastRect.width() / 2, lastRect.height()),
               last.mark == kMarkUp ? riseBack : fallBack);
  const QColor signColor = chg.value > 0 ? up : chg.value < 0 ? down : text;
  p.setFont(big);
  p.setPen(flashing ? flashText : signColor);
  p.drawText(lastRect.adjusted(0, 0, -lastRect.width() / 3, 0), Qt::AlignVCenter | Qt::AlignLeft, Q(last.text));
  {
    const QString change = ChangeText(chg);
    const QString pct = PercentText(pchg);
    const QString arrow = chg.value > 0 ? QStringLiteral("\u25B2 ") : chg.value < 0 ? QStringLiteral("\u25BC ") : QString();
    // Change over percentage at the right; the price keeps the rest.
    p.setFont(bold);
    p.setPen(signColor);
    const QRect upper(lastRect.left(), lastRect.top(), lastRect.width(), lastRect.height() / 2 + 1);
    const QRect lower(lastRect.left(), upper.bottom(), lastRect.width(), lastRect.height() - upper.height());
    p.drawText(upper, Qt::AlignVCenter | Qt::AlignRight, arrow + change);
    p.setFont(small);
    p.drawText(lower, Qt::AlignVCenter | Qt::AlignRight, pct);
  }

  // Bid and ask: the trading parts.
  for (Area a : {kBidBox, kAskBox}) {
    const bool bid = a == kBidBox;
    const QRect box = AreaBox(rect, a).ToRect();
    const QColor tint = bid ? bidTint : askTint;
    p.fillRect(box, Mix(body, tint, 0.10));
    p.setPen(Mix(body, tint, 0.45));
    p.drawRect(box.adjusted(0, 0, -1, -1));
    const auto& price = quote[bid ? QuoteLayout::Bid : QuoteLayout::Ask];
    const auto& vol = quote[bid ? QuoteLayout::BVol : QuoteLayout::SVol];
    p.setFont(small);
    p.setPen(tint);
    const QRect top(box.left() + 4, box.top() + 1, box.width() - 8, 13);
    p.drawText(top, Qt::AlignVCenter | Qt::AlignLeft, Caption(bid ? 201 : 202));
    p.setPen(muted);
    p.drawText(top, Qt::AlignVCenter | Qt::AlignRight, TileVolume(vol));
    p.setFont(bold);
    p.setPen(text);
    p.drawText(QRect(box.left() + 4, box.top() + 13, box.width() - 8, box.height() - 14),
               Qt::AlignVCenter | Qt::AlignRight, Q(price.text));
  }

  // High, low, volume.
  {
    const Box bar = AreaBox(rect, kBottomBar);
    const int y = AreaBox(rect, kBidBox).b + 2;
    const QRect line(bodyR.left() + 6, y, bodyR.width() - 12, std::max(12, bar.t - 1 - y));
    p.setFont(small);
    const int half = line.width() / 2;
    const auto pair = [&](int i, const QString& caption, const QString& value) {
      const QRect r(line.left() + i * half, line.top(), half - 4, line.height());
      p.setPen(muted);
      p.drawText(r, Qt::AlignVCenter | Qt::AlignLeft, caption);
      const int w = p.fontMetrics().horizontalAdvance(caption) + 4;
      p.setPen(text);
      p.drawText(r.adjusted(w, 0, 0, 0), Qt::AlignVCenter | Qt::AlignLeft,
                 p.fontMetrics().elidedText(value, Qt::ElideRight, std::max(0, r.width() - w)));
    };
    pair(0, QStringLiteral("High:"), Q(quote[QuoteLayout::High].text));
    pair(1, QStringLiteral("Low:"), Q(quote[QuoteLayout::Low].text));
  }

  // Bottom bar: quantity caption, field and list button.
  {
    const QRect bar = AreaBox(rect, kBottomBar).ToRect();
    p.fillRect(bar, Mix(body, head, 0.08));
    p.setPen(Mix(body, frame, 0.8));
    p.drawLine(bar.topLeft(), bar.topRight());
    p.setFont(small);
    p.setPen(muted);
    p.drawText(QRect(bar.left() + 5, bar.top(), 74, bar.height()), Qt::AlignVCenter | Qt::AlignLeft,
               QStringLiteral("Quantity"));
    const QRect field = AreaBox(rect, kQtyField).ToRect();
    const bool invalid = cell.flags & kFlagInvalidQuantity;
    p.fillRect(field, editBack);
    p.setPen(invalid ? down : frame);
    p.drawRect(field.adjusted(0, 0, -1, -1));
    p.setFont(base);
    p.setPen(invalid ? down : editText);
    p.drawText(field.adjusted(3, 0, -3, 0), Qt::AlignVCenter | Qt::AlignRight, cell.text);
    const QRect button = AreaBox(rect, kQtyListButton).ToRect();
    p.fillRect(button, Mix(body, head, 0.2));
    p.setPen(frame);
    p.drawRect(button.adjusted(0, 0, -1, -1));
    CGridSortArrowType::DrawArrow(p, button.adjusted(3, 4, -3, -4), false, text);
  }
  p.restore();
}
