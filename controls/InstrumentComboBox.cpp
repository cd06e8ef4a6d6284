#include "controls/InstrumentComboBox.h"

#include <QAbstractItemView>
#include <QApplication>
#include <QFocusEvent>
#include <QLineEdit>
#include <QListView>
#include <numeric>

#include "data/ReferenceStores.h"
#include "hostview/Services.h"
#include "hostview/Text.h"

namespace {
std::string_view Trimmed(std::string_view s) {
  const auto blank = [](char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; };
  while (!s.empty() && blank(s.front())) s.remove_prefix(1);
  while (!s.empty() && blank(s.back())) s.remove_suffix(1);
  return s;
}
QString Q(std::string_view s) { return QString::fromUtf8(s.data(), qsizetype(s.size())); }
}  // namespace

// ---- Model -----------------------------------------------------------------

void CInstrumentListModel::SetSource(const std::vector<JInstrumentUnderlying>* list,
                                     const std::map<std::int64_t, JProduct>* products) {
  beginResetModel();
  m_list = list;
  m_products = products;
  m_rows.clear();
  endResetModel();
}

int CInstrumentListModel::rowCount(const QModelIndex& parent) const {
  return parent.isValid() ? 0 : int(m_rows.size());
}

int CInstrumentListModel::PositionAt(int row) const {
  return row >= 0 && row < int(m_rows.size()) ? m_rows[std::size_t(row)] : -1;
}

QString CInstrumentListModel::ItemText(int position) const {
  if (!m_list || position < 0 || position >= int(m_list->size())) return {};
  const JInstrumentUnderlying& ins = (*m_list)[std::size_t(position)];
  bool useDisplayCode = false;
  if (m_products) {
    auto it = m_products->find(ins.productId);
    if (it != m_products->end()) useDisplayCode = it->second.productType == "CFD" || it->second.productType == "DMA";
  }
  // Invalid UTF-8 shows as U+FFFD: fromUtf8 keeps the rest of the text.
  return Q(Trimmed(ins.instrumentName)) + QStringLiteral(" [") + Q(Trimmed(ins.exchangeCode)) +
         QStringLiteral(" : ") + Q(Trimmed(useDisplayCode ? ins.displayCode : ins.symbol)) + QStringLiteral("]");
}

QVariant CInstrumentListModel::data(const QModelIndex& index, int role) const {
  const int pos = PositionAt(index.row());
  if (pos < 0) return {};
  switch (role) {
    case Qt::DisplayRole:
    case Qt::EditRole: return ItemText(pos);
    case PositionRole: return pos;
    default: return {};
  }
}

void CInstrumentListModel::Append(const std::vector<int>& positions) {
  if (positions.empty()) return;
  const int first = int(m_rows.size());
  beginInsertRows(QModelIndex(), first, first + int(positions.size()) - 1);
  m_rows.insert(m_rows.end(), positions.begin(), positions.end());
  endInsertRows();
}

void CInstrumentListModel::AppendRange(int first, int count) {
  std::vector<int> p(std::size_t(std::max(0, count)));
  std::iota(p.begin(), p.end(), first);
  Append(p);
}

void CInstrumentListModel::Reset(std::vector<int> positions) {
  beginResetModel();
  m_rows = std::move(positions);
  endResetModel();
}

// ---- Combo box -----------------------------------------------------------------

CInstrumentComboBox::CInstrumentComboBox(QWidget* parent) : CSkinComboBox(parent) {
  setEditable(true);
  setInsertPolicy(QComboBox::NoInsert);
  setCompleter(nullptr);
  m_model = new CInstrumentListModel(this);
  setModel(m_model);
  if (auto* list = qobject_cast<QListView*>(view())) list->setUniformItemSizes(true);
  setMaxVisibleItems(10);
  lineEdit()->installEventFilter(this);
  // The open drop-down takes the keyboard; typing still belongs to the edit.
  view()->installEventFilter(this);
  // Only the user's edits start a search; texts set here do not.
  connect(lineEdit(), &QLineEdit::textEdited, this, &CInstrumentComboBox::OnTextEdited);
  connect(this, qOverload<int>(&QComboBox::activated), this, [this](int) {
    m_placeholderShown = false;
    ApplyEditColors();
    emit InstrumentChosen();
  });
  ApplyEditColors();
}

CInstrumentComboBox::~CInstrumentComboBox() {
  platform::KillTimer(this, kSearchTimer);
  platform::KillTimer(this, kFillTimer);
}

