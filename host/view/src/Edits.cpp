#include "hostview/Edits.h"

#include <QCalendarWidget>
#include <QHBoxLayout>
#include <QKeyEvent>
#include <QPlainTextEdit>
#include <QRegularExpressionValidator>
#include <QToolButton>
#include <QVBoxLayout>
#include <algorithm>
#include <cmath>

#include "hostview/NumberText.h"
#include "hostview/StyleRoles.h"

void ApplyEditStyle(QWidget* w, const IStyleManager* sm) {
  if (!w || !sm) return;
  QPalette pal = w->palette();
  pal.setColor(QPalette::Base, sm->Color(hv::style::kEditBackground));
  pal.setColor(QPalette::Text, sm->Color(hv::style::kEditText));
  pal.setColor(QPalette::Mid, sm->Color(hv::style::kEditBorder));
  pal.setColor(QPalette::Window, sm->Color(hv::style::kWindowBackground));
  pal.setColor(QPalette::WindowText, sm->Color(hv::style::kWindowText));
  w->setPalette(pal);
  w->setFont(sm->GetFont(hv::style::kFontControl));
}

// ---- CBranticEdit ----

CBranticEdit::CBranticEdit(QWidget* parent, bool multiLine) : QWidget(parent) {
  auto* layout = new QVBoxLayout(this);
  layout->setContentsMargins(0, 0, 0, 0);
  m_line = new QLineEdit(this);
  layout->addWidget(m_line);
  connect(m_line, &QLineEdit::textChanged, this, &CBranticEdit::textChanged);
  setFocusProxy(m_line);
  if (multiLine) SetMultiLine(true);
}

QWidget* CBranticEdit::Editor() const { return m_multi ? static_cast<QWidget*>(m_multi) : m_line; }

void CBranticEdit::SetStyleManager(IStyleManager* styleManager) {
  m_styleManager = styleManager;
  ApplyEditStyle(m_line, styleManager);
  ApplyEditStyle(m_multi, styleManager);
}

void CBranticEdit::SetMultiLine(bool multiLine) {
  if (multiLine == IsMultiLine()) return;
  const std::wstring text = GetWindowText();
  if (multiLine) {
    m_multi = new QPlainTextEdit(this);
    m_multi->setVerticalScrollBarPolicy(Qt::ScrollBarAlwaysOn);
    m_multi->setFrameShape(QFrame::Box);
    m_multi->setReadOnly(m_readOnly);
    layout()->addWidget(m_multi);
    m_line->hide();
    connect(m_multi, &QPlainTextEdit::textChanged, this, [this] {
      Enforce();
      emit textChanged();
    });
    ApplyEditStyle(m_multi, m_styleManager);
    setFocusProxy(m_multi);
  } else {
    delete m_multi;
    m_multi = nullptr;
    m_line->show();
    setFocusProxy(m_line);
  }
  SetWindowText(text);
}

void CBranticEdit::SetWindowText(const std::wstring& text) {
  const QString q = QString::fromStdWString(text);
  if (m_multi) m_multi->setPlainText(q);
  else m_line->setText(q);
  Enforce();
}

std::wstring CBranticEdit::GetWindowText() const {
  return (m_multi ? m_multi->toPlainText() : m_line->text()).toStdWString();
}

void CBranticEdit::SetReadOnly(bool readOnly) {
  m_readOnly = readOnly;
  m_line->setReadOnly(readOnly);
  if (m_multi) m_multi->setReadOnly(readOnly);
}

void CBranticEdit::SetLimitText(int limit) {
  m_limit = std::max(0, limit);
  m_line->setMaxLength(m_limit > 0 ? m_limit : 32767);
  Enforce();
}

void CBranticEdit::Enforce() {
  if (!m_multi || m_limit <= 0) return;
  const QString t = m_multi->toPlainText();
  if (t.size() <= m_limit) return;
  QSignalBlocker block(m_multi);
  m_multi->setPlainText(t.left(m_limit));
  m_multi->moveCursor(QTextCursor::End);
}

// ---- CFloatEdit ----

CFloatEdit::CFloatEdit(QWidget* parent, int decimals) : QLineEdit(parent) {
  m_decimals = std::clamp(decimals, 0, 10);
  setAlignment(Qt::AlignRight | Qt::AlignVCenter);
  UpdateValidator();
  connect(this, &QLineEdit::textChanged, this, [this] { emit valueChanged(GetValue()); });
  // On leaving the edit the number is shown in full form and within range.
  connect(this, &QLineEdit::editingFinished, this, [this] {
    if (HasValue()) SetValue(GetValue());
  });
}

void CFloatEdit::SetStyleManager(IStyleManager* styleManager) { ApplyEditStyle(this, styleManager); }

void CFloatEdit::UpdateValidator() {
  const QString sign = m_min < 0 ? QStringLiteral("-?") : QString();
  const QString frac = m_decimals > 0 ? QStringLiteral("(\\.\\d{0,%1})?").arg(m_decimals) : QString();
  setValidator(new QRegularExpressionValidator(QRegularExpression(QStringLiteral("^%1\\d*%2$").arg(sign, frac)), this));
}

