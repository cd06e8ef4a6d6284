#pragma once
// The instrument entry of the single-instrument views and the price view: an
// editable drop-down over the terminal's instrument list with incremental
// search (InstrumentSearch.h), a grey placeholder when empty, and a background
// fill of the drop-down. Timers go through platform/ (1: the 100 ms typing
// pause, 2: the 400 ms fill step).
//
// Owner's side:
//   combo->SetLanguage(language);                     // shows the placeholder
//   combo->AttachList(&instruments, CInstrumentComboBox::ProductMapFromStore());
//   connect(combo, &CInstrumentComboBox::InstrumentChosen, ...);  // read GetChosenInstrument()
//   combo->SelectByKey(record);                       // show a given instrument
#include <QAbstractListModel>
#include <cstdint>
#include <map>
#include <vector>

#include "controls/InstrumentSearch.h"
#include "hostview/Records.h"
#include "platform/Platform.h"
#include "skin/Skin.h"

class ILanguage;
class IStyleManager;

// The drop-down's items: list positions; texts are made from the records when
// shown, so adding an item costs no text.
class CInstrumentListModel : public QAbstractListModel {
  Q_OBJECT
 public:
  enum { PositionRole = Qt::UserRole };
  explicit CInstrumentListModel(QObject* parent = nullptr) : QAbstractListModel(parent) {}
  void SetSource(const std::vector<JInstrumentUnderlying>* list, const std::map<std::int64_t, JProduct>* products);
  int rowCount(const QModelIndex& parent = QModelIndex()) const override;
  QVariant data(const QModelIndex& index, int role) const override;
  void Append(const std::vector<int>& positions);
  void AppendRange(int first, int count);
  void Reset(std::vector<int> positions);
  int PositionAt(int row) const;
  const std::vector<int>& Positions() const { return m_rows; }
  // "<name> [<exchange> : <symbol>]"; for products of type "CFD" or "DMA" the
  // display code stands in place of the symbol. Parts are trimmed of blanks.
  QString ItemText(int position) const;

 private:
  const std::vector<JInstrumentUnderlying>* m_list = nullptr;
  const std::map<std::int64_t, JProduct>* m_products = nullptr;
  std::vector<int> m_rows;
};

class CInstrumentComboBox : public CSkinComboBox, public platform::TimerHandler {
  Q_OBJECT
 public:
  enum TimerId : UINT { kSearchTimer = 1, kFillTimer = 2 };
  static constexpr int kFirstItems = 52;
  static constexpr int kFillStep = 1002;
  static constexpr UINT kFillMs = 400;
  static constexpr UINT kTypingPauseMs = 100;

  explicit CInstrumentComboBox(QWidget* parent = nullptr);
  ~CInstrumentComboBox() override;

  // Attaches the owner's instrument list (kept by the owner; re-attach when it
  // changes) and a copy of its product map.
  void AttachList(const std::vector<JInstrumentUnderlying>* list, std::map<std::int64_t, JProduct> productMap);
  // The product map from the product store.
  static std::map<std::int64_t, JProduct> ProductMapFromStore();
  // Shows the instrument with the record's code and product id; its item
  // index, or -1 (nothing selected) when the list has no such instrument.
  int SelectByKey(const JInstrumentUnderlying& record);
  // The selected instrument; product id -1 when nothing is selected.
  JInstrumentUnderlying GetChosenInstrument() const;
  void SetLanguage(ILanguage* language);
  void SetStyleManager(const IStyleManager* style);
  void ShowPlaceholder();
  QString PlaceholderText() const;
  bool IsPlaceholderShown() const { return m_placeholderShown; }
  const QString& LastSearch() const { return m_lastSearch; }
  // Instruments in the drop-down, as list positions in item order.
  const std::vector<int>& ItemPositions() const { return m_model->Positions(); }
  int ItemCount() const { return m_model->rowCount(); }
  QString ItemTextAt(int item) const;
  bool IsFilling() const { return platform::HasTimer(const_cast<CInstrumentComboBox*>(this), kFillTimer); }
  // Runs the search now (what the typing pause leads to).
  void RunSearch();

  void OnTimer(UINT id) override;

 signals:
  // The user chose an item from the drop-down (the selection-end notification).
  void InstrumentChosen();

 protected:
  bool eventFilter(QObject* obj, QEvent* e) override;

 private:
  void OnTextEdited(const QString& text);
  void FillStep();
  void StopFill();
  void ApplyEditColors();
  void SetEditTextQuietly(const QString& text);
  void EnsureAllInListOrder();

  const std::vector<JInstrumentUnderlying>* m_list = nullptr;
  std::map<std::int64_t, JProduct> m_products;
  CInstrumentListModel* m_model = nullptr;
  InstrumentSearchIndex m_index;  // started when the list is attached
  std::vector<char> m_added;
  int m_fillPos = 0;
  bool m_filling = false;
  QString m_lastSearch;
  bool m_placeholderShown = false;
  ILanguage* m_language = nullptr;
  QColor m_textColor{0, 0, 0};
  QColor m_backColor{255, 255, 255};
};
