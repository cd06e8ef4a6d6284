#pragma once
// One quote tile of the price view's board: the instrument named by the cell's
// numeric parameter (1,000,000 and up: InstrumentMgr at value - 1,000,000;
// below: InstrumentMgr_ReadOnly), its quote from the quote store, and a
// quantity box with a drop list of offered quantities.
//
// Codes reported to the grid (CGridCtrl::OnCellTypeNotify):
//   85 / 86  pointer over the title button / the second-strip button (param:
//            the area, non-zero) or leaving it (param 0): show / hide a tip
//   87       double click on the tile (param: the area, e.g. kBidBox/kAskBox)
//   88       press outside the tile's buttons (param 0); LastPressArea() tells
//            where (kBidBox, kAskBox: the trading parts)
//   89       right click on the tile (param: the area)
//   90       second-strip button clicked (press and release on it)
//   91       title button clicked
//   kNotifyDropSelected (3) a quantity was chosen from the list (param: index;
//            QuantityListText(index) gives its text)
// The quantity field starts in-place editing of the cell on click (the grid's
// OnEditStart/OnEditFinish keep the text); the editor sits over the field.
#include <QStringList>
#include <functional>
#include <set>
#include <string>
#include <utility>

#include "controls/CellTypes.h"
#include "data/QuoteStore.h"
#include "grid/GridCellType.h"

class CSuperBaseView;
class ILanguage;

class PBoardTypeEx : public CGridDropListType, public CStyledCellType {
 public:
  enum Code : int {
    kCodeHoverTitle = 85, kCodeHoverSecond = 86, kCodeDoubleClick = 87, kCodePress = 88, kCodeRightClick = 89,
    kCodeSecondButton = 90, kCodeTitleButton = 91,
  };
  enum Area : int {
    kNone = 0, kBody, kTitleStrip, kTitleButton, kSecondStrip, kSecondButton, kBottomBar, kQtyField,
    kQtyListButton, kBidBox, kAskBox,
  };
  // Pressed marks kept in the cell's flags while a button is held.
  static constexpr std::uint32_t kPressedSecond = 0x40000000u;
  static constexpr std::uint32_t kPressedTitle = 0x80000000u;
  // Set by the grid on a tile whose quantity failed validation.
  static constexpr std::uint32_t kFlagInvalidQuantity = 0x00010000u;
  // Set by the grid on the tile the user picked (drawn as selected).
  static constexpr std::uint32_t kFlagSelectedTile = 0x00020000u;
  // Set by the grid on tiles of a list the user cannot edit: no remove button.
  static constexpr std::uint32_t kFlagFixedTile = 0x00040000u;
  static constexpr std::int64_t kWritableBase = 1000000;
  // Style colours of rise, fall and a fresh change (those of the quote table).
  enum StyleColor : int {
    kStyleRise = 3101, kStyleFall = 3102, kStyleChangedText = 3103, kStyleRiseBack = 3104, kStyleFallBack = 3106,
  };
  static constexpr const wchar_t* kCompanyInfoPicture = L"images/QuickBar/[styleID]/CompanyInfo.bmp";

  explicit PBoardTypeEx(CGridCtrl* grid = nullptr);
  ~PBoardTypeEx() override;

  // ---- Areas, in cell coordinates; hit tests include both edges ----
  // An area as {left, top, right, bottom}, edges inclusive.
  struct Box {
    int l = 0, t = 0, r = -1, b = -1;
    bool Contains(const QPoint& p) const { return p.x() >= l && p.x() <= r && p.y() >= t && p.y() <= b; }
    int Height() const { return b - t; }
    QRect ToRect() const { return QRect(QPoint(l, t), QPoint(r, b)); }
  };
  static Box AreaBox(const QRect& cell, Area area);
  // The most specific area at `pt` (buttons before strips before the body).
  static Area HitArea(const QRect& cell, const QPoint& pt);

  // ---- Set-up by the board grid ----
  void SetOwnerView(CSuperBaseView* view) { m_owner = view; }
  void SetLanguage(ILanguage* language) { m_language = language; }
  // Offered quantities of the tile (for the drop list).
  void SetQuantitySource(std::function<QStringList(int col, int row)> source) { m_quantities = std::move(source); }
  Area LastPressArea() const { return m_lastPress; }
  QString QuantityListText(int index);
  // The market delay text of an exchange (asks 601 through the owner view
  // once per key on a miss); what the tile's badge shows.
  QString MarketDelay(std::int64_t productId, const std::string& exchange);
  // Texts as a tile shows them. A volume: grouped, millions and billions
  // shortened; a change with its sign; a percentage with sign and "%".
  static QString VolumeText(const QuoteCell& cell);
  static QString ChangeText(const QuoteCell& change);
  static QString PercentText(const QuoteCell& percent);
  static QString NameText(const JInstrumentUnderlying& instrument);
  static QString CodeText(const JInstrumentUnderlying& instrument);
  // Caption texts 201 to 205 of section 13: "Bid", "Ask", "Vol", "Chg", "Delay".
  QString Caption(int id) const;

  // ---- The cell-type interface ----
  std::wstring GetName() const override { return L"BoardType"; }
  QUuid GetUUID() const override { return QUuid("{3E1B77C4-5A2F-4C3D-9B1E-7F20C6D4A911}"); }
  bool HandlesMouse() const override { return true; }
  bool OnLClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  bool OnDClicked(int col, int row, const QRect& rect, const QPoint& pt) override;
  bool OnRClicked(int col, int row, bool pressed, const QRect& rect, const QPoint& pt) override;
  void OnMouseMove(int col, int row, const QRect& rect, const QPoint& pt) override;
  void OnDraw(QPainter& p, const QRect& rect, int col, int row, const CGridCell& cell, bool selected,
              bool current) override;
  void OnDropListSelected(int col, int row, int index, const QString& text) override;
  QRect EditRect(int col, int row, const QRect& cellRect) override;

  // The press state: 0 none, 1 second-strip button, 2 title button, 3 quantity field.
  int PressState() const { return m_state; }

 private:
  void DrawTile(QPainter& p, const QRect& rect, const CGridCell& cell, bool selected);
  // HitArea, with the remove button of a fixed tile taken as its title strip.
  Area TileArea(int col, int row, const QRect& rect, const QPoint& pt) const;
  void ClearPress();

  CSuperBaseView* m_owner = nullptr;
  ILanguage* m_language = nullptr;
  std::function<QStringList(int, int)> m_quantities;
  // The hot areas last reported: cell, and the areas of codes 85 and 86.
  std::int32_t m_hotCol = -1, m_hotRow = -1, m_hot85 = -1, m_hot86 = -1;
  int m_state = 0;
  int m_pressCol = -1, m_pressRow = -1;
  Area m_lastPress = kNone;
  CStyleImage m_companyInfo;
  std::map<std::wstring, CStyleImage> m_productImages;
  std::set<std::pair<std::int64_t, std::string>> m_asked;  // market delays asked once per key
};
