#pragma once
// Numbers of the terminal <-> view message channel. Shared by the terminal and
// the add-on, which must never disagree on them. V: view to terminal, H: terminal to view.
#include "hostview/Types.h"

namespace hm {
constexpr UINT Deactivate = 1;            // H
constexpr UINT Activate = 2;              // H
constexpr UINT Title = 101;               // V wide string
constexpr UINT ViewSizeRequest = 102;     // V ViewSize
constexpr UINT AlertFrameSize = 103;      // V (new-alert view)
constexpr UINT AlertFrameSize2 = 110;     // V (new-alert view)
constexpr UINT OpenAlertForm = 112;       // V (alert list)
constexpr UINT OpenView = 200;            // V ViewLink, or wide class name for "CInsExpViewEx"
constexpr UINT AlertSubmitted = 202;      // V 0
constexpr UINT ShortcutContext = 206;     // V wide string "OPEN_TRADE_SHORTCUT"
constexpr UINT WatchlistsLoaded = 300;    // V record
constexpr UINT LinkData = 310;            // V/H ViewLink
constexpr UINT FetchFields = 400;         // V FieldRequest, ","-joined names
constexpr UINT WithdrawField = 401;       // V FieldRequest
constexpr UINT FieldValue = 410;          // H FieldUpdate
constexpr UINT RequestField = 412;        // V FieldRequest / H FieldUpdate
constexpr UINT PriceViewRequest413 = 413; // V two int32
constexpr UINT InstrumentFieldUpdate = 414;  // H FieldUpdate, to the leading price view: "INSTRNAME", "REMARKS"
constexpr UINT InstrumentList = 500;      // V none / H JInstrumentListMsg
constexpr UINT ExchangeList = 503;        // V none / H JExchangeListMsg
constexpr UINT RemarkMessages = 504;      // V/H
constexpr UINT ProductList = 505;         // V none / H JProductListMsg
constexpr UINT AlertBoardRequest = 513;   // V/H record
constexpr UINT TextByKey = 514;           // V narrow key / H wide text (synchronous)
constexpr UINT SystemParameter = 515;     // V narrow key / H narrow text (synchronous)
constexpr UINT SaveSetting = 516;         // V record
constexpr UINT NoticeParameter = 518;     // V narrow key / H narrow text (synchronous)
constexpr UINT DisplayMode = 519;         // V int32 1 / H int32 (synchronous)
constexpr UINT WatchlistGroups520 = 520;  // V/H list
constexpr UINT WatchlistGroups521 = 521;  // V/H list
constexpr UINT WatchlistRows522 = 522;    // V/H list
constexpr UINT LinkModeFlag = 528;        // H/V 0 or 1
constexpr UINT CompactLayout = 529;       // V/H 0 or 1
constexpr UINT FindByChartCode = 550;     // V link record / H instrument pointer (synchronous)
constexpr UINT FindByCode = 551;          // V / H instrument pointer (synchronous)
constexpr UINT PriceViewRequest553 = 553; // V none
constexpr UINT MarketInfo = 601;          // V {product id, exchange code} / H list (synchronous)
constexpr UINT ExchangeEnabled = 604;     // V exchange record / H int32 (synchronous)
constexpr UINT Watchlist606 = 606;
constexpr UINT WatchlistList = 610;       // V/H list
constexpr UINT SaveWatchlistNames = 611;  // V
constexpr UINT SaveUserWatchlist = 612;   // V
constexpr UINT LinkedInstrument = 615;    // H JSON link text
constexpr UINT FontSizeMenu = 616;        // H none
constexpr UINT RenameWatchlist = 617;     // V
constexpr UINT SaveKeldoWatchlist = 618;  // V
constexpr UINT Watchlist622 = 622;
constexpr UINT Alert701 = 701;
constexpr UINT Alert702 = 702;
constexpr UINT Alert703 = 703;
constexpr UINT Alert704 = 704;
constexpr UINT Alert705 = 705;
constexpr UINT PriceBands = 2301;         // H record (new-alert view)
constexpr UINT AltStatus = 2310;          // V none / H int32 (synchronous)
constexpr UINT SettingsChanged = 2600;    // V/H none
constexpr UINT TabMoved2700 = 2700;       // V
constexpr UINT TabMoved2701 = 2701;       // V
constexpr UINT Sectors = 2800;            // V/H record
constexpr UINT MessageText = 2814;        // V narrow code key / H wide text (synchronous)
}  // namespace hm
