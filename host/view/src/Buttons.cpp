#include "hostview/Buttons.h"

#include <QEnterEvent>
#include <QFile>
#include <QImageReader>
#include <QPainter>
#include <algorithm>

#include "hostview/StyleRoles.h"

QPixmap LoadHostImage(const std::wstring& path, const IStyleManager* styleManager) {
  if (path.empty()) return {};
  QString file;
  if (styleManager) {
    file = QString::fromStdWString(styleManager->ResolveImagePath(path, styleManager->GetStyleID()));
  } else {
    file = QString::fromStdWString(path);
    file.replace(QLatin1Char('\\'), QLatin1Char('/'));
    if (file.startsWith(QLatin1String("./"))) file.remove(0, 2);
  }
  if (file.isEmpty()) return {};
  QPixmap pixmap;
  pixmap.load(file);
  return pixmap;
}

// ---- CHostButton ----

CHostButton::CHostButton(QWidget* parent, int commandId) : QAbstractButton(parent), m_commandId(commandId) {
  setFocusPolicy(Qt::StrongFocus);
  connect(this, &QAbstractButton::clicked, this, [this] { emit commandClicked(m_commandId); });
}

void CHostButton::SetStyleManager(IStyleManager* styleManager) {
  m_styleManager = styleManager;
  if (m_styleManager) setFont(m_styleManager->GetFont(hv::style::kFontControl));
  update();
}

QColor CHostButton::Role(int role, QColor fallback) const {
  return m_styleManager ? m_styleManager->Color(role) : fallback;
}

static QColor FromRef(COLORREF c) { return QColor(int(ColorRefRed(c)), int(ColorRefGreen(c)), int(ColorRefBlue(c))); }

QColor CHostButton::BackgroundColor() const {
  if (m_back) return FromRef(*m_back);
  if (isDown()) return Role(hv::style::kButtonPressedFace, palette().color(QPalette::Dark));
  if (m_hot) return Role(hv::style::kButtonHotFace, palette().color(QPalette::Midlight));
  return Role(hv::style::kButtonFace, palette().color(QPalette::Button));
}

QColor CHostButton::ForegroundColor() const {
  if (!isEnabled()) return Role(hv::style::kButtonDisabledText, palette().color(QPalette::Disabled, QPalette::ButtonText));
  if (m_text) return FromRef(*m_text);
  return Role(hv::style::kButtonText, palette().color(QPalette::ButtonText));
}

QSize CHostButton::sizeHint() const {
  const QFontMetrics fm(font());
  return QSize(fm.horizontalAdvance(text()) + 16, fm.height() + 8);
}

void CHostButton::enterEvent(QEnterEvent* event) {
  m_hot = true;
  update();
  QAbstractButton::enterEvent(event);
}

void CHostButton::leaveEvent(QEvent* event) {
  m_hot = false;
  update();
  QAbstractButton::leaveEvent(event);
}

// ---- CImageButton ----

CImageButton::CImageButton(QWidget* parent, int commandId) : CHostButton(parent, commandId) {}

bool CImageButton::LoadBitmap(const std::wstring& path, int stateCount) {
  m_path = path;
  SetBitmap(LoadHostImage(path, m_styleManager), stateCount);
  return HasBitmap();
}

void CImageButton::SetBitmap(const QPixmap& pixmap, int stateCount) {
  m_image = pixmap;
  m_states = std::clamp(stateCount, 1, 4);
  updateGeometry();
  update();
}

QPixmap CImageButton::StateImage() const {
  if (m_image.isNull()) return {};
  const int w = m_image.width() / m_states;
  int state = 0;
  if (!isEnabled()) state = 3;
  else if (isDown() || isChecked()) state = 2;
  else if (IsHot()) state = 1;
  if (state >= m_states) state = 0;
  return m_image.copy(state * w, 0, w, m_image.height());
}

QSize CImageButton::sizeHint() const {
  if (m_image.isNull()) return CHostButton::sizeHint();
  return QSize(m_image.width() / m_states + 4, m_image.height() + 4);
}

void CImageButton::paintEvent(QPaintEvent*) {
  QPainter p(this);
  p.fillRect(rect(), BackgroundColor());
  const QPixmap img = StateImage();
  if (!img.isNull()) {
    const QPoint at((width() - img.width()) / 2, (height() - img.height()) / 2);
    p.drawPixmap(at + (isDown() ? QPoint(1, 1) : QPoint()), img);
  } else {
    p.setPen(ForegroundColor());
    p.drawText(rect(), Qt::AlignCenter, text());
  }
  if (hasFocus()) {
    p.setPen(QPen(ForegroundColor(), 1, Qt::DotLine));
    p.drawRect(rect().adjusted(1, 1, -2, -2));
  }
}

// ---- CButtonEx ----

CButtonEx::CButtonEx(QWidget* parent, int commandId) : CImageButton(parent, commandId) {}

void CButtonEx::SetCheckBox(bool checkBox) {
  setCheckable(checkBox);
  updateGeometry();
  update();
}

QSize CButtonEx::sizeHint() const {
  if (!isCheckable()) return CImageButton::sizeHint();
  const QFontMetrics fm(font());
  return QSize(fm.height() + 8 + fm.horizontalAdvance(text()) + 4, fm.height() + 6);
}

void CButtonEx::paintEvent(QPaintEvent* event) {
  if (!isCheckable()) {
    CImageButton::paintEvent(event);
    return;
  }
  QPainter p(this);
  // A check box sits on the window background, not on a button face.
  const QColor back = Role(hv::style::kWindowBackground, palette().color(QPalette::Window));
  p.fillRect(rect(), back);
  const QColor fore = ForegroundColor();
  const int box = std::min(height() - 4, QFontMetrics(font()).height());
  const QRect boxRect(2, (height() - box) / 2, box, box);
  p.setPen(fore);
  p.setBrush(Role(hv::style::kEditBackground, palette().color(QPalette::Base)));
  p.drawRect(boxRect.adjusted(0, 0, -1, -1));
  if (isChecked()) {
    p.setPen(QPen(fore, 2));
    const QRect r = boxRect.adjusted(3, 3, -3, -3);
    p.drawLine(r.left(), r.center().y(), r.center().x() - 1, r.bottom());
    p.drawLine(r.center().x() - 1, r.bottom(), r.right(), r.top());
  }
  p.setPen(fore);
  p.drawText(QRect(boxRect.right() + 6, 0, width() - boxRect.right() - 6, height()),
             Qt::AlignLeft | Qt::AlignVCenter, text());
  if (hasFocus()) {
    p.setPen(QPen(fore, 1, Qt::DotLine));
    p.drawRect(rect().adjusted(0, 0, -1, -1));
  }
}

// ---- CBranticButton ----

CBranticButton::CBranticButton(QWidget* parent, int commandId) : CHostButton(parent, commandId) {}

void CBranticButton::paintEvent(QPaintEvent*) {
  QPainter p(this);
  p.fillRect(rect(), BackgroundColor());
  const QColor border = Role(hv::style::kButtonBorder, palette().color(QPalette::Mid));
  p.setPen(border);
  if (!m_flat || IsHot() || isDown() || hasFocus()) p.drawRect(rect().adjusted(0, 0, -1, -1));
  if (!m_flat && !isDown()) {
    p.setPen(palette().color(QPalette::Light));
    p.drawLine(1, 1, width() - 2, 1);
  }
  p.setPen(ForegroundColor());
  p.drawText(rect().translated(isDown() ? QPoint(1, 1) : QPoint()), Qt::AlignCenter, text());
}
