#pragma once
// Colour and font roles the host controls ask the style manager for. The
// terminal's style manager answers these ids; a control without a style
// manager uses the platform palette. Ids 24, 101 and 204 are the terminal's
// common link, window background and window text roles; the 9100 range belongs
// to the host controls alone.
namespace hv::style {

inline constexpr int kLinkText = 24;
inline constexpr int kWindowBackground = 101;
inline constexpr int kWindowText = 204;

// Tab strip (CCustomTabCtrl).
inline constexpr int kTabBackground = 9101;      // strip behind the tabs
inline constexpr int kTabText = 9102;            // unselected tab text
inline constexpr int kTabFace = 9103;            // unselected tab face
inline constexpr int kTabSelectedFace = 9104;
inline constexpr int kTabSelectedText = 9105;
inline constexpr int kTabBorder = 9106;
inline constexpr int kTabStatusText = 9107;

// Buttons (CImageButton, CButtonEx, CBranticButton, CBranticSpinBt).
inline constexpr int kButtonFace = 9111;
inline constexpr int kButtonText = 9112;
inline constexpr int kButtonHotFace = 9113;     // under the pointer
inline constexpr int kButtonPressedFace = 9114;
inline constexpr int kButtonBorder = 9115;
inline constexpr int kButtonDisabledText = 9116;

// Edits (CBranticEdit, CFloatEdit, CptDatetimeCtrl).
inline constexpr int kEditBackground = 9121;
inline constexpr int kEditText = 9122;
inline constexpr int kEditBorder = 9123;

// Caption bar (CBranticTitle).
inline constexpr int kTitleBackground = 9131;
inline constexpr int kTitleText = 9132;

// Tool tips (CPPToolTip).
inline constexpr int kTipBackground = 9141;
inline constexpr int kTipText = 9142;
inline constexpr int kTipBorder = 9143;

// Fonts.
inline constexpr int kFontControl = 9201;  // buttons, edits, tabs
inline constexpr int kFontTitle = 9202;    // caption bar
inline constexpr int kFontTip = 9203;      // tool tips

}  // namespace hv::style
