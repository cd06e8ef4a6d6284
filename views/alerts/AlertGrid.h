#pragma once
// AlertGrid: the alerts of the price-alert list, one row per alert that passes
// the list's filter, in the alert store's order. Cells are made when drawn:
// names from the instrument store, delays from MarketDelayCache, current values
// from the quote store (reading an instrument's quote queues its subscription
// for the list's next tick).
//
// The tick column ("colCheck") toggles a row's tick mark, written back into
// the alert store; its heading ticks or unticks every alert of the store.
// The owner hears of every change through the tick callback.
// UI thread only.
#include <QPixmap>
#include <array>
#include <cstdint>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "controls/CellTypes.h"
#include "data/Keys.h"
#include "hostview/AlertRecords.h"
#include "views/instrument/InstrumentGrid.h"

class ILanguage;

class AlertGrid : public CInstrumentGrid {
  Q_OBJECT
 public:
  struct ColumnDef {
    const char* key;  // "colCheck", ...
    int width;        // default width
    bool visible;     // default visibility
    int number;       // 1..12
    int headingId;    // language entry (section 13); 0: no heading
  };
  static constexpr int kColumnCount = 12;
  enum Position : int {
    kCheck, kIcon, kExchange, kSymbol, kName, kTrgOnce, kValidity, kDelay, kCondition, kCurValue, kAlertVia, kStatus,
  };
  static const std::array<ColumnDef, kColumnCount>& Columns();
  static constexpr const wchar_t* kDefaultVisibility = L"111111111101";
  static constexpr int kRowHeight = 21;
  static constexpr int kTickWidth = 24;
  static constexpr int kIconWidth = 28;
  static constexpr int kMinColumnWidth = 40;
  // Style colour ids of the status texts.
  static constexpr int kTriggeredColor = 202;
  static constexpr int kExpiredColor = 201;

  explicit AlertGrid(QWidget* parent = nullptr);
  ~AlertGrid() override;

  // ---- Columns ----
  // One "0"/"1" per column in table order; a shorter text gives the default.
  void SetVisibility(const std::wstring& visibility);
  const std::wstring& Visibility() const { return m_visibility; }
  const std::vector<int>& ShownColumns() const { return m_shown; }
  // Table position of a shown column; -1 outside.
  int PositionOf(int col) const;
  // The shown column of a table position; -1 when hidden.
  int ColumnOf(int position) const;
  // Spreads the client width over the shown columns (tick and icon columns
  // keep their narrow widths).
  void RefitColumns();
  bool RefitPending() const { return m_refitPending; }
  // Clears the pending flag; true when a re-fit was pending.
  bool TakeRefit();

  // ---- Rows ----
  // The filtered alerts, one per row; re-fits and redraws.
  void SetRows(std::vector<PriceAlertItem> rows);
  const std::vector<PriceAlertItem>& Rows() const { return m_rows; }
  bool AllTicked() const { return m_allTicked; }
  // Toggles the tick of a row and writes the record back into the store.
  void ToggleRow(int row);
  // Flips the heading's tick and sets every alert of the store (and every row) to it.
  void ToggleAll();
  int TickedCount() const;
  // Ids of the ticked rows, in row order.
  std::vector<std::int32_t> TickedIds() const;
  void SetTickCallback(std::function<void()> callback) { m_onTicks = std::move(callback); }

  // ---- Texts and quotes ----
  void SetAppCaption(const std::wstring& caption) { m_appCaption = caption; }
  // Headings from the text cache (the owner loads 701..734 first); the status
  // texts 735 and 736 from the language service.
  void ApplyLanguage(const ILanguage* language) override;
  void SetStyleManager(IStyleManager* style) override;
  void ChangeStyle(int styleId);
  // The instruments of the rows, each once.
  std::set<InstrumentKey> InstrumentKeys() const;
  // The newest quote-record version among the rows' instruments.
  std::uint64_t QuoteVersion() const;
  std::wstring HeadingText(int position) const;
  QString CellText(int col, int row);

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override;
  int OnCellTypeNotify(CGridCellType* type, int col, int row, int code, std::intptr_t param) override;
  bool OnHint(int col, int row, QString& text) override;
  void OnSize(int width, int height) override;

 private:
  // Draws the product picture whose index the cell's parameter holds.
  class PictureType : public CGridCellType {
   public:
    explicit PictureType(AlertGrid* grid) : CGridCellType(grid), m_owner(grid) {}
    void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
                bool current) override;

   private:
    AlertGrid* m_owner;
  };

  void ApplyVisibility();
  // Index of the product's picture (loaded once per picture name); -1: none.
  int PictureIndex(std::int64_t productId);
  void NotifyTicks();
  void FillDataCell(int position, const PriceAlertItem& alert, CGridCell& cell);

  std::wstring m_visibility = kDefaultVisibility;
  std::vector<int> m_shown;
  std::vector<PriceAlertItem> m_rows;
  bool m_allTicked = false;
  bool m_refitPending = false;
  std::array<std::wstring, kColumnCount> m_headings;
  std::wstring m_triggeredText = L"Triggered";
  std::wstring m_expiredText = L"Expired";
  std::wstring m_appCaption;
  QColor m_triggeredColor{0, 90, 200};
  QColor m_expiredColor{130, 136, 146};
  PCheckBoxTypeEx m_check{this};
  PictureType m_picture{this};
  std::map<std::string, int> m_pictureIndex;  // picture name -> index in m_pictures
  std::vector<QPixmap> m_pictures;
  int m_styleId = 0;
  std::function<void()> m_onTicks;
};
