#pragma once
// Skinned controls: one proxy style that draws flat scroll bars, frames and
// combo boxes in the colours of the terminal's current style. Widgets keep
// their Qt behaviour; only the look changes.
#include <QColor>
#include <QComboBox>
#include <QProxyStyle>

class IStyleManager;

namespace skin {

// Style colour ids the skinned controls read.
enum ColorId : int {
  kRowOdd = 106,      // grid: odd rows (and the corner)
  kRowEven = 107,     // grid: even rows
  kHeadBack = 108,    // grid: heading face, scroll bar thumb
  kCellText = 109,    // grid: cell text
  kHeadText = 110,    // grid: heading text
  kFrame = 111,       // grid lines, frames, scroll bar track border
  kEditText = 301,    // combo box / edit text
  kEditBack = 304,    // combo box / edit background
};

struct SkinColors {
  QColor back{255, 255, 255};       // windows and edits
  QColor text{0, 0, 0};
  QColor frame{160, 160, 160};
  QColor face{236, 236, 236};       // buttons, headings, scroll bar thumb
  QColor faceText{0, 0, 0};
  QColor track{246, 246, 246};      // scroll bar groove
  QColor highlight{56, 117, 215};
  QColor highlightText{255, 255, 255};
  QColor placeholder{0xAA, 0xAA, 0xAA};
};

SkinColors DefaultColors();
// Colours of the style; defaults for a null style.
SkinColors ColorsFromStyle(const IStyleManager* style);

class CSkinStyle : public QProxyStyle {
  Q_OBJECT
 public:
  explicit CSkinStyle(const SkinColors& colors);
  void SetColors(const SkinColors& colors) { m_colors = colors; }
  const SkinColors& Colors() const { return m_colors; }

  int pixelMetric(PixelMetric metric, const QStyleOption* option, const QWidget* widget) const override;
  void drawComplexControl(ComplexControl control, const QStyleOptionComplex* option, QPainter* painter,
                          const QWidget* widget) const override;
  void drawPrimitive(PrimitiveElement element, const QStyleOption* option, QPainter* painter,
                     const QWidget* widget) const override;
  QPalette standardPalette() const override;
  void polish(QPalette& palette) override;
  using QProxyStyle::polish;

 private:
  void DrawScrollBar(const QStyleOptionSlider* option, QPainter* p, const QWidget* widget) const;
  void DrawComboBox(const QStyleOptionComboBox* option, QPainter* p, const QWidget* widget) const;
  SkinColors m_colors;
};

// The palette the skinned widgets use for `colors`.
QPalette PaletteFor(const SkinColors& colors);
// Puts `widget` (and its scroll bars and children) on a skin style owned by
// the widget, with the colours given. Calling it again changes the colours.
void ApplySkin(QWidget* widget, const SkinColors& colors);

}  // namespace skin

// The combo box face the add-on's drop-downs use.
class CSkinComboBox : public QComboBox {
  Q_OBJECT
 public:
  explicit CSkinComboBox(QWidget* parent = nullptr);
  void SetStyleManager(const IStyleManager* style);
  void SetSkinColors(const skin::SkinColors& colors);
  const skin::SkinColors& SkinColorsInUse() const { return m_colors; }

 protected:
  skin::SkinColors m_colors;
};