void CFloatEdit::SetDecimals(int decimals) {
  decimals = std::clamp(decimals, 0, 10);
  if (decimals == m_decimals) return;
  const bool had = HasValue();
  const double v = GetValue();
  m_decimals = decimals;
  UpdateValidator();
  if (had) SetValue(v);
}

void CFloatEdit::SetValue(double value) {
  if (!std::isfinite(value)) { clear(); return; }
  value = std::clamp(value, m_min, m_max);
  // Same rounding as the grids show, without the separators.
  QString t = QString::fromStdString(Double2Str(value, m_decimals));
  t.remove(QLatin1Char(','));
  setText(t);
}

double CFloatEdit::GetValue() const {
  bool ok = false;
  const double v = text().toDouble(&ok);
  return ok ? v : 0.0;
}

bool CFloatEdit::HasValue() const {
  bool ok = false;
  text().toDouble(&ok);
  return ok;
}

void CFloatEdit::SetRange(double min, double max) {
  if (min > max) std::swap(min, max);
  m_min = min;
  m_max = max;
  UpdateValidator();
  if (HasValue() && (GetValue() < m_min || GetValue() > m_max)) SetValue(GetValue());
}

// ---- CBranticSpinBt ----

CBranticSpinBt::CBranticSpinBt(QWidget* parent, int ctrlId) : QWidget(parent), m_ctrlId(ctrlId) {
  auto* layout = new QVBoxLayout(this);
  layout->setContentsMargins(0, 0, 0, 0);
  layout->setSpacing(0);
  m_up = new QToolButton(this);
  m_down = new QToolButton(this);
  m_up->setArrowType(Qt::UpArrow);
  m_down->setArrowType(Qt::DownArrow);
  for (QToolButton* b : {m_up, m_down}) {
    b->setAutoRepeat(true);
    b->setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Expanding);
    b->setFocusPolicy(Qt::NoFocus);
    layout->addWidget(b);
  }
  connect(m_up, &QToolButton::clicked, this, [this] { Step(+1); });
  connect(m_down, &QToolButton::clicked, this, [this] { Step(-1); });
  setFixedWidth(18);
}

void CBranticSpinBt::SetBuddy(QWidget* buddy) {
  if (m_buddy) m_buddy->removeEventFilter(this);
  m_buddy = buddy;
  if (m_buddy) m_buddy->installEventFilter(this);
}

bool CBranticSpinBt::eventFilter(QObject* watched, QEvent* event) {
  // The arrow keys in the buddy step like the arrows.
  if (watched == m_buddy && event->type() == QEvent::KeyPress && isEnabled()) {
    const int key = static_cast<QKeyEvent*>(event)->key();
    if (key == Qt::Key_Up || key == Qt::Key_Down) {
      Step(key == Qt::Key_Up ? +1 : -1);
      return true;
    }
  }
  return QWidget::eventFilter(watched, event);
}

void CBranticSpinBt::SetStyleManager(IStyleManager* styleManager) {
  m_styleManager = styleManager;
  if (!styleManager) return;
  QPalette pal = palette();
  pal.setColor(QPalette::Button, styleManager->Color(hv::style::kButtonFace));
  pal.setColor(QPalette::ButtonText, styleManager->Color(hv::style::kButtonText));
  setPalette(pal);
}

void CBranticSpinBt::SetRange(int min, int max) {
  if (min > max) std::swap(min, max);
  m_min = min;
  m_max = max;
  m_pos = std::clamp(m_pos, m_min, m_max);
}

void CBranticSpinBt::SetPos(int pos) { m_pos = std::clamp(pos, m_min, m_max); }

void CBranticSpinBt::Step(int delta) {
  if (delta == 0) return;
  emit positionChanging(delta);
  m_pos = std::clamp(m_pos + delta, m_min, m_max);
  if (auto* edit = qobject_cast<CFloatEdit*>(m_buddy); edit && m_buddyStep > 0.0 && edit->isEnabled())
    edit->SetValue(std::max(edit->GetMin(), edit->GetValue() + delta * m_buddyStep));
  emit scrolled(m_pos);
}

// ---- CptDatetimeCtrl ----

CptDatetimeCtrl::CptDatetimeCtrl(QWidget* parent) : QDateEdit(parent) {
  setLocale(QLocale(QLocale::English, QLocale::UnitedStates));
  setCalendarPopup(true);
  setDisplayFormat(QStringLiteral("dd MMM yyyy"));
}

void CptDatetimeCtrl::SetStyleManager(IStyleManager* styleManager) {
  ApplyEditStyle(this, styleManager);
  if (calendarWidget()) ApplyEditStyle(calendarWidget(), styleManager);
}

void CptDatetimeCtrl::SetFormat(const std::wstring& format) {
  if (!format.empty()) setDisplayFormat(QString::fromStdWString(format));
}

bool CptDatetimeCtrl::SetRange(const QDate& min, const QDate& max) {
  if (!min.isValid() || !max.isValid() || min > max) return false;
  setDateRange(min, max);
  return true;
}

void CptDatetimeCtrl::GetRange(QDate& min, QDate& max) const {
  min = minimumDate();
  max = maximumDate();
}

bool CptDatetimeCtrl::SetTime(const QDate& d) {
  if (!d.isValid()) return false;
  setDate(std::clamp(d, minimumDate(), maximumDate()));
  return true;
}
