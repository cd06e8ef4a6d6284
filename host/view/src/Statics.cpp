#include "hostview/Statics.h"

#include <QDesktopServices>
#include <QKeyEvent>
#include <QMouseEvent>
#include <QPainter>
#include <QTextDocument>
#include <QUrl>

#include "hostview/StyleRoles.h"

namespace {
CHyperlinkStatic::UrlOpener& Opener() {
  static CHyperlinkStatic::UrlOpener opener;
  return opener;
}
}  // namespace

// ---- CHyperlinkStatic ----

CHyperlinkStatic::CHyperlinkStatic(QWidget* parent) : QWidget(parent) {
  setCursor(Qt::PointingHandCursor);
  setFocusPolicy(Qt::TabFocus);
}

void CHyperlinkStatic::SetStyleManager(IStyleManager* styleManager) {
  m_styleManager = styleManager;
  update();
}

void CHyperlinkStatic::SetCaption(const std::wstring& caption) {
  m_caption = caption;
  updateGeometry();
  update();
}

void CHyperlinkStatic::SetHyperlink(const std::wstring& url) { m_url = url; }

void CHyperlinkStatic::SetLinkColor(COLORREF c) {
  m_color = QColor(int(ColorRefRed(c)), int(ColorRefGreen(c)), int(ColorRefBlue(c)));
  m_hasColor = true;
  update();
}

void CHyperlinkStatic::SetUrlOpener(UrlOpener opener) { Opener() = std::move(opener); }

bool CHyperlinkStatic::OpenLink() {
  if (m_url.empty()) return false;
  const QString url = QString::fromStdWString(m_url);
  emit linkClicked(url);
  if (Opener()) return Opener()(url);
  return QDesktopServices::openUrl(QUrl::fromUserInput(url));
}

QSize CHyperlinkStatic::sizeHint() const {
  const QFontMetrics fm(font());
  return QSize(fm.horizontalAdvance(QString::fromStdWString(m_caption)) + 2, fm.height() + 2);
}

void CHyperlinkStatic::paintEvent(QPaintEvent*) {
  QPainter p(this);
  QFont f = font();
  f.setUnderline(true);
  p.setFont(f);
  QColor c = m_hasColor ? m_color
                        : (m_styleManager ? m_styleManager->Color(hv::style::kLinkText)
                                          : palette().color(QPalette::Link));
  p.setPen(c);
  p.drawText(rect(), Qt::AlignLeft | Qt::AlignVCenter, QString::fromStdWString(m_caption));
}

void CHyperlinkStatic::mouseReleaseEvent(QMouseEvent* event) {
  if (event->button() == Qt::LeftButton && rect().contains(event->position().toPoint())) OpenLink();
}

void CHyperlinkStatic::keyPressEvent(QKeyEvent* event) {
  if (event->key() == Qt::Key_Return || event->key() == Qt::Key_Enter || event->key() == Qt::Key_Space) {
    OpenLink();
    return;
  }
  QWidget::keyPressEvent(event);
}

// ---- CPPToolTip ----

CPPToolTip::CPPToolTip(QWidget* parent)
    : QWidget(parent, Qt::ToolTip | Qt::FramelessWindowHint | Qt::WindowDoesNotAcceptFocus) {
  setAttribute(Qt::WA_ShowWithoutActivating);
  setAttribute(Qt::WA_TransparentForMouseEvents);
  hide();
}

CPPToolTip::~CPPToolTip() {
  for (auto& [tool, text] : m_tools) tool->removeEventFilter(this);
}

void CPPToolTip::SetStyleManager(IStyleManager* styleManager) {
  m_styleManager = styleManager;
  if (styleManager) setFont(styleManager->GetFont(hv::style::kFontTip));
  update();
}

void CPPToolTip::AddTool(QWidget* tool, const std::wstring& text) {
  if (!tool) return;
  if (m_tools.emplace(tool, text).second) {
    tool->installEventFilter(this);
    connect(tool, &QObject::destroyed, this, [this, tool] {
      m_tools.erase(tool);
    });
  } else {
    m_tools[tool] = text;
  }
}

void CPPToolTip::UpdateTipText(const std::wstring& text, QWidget* tool) {
  auto it = m_tools.find(tool);
  if (it == m_tools.end()) return;
  it->second = text;
  if (isVisible() && tool->underMouse()) ShowHelpTooltip(pos(), text);
}

void CPPToolTip::RemoveTool(QWidget* tool) {
  if (m_tools.erase(tool)) tool->removeEventFilter(this);
}

std::wstring CPPToolTip::GetToolText(QWidget* tool) const {
  auto it = m_tools.find(tool);
  return it == m_tools.end() ? std::wstring() : it->second;
}

void CPPToolTip::ShowHelpTooltip(QPoint globalPos, const std::wstring& text) {
  if (text.empty()) { HideTooltip(); return; }
  m_text = text;
  QTextDocument doc;
  doc.setDefaultFont(font());
  doc.setHtml(QString::fromStdWString(text));
  doc.setTextWidth(400);
  doc.setTextWidth(std::min(400.0, doc.idealWidth()));
  resize(doc.size().toSize() + QSize(8, 6));
  move(globalPos);
  show();
  raise();
  update();
}

void CPPToolTip::HideTooltip() {
  hide();
  m_text.clear();
}

bool CPPToolTip::eventFilter(QObject* watched, QEvent* event) {
  auto* tool = qobject_cast<QWidget*>(watched);
  auto it = tool ? m_tools.find(tool) : m_tools.end();
  if (it != m_tools.end()) {
    if (event->type() == QEvent::Enter) {
      ShowHelpTooltip(QCursor::pos() + QPoint(0, 20), it->second);
    } else if (event->type() == QEvent::Leave || event->type() == QEvent::MouseButtonPress ||
               event->type() == QEvent::Hide) {
      HideTooltip();
    }
  }
  return QWidget::eventFilter(watched, event);
}

void CPPToolTip::paintEvent(QPaintEvent*) {
  QPainter p(this);
  const QColor back = m_styleManager ? m_styleManager->Color(hv::style::kTipBackground)
                                     : palette().color(QPalette::ToolTipBase);
  const QColor fore = m_styleManager ? m_styleManager->Color(hv::style::kTipText)
                                     : palette().color(QPalette::ToolTipText);
  const QColor border = m_styleManager ? m_styleManager->Color(hv::style::kTipBorder) : fore;
  p.fillRect(rect(), back);
  p.setPen(border);
  p.drawRect(rect().adjusted(0, 0, -1, -1));
  QTextDocument doc;
  doc.setDefaultFont(font());
  doc.setDefaultStyleSheet(QStringLiteral("body { color: %1; }").arg(fore.name()));
  doc.setHtml(QStringLiteral("<body>") + QString::fromStdWString(m_text) + QStringLiteral("</body>"));
  doc.setTextWidth(width() - 8);
  p.translate(4, 3);
  doc.drawContents(&p);
}