std::map<std::int64_t, JProduct> CInstrumentComboBox::ProductMapFromStore() {
  std::map<std::int64_t, JProduct> map;
  for (const JProduct& p : ProductMgr().Records()) map[p.productId] = p;
  return map;
}

void CInstrumentComboBox::AttachList(const std::vector<JInstrumentUnderlying>* list,
                                     std::map<std::int64_t, JProduct> productMap) {
  StopFill();
  platform::KillTimer(this, kSearchTimer);
  m_list = list;
  m_products = std::move(productMap);
  // The texts are copied now; the lookup lists are built in the background
  // while the user has not typed yet.
  if (list) m_index.StartBuild(*list);
  else m_index.Clear();
  const int n = list ? int(list->size()) : 0;
  m_added.assign(std::size_t(n), 0);
  m_model->SetSource(list, &m_products);
  const int first = std::min(n, kFirstItems);
  m_model->AppendRange(0, first);
  std::fill(m_added.begin(), m_added.begin() + first, char(1));
  m_fillPos = first;
  setMaxVisibleItems(std::max(10, maxVisibleItems()));
  if (first > 0) setCurrentIndex(0);
  m_placeholderShown = false;
  ApplyEditColors();
  if (m_fillPos < n) platform::SetTimer(this, kFillTimer, kFillMs);
}

void CInstrumentComboBox::StopFill() {
  platform::KillTimer(this, kFillTimer);
  m_filling = false;
}

void CInstrumentComboBox::FillStep() {
  if (m_filling || !m_list) return;
  m_filling = true;
  const int n = int(m_list->size());
  std::vector<int> batch;
  batch.reserve(kFillStep);
  while (m_fillPos < n && int(batch.size()) < kFillStep && m_filling) {
    if (!m_added[std::size_t(m_fillPos)]) {
      m_added[std::size_t(m_fillPos)] = 1;
      batch.push_back(m_fillPos);
    }
    ++m_fillPos;
  }
  m_model->Append(batch);
  m_filling = false;
  if (m_fillPos >= n) platform::KillTimer(this, kFillTimer);
}

void CInstrumentComboBox::EnsureAllInListOrder() {
  const int n = m_list ? int(m_list->size()) : 0;
  const auto& rows = m_model->Positions();
  bool all = int(rows.size()) == n;
  for (int i = 0; all && i < n; ++i) all = rows[std::size_t(i)] == i;
  if (all) return;
  std::vector<int> every(static_cast<std::size_t>(n));
  std::iota(every.begin(), every.end(), 0);
  m_model->Reset(std::move(every));
  std::fill(m_added.begin(), m_added.end(), char(1));
  m_fillPos = n;
}

int CInstrumentComboBox::SelectByKey(const JInstrumentUnderlying& record) {
  StopFill();
  EnsureAllInListOrder();
  int found = -1;
  if (m_list) {
    for (std::size_t i = 0; i < m_list->size(); ++i) {
      const auto& ins = (*m_list)[i];
      if (ins.productId == record.productId && ins.instrumentCode == record.instrumentCode) { found = int(i); break; }
    }
  }
  setCurrentIndex(found);
  if (found >= 0) {
    m_placeholderShown = false;
    ApplyEditColors();
  }
  return found;
}

JInstrumentUnderlying CInstrumentComboBox::GetChosenInstrument() const {
  const int pos = m_model->PositionAt(currentIndex());
  if (!m_list || pos < 0 || pos >= int(m_list->size())) {
    JInstrumentUnderlying none;
    none.productId = -1;
    return none;
  }
  return (*m_list)[std::size_t(pos)];
}

QString CInstrumentComboBox::ItemTextAt(int item) const { return m_model->ItemText(m_model->PositionAt(item)); }

void CInstrumentComboBox::SetLanguage(ILanguage* language) {
  m_language = language;
  ShowPlaceholder();
}

void CInstrumentComboBox::SetStyleManager(const IStyleManager* style) {
  CSkinComboBox::SetStyleManager(style);
  if (style) {
    m_textColor = style->Color(skin::kEditText);
    m_backColor = style->Color(skin::kEditBack);
  }
  ApplyEditColors();
}

QString CInstrumentComboBox::PlaceholderText() const {
  if (m_language) {
    const std::wstring t = m_language->GetText(13, 11);
    if (!t.empty()) return QString::fromStdWString(t);
  }
  return QStringLiteral("Search Instrument");
}

void CInstrumentComboBox::SetEditTextQuietly(const QString& text) {
  const QSignalBlocker block(lineEdit());
  lineEdit()->setText(text);
}

