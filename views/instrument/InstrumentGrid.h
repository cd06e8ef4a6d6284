#pragma once
// CInstrumentGrid: what the grids of the single-instrument views (depth, time
// and sales, trade summary) share on top of the grid engine:
//   - a message shown over the empty grid (the empty-state text, or why the
//     instrument is refused);
//   - the row colours of the style (odd/even rows, data text, changed values);
//   - the hooks the shared view calls: Reset, NewestStamp, ApplyLanguage.
// UI thread only.
#include <QString>
#include <cstdint>
#include <string>

#include "grid/GridCtrl.h"

class IStyleManager;
class ILanguage;

// Heading cells whose text is cut with "…" when the column is too narrow
// (the heading's hint still shows it whole).
class CElidedHeadingType : public CGridHeadingType {
 public:
  using CGridHeadingType::CGridHeadingType;
  std::wstring GetName() const override { return L"ElidedHeading"; }
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
};

class CInstrumentGrid : public CGridCtrl {
  Q_OBJECT
 public:
  // Style colour ids the instrument grids read.
  enum ColorId : int {
    kOddRow = 106,       // odd rows and the corner
    kEvenRow = 107,      // even rows
    kHeadBack = 108,     // heading face
    kCellText = 109,     // data text
    kHeadText = 110,     // heading text
    kFrame = 111,        // grid lines
    kChangedText = 3103, // text of a changed value
    kChangedBack = 3105, // background of a changed value
  };

  explicit CInstrumentGrid(QWidget* parent = nullptr);
  ~CInstrumentGrid() override;

  // The text over the empty grid; empty: none. Drawn whenever it is set,
  // below the heading row.
  void SetMessage(const std::wstring& text);
  const std::wstring& GetMessage() const { return m_message; }

  // Takes the colours (and fonts) of the style; null keeps the defaults.
  virtual void SetStyleManager(IStyleManager* style);
  IStyleManager* GetStyleManager() const { return m_style; }
  // Re-reads headings from the language table (section 13).
  virtual void ApplyLanguage(const ILanguage* language) {}
  // No rows and no instrument.
  virtual void Reset();
  // Recounts the rows from the stores and returns the newest change stamp of
  // what they show (0: nothing to show).
  virtual std::uint64_t NewestStamp() { return 0; }
  void Redraw();

  // Colours in use (after SetStyleManager).
  QColor OddRowColor() const { return m_oddRow; }
  QColor EvenRowColor() const { return m_evenRow; }
  QColor CellTextColor() const { return m_cellText; }
  QColor ChangedTextColor() const { return m_changedText; }
  QColor ChangedBackColor() const { return m_changedBack; }
  // Row background: odd rows (1, 3, ...) take 106, even rows 107.
  QColor RowBackColor(int row) const { return (row % 2) ? m_oddRow : m_evenRow; }

  // The text over the empty grid, for the terminal's dump (read by name).
  Q_INVOKABLE QString messageText() const { return QString::fromStdWString(m_message); }

 protected:
  void paintEvent(QPaintEvent* e) override;

  IStyleManager* m_style = nullptr;
  QColor m_oddRow{255, 255, 255};
  QColor m_evenRow{244, 246, 250};
  QColor m_cellText{0, 0, 0};
  QColor m_changedText{0, 0, 0};
  QColor m_changedBack{255, 236, 160};
  QColor m_headBack{58, 74, 99};
  QColor m_headText{255, 255, 255};
  CElidedHeadingType m_headingType{this};

 private:
  std::wstring m_message;
};
