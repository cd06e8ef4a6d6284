#pragma once
// Colour and font roles the host controls ask the style manager for. They are
// the terminal's common roles (1 window, 2 text, 3 button face, 4 border,
// 24 link, 101/204 view background and text, 102/103 heading, 112/113
// selection, 201 muted text), so every style that colours the views colours
// the controls too. A control without a style manager uses the platform palette.
namespace hv::style {

inline constexpr int kWindow = 1;
inline constexpr int kText = 2;
inline constexpr int kFace = 3;
inline constexpr int kBorder = 4;
inline constexpr int kLinkText = 24;
inline constexpr int kWindowBackground = 101;
inline constexpr int kWindowText = 204;
inline constexpr int kHeading = 102;
inline constexpr int kHeadingText = 103;
inline constexpr int kSelection = 112;
inline constexpr int kSelectionText = 113;
inline constexpr int kMutedText = 201;

// Tab strip (CCustomTabCtrl).
inline constexpr int kTabBackground = kWindow;  // strip behind the tabs
inline constexpr int kTabText = kText;
inline constexpr int kTabFace = kFace;
inline constexpr int kTabSelectedFace = kSelection;
inline constexpr int kTabSelectedText = kSelectionText;
inline constexpr int kTabBorder = kBorder;
inline constexpr int kTabStatusText = kMutedText;

// Buttons (CImageButton, CButtonEx, CBranticButton, CBranticSpinBt).
inline constexpr int kButtonFace = kFace;
inline constexpr int kButtonText = kText;
inline constexpr int kButtonHotFace = kSelection;  // under the pointer
inline constexpr int kButtonPressedFace = kBorder;
inline constexpr int kButtonBorder = kBorder;
inline constexpr int kButtonDisabledText = kMutedText;

// Edits (CBranticEdit, CFloatEdit, CptDatetimeCtrl).
inline constexpr int kEditBackground = kWindow;
inline constexpr int kEditText = kText;
inline constexpr int kEditBorder = kBorder;

// Caption bar (CBranticTitle).
inline constexpr int kTitleBackground = kHeading;
inline constexpr int kTitleText = kHeadingText;

// Tool tips (CPPToolTip).
inline constexpr int kTipBackground = kFace;
inline constexpr int kTipText = kText;
inline constexpr int kTipBorder = kBorder;

// Fonts; a style manager that does not know them gives its default UI font.
inline constexpr int kFontControl = 9201;  // buttons, edits, tabs
inline constexpr int kFontTitle = 9202;    // caption bar
inline constexpr int kFontTip = 9203;      // tool tips

}  // namespace hv::style