void CInstrumentComboBox::ShowPlaceholder() {
  setCurrentIndex(-1);
  m_lastSearch.clear();
  SetEditTextQuietly(PlaceholderText());
  m_placeholderShown = true;
  ApplyEditColors();
}

void CInstrumentComboBox::ApplyEditColors() {
  QPalette pal = lineEdit()->palette();
  pal.setColor(QPalette::Text, m_placeholderShown ? QColor(0xAA, 0xAA, 0xAA) : m_textColor);
  pal.setColor(QPalette::Base, m_backColor);
  lineEdit()->setPalette(pal);
}

void CInstrumentComboBox::OnTextEdited(const QString& text) {
  m_placeholderShown = false;
  ApplyEditColors();
  platform::KillTimer(this, kSearchTimer);
  if (text != m_lastSearch) platform::SetTimer(this, kSearchTimer, kTypingPauseMs);
}

void CInstrumentComboBox::OnTimer(UINT id) {
  if (id == kSearchTimer) RunSearch();
  else if (id == kFillTimer) FillStep();
}

void CInstrumentComboBox::RunSearch() {
  platform::KillTimer(this, kSearchTimer);
  StopFill();
  const QString text = lineEdit()->text();
  if (text == m_lastSearch) return;

  setUpdatesEnabled(false);
  m_lastSearch = text;
  const std::string key = InstrumentSearchIndex::LowerAscii(hv::Narrow(text.toStdWString()));
  const int cursor = lineEdit()->cursorPosition();
  const int selStart = lineEdit()->selectionStart();
  const int selLength = lineEdit()->selectionLength();
  const auto restoreEdit = [&] {
    SetEditTextQuietly(text);
    if (selStart >= 0 && selLength > 0) lineEdit()->setSelection(selStart, selLength);
    else lineEdit()->setCursorPosition(cursor);
  };

  std::vector<int> found;
  if (m_list && key.empty()) {
    found.resize(m_list->size());
    std::iota(found.begin(), found.end(), 0);
  } else if (m_list) {
    found = m_index.Search(key);
  }
  {
    const QSignalBlocker block(this);
    m_model->Reset(std::move(found));
  }
  std::fill(m_added.begin(), m_added.end(), char(0));
  restoreEdit();
  setUpdatesEnabled(true);
  setMaxVisibleItems(std::max(10, maxVisibleItems()));

  const bool any = m_model->rowCount() > 0;
  if (any) {
    {
      const QSignalBlocker block(this);
      setCurrentIndex(0);
    }
    restoreEdit();
  }
  // Refit an open drop-down to the new items; open it for a typed search.
  if (view()->isVisible()) {
    hidePopup();
    if (any) showPopup();
  } else if (any && !key.empty() && lineEdit()->hasFocus()) {
    showPopup();
  }
  if (any) restoreEdit();
  setCursor(Qt::ArrowCursor);
}

namespace {
// Keys the open drop-down keeps: moving in the list, choosing, closing.
bool IsListKey(const QKeyEvent* k) {
  switch (k->key()) {
    case Qt::Key_Up:
    case Qt::Key_Down:
    case Qt::Key_PageUp:
    case Qt::Key_PageDown:
    case Qt::Key_Return:
    case Qt::Key_Enter:
    case Qt::Key_Escape:
    case Qt::Key_F4:
    case Qt::Key_Tab:
    case Qt::Key_Backtab:
      return true;
    default:
      return false;
  }
}
}  // namespace

bool CInstrumentComboBox::eventFilter(QObject* obj, QEvent* e) {
  if (obj == view() && (e->type() == QEvent::KeyPress || e->type() == QEvent::KeyRelease ||
                        e->type() == QEvent::ShortcutOverride)) {
    // Every other key edits the search text, so typing goes on while the
    // list is open; the search then refits the list.
    if (!IsListKey(static_cast<QKeyEvent*>(e))) {
      QApplication::sendEvent(lineEdit(), e);
      return true;
    }
    return CSkinComboBox::eventFilter(obj, e);
  }
  if (obj == lineEdit()) {
    if (e->type() == QEvent::FocusIn) {
      if (lineEdit()->text() == PlaceholderText()) {
        m_placeholderShown = false;
        SetEditTextQuietly(QString());
        ApplyEditColors();
      }
    } else if (e->type() == QEvent::FocusOut) {
      // Focus moving into our own drop-down is not leaving the box.
      auto* fe = static_cast<QFocusEvent*>(e);
      if (fe->reason() != Qt::PopupFocusReason && lineEdit()->text().isEmpty()) ShowPlaceholder();
    }
  }
  return CSkinComboBox::eventFilter(obj, e);
}
