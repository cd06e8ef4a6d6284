#pragma once
// The terminal's widget style: Fusion (which draws everything from the
// palette, so the light and dark styles colour the whole window), and dock
// tabs that show "&" in a title ("S&P 500") as itself: the main window's tab
// bar would read it as a mnemonic while the dock's own title bar does not.
#include <QProxyStyle>

namespace term {

class TerminalStyle : public QProxyStyle {
  Q_OBJECT
 public:
  TerminalStyle();
  void drawControl(ControlElement element, const QStyleOption* option, QPainter* painter,
                   const QWidget* widget = nullptr) const override;
  QSize sizeFromContents(ContentsType type, const QStyleOption* option, const QSize& size,
                         const QWidget* widget = nullptr) const override;
};

}  // namespace term
