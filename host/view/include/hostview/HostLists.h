#pragma once
// Records of the terminal <-> view channel beyond the reference lists of
// Records.h: watchlist lists and saves, market information, exchange checks,
// price information, price-step bands, sectors, size and lookup records.
// Plain data, no Qt. The terminal and the add-on both include this header.
//
// Data-word conventions (the word of OnHostMessage / SendChildFeedback):
// - "list": the word is `const std::vector<Row>*`, owned by the sender and
//   valid only for the duration of the call; the receiver copies what it keeps.
// - "record": the word is `const Record*`, built by the sender for the call.
// - "int": the number itself travels in the word (no pointer).
// - text requests 514/515/518/2814 carry `const std::string*` (the narrow key);
//   answers 515/518 carry `const std::string*`, answers 514/2814 `const std::wstring*`.
// - 101 and 206 carry `const std::wstring*`; 615 carries `const std::wstring*`
//   (a JSON link text).
// - 200 carries either `const ViewLink*` or `const std::wstring*` (the class
//   name alone). `ViewLink` starts with its class name, so the terminal reads
//   the class name the same way in both cases and takes the link from the 310
//   that follows.
#include <cstdint>
#include <string>
#include <vector>

// ---- Watchlists ------------------------------------------------------------

// 610 terminal -> view: one row per (user watchlist, instrument), in list order
// and item order. A watchlist without items has one row with an empty code.
struct JWatchlistRow {
  std::int32_t watchlistId = 0;
  std::int32_t productId = 0;  // 32-bit on this channel; widened with sign by the reader
  std::string watchlistName;
  std::string instrumentCode;
  std::int32_t seqId = 0;       // position of the item, from 1 (0 for the empty row)
  std::int32_t listSeqId = 0;   // position of the watchlist among the user's, from 0
};

// 611 terminal -> view: the ids the terminal assigned, by watchlist name.
struct JWatchlistIdRow {
  std::int32_t watchlistId = 0;
  std::string watchlistName;
};

// One instrument of a TOP30 list.
struct JTop30Item {
  std::int64_t productId = 0;
  std::string instrumentCode;
  std::string exchangeCode;
};

// One TOP30 list ("Top Gainers", ...). `listName` may be a key that the
// "MKTEX" setting translates into a display name.
struct JTop30List {
  std::string listName;
  std::vector<JTop30Item> instruments;  // in rank order
};

// 520 and 521 terminal -> view: list of groups (one group per exchange).
// The view names each list groupName + " - " + listName and gives it the id
// group index * 1000 + list index.
struct JTop30Group {
  std::string groupName;
  std::vector<JTop30List> lists;
};

// 522 terminal -> view: one row per (brand watchlist, instrument), in list and
// item order; a brand watchlist without items has one row with an empty code.
// The first row of a name carries the watchlist's id.
struct JKeldoWatchlistRow {
  std::int32_t watchlistId = 0;
  std::string watchlistName;
  std::int64_t productId = 0;
  std::string instrumentCode;  // the full code, "[KELDO]" prefix included
  std::string exchangeCode;
  std::int32_t seqId = 0;      // position of the item, from 1 (0 for the empty row)
};

// 611, 612, 617, 618 view -> terminal (record): a watchlist save.
// 611: text = the watchlist-names XML, id unused; 612: id + user item XML;
// 617: id + the new name (plain text); 618: id + brand item XML.
struct WatchlistFeedback {
  std::int32_t WatchlistID = 0;
  std::wstring text;
};

// ---- Market information (601), exchange check (604) ------------------------

// 601 view -> terminal (record). The terminal answers synchronously with a
// list of JMarketInfo whose first row is the asked exchange (empty list when
// the exchange is unknown).
struct JMarketInfoRequest {
  std::int64_t productId = 0;
  std::string exchangeCode;
};

struct JMarketInfo {
  std::int64_t productId = 0;
  std::string exchangeCode;
  std::int32_t delay = 0;        // quote delay in minutes; 0: real time
  std::string marketStatus;      // "Open", "Closed", "Pre-open"
  std::string openTime;          // "HH:MM"
  std::string closeTime;         // "HH:MM"
  std::string marketName;
};

// 604 view -> terminal: the word is `const JExchangeList*` (exchangeCode and
// productId are read). The terminal answers synchronously with 604 whose word
// is nonzero when the exchange is enabled for the user.

// ---- Price information (513) and bands (2301) ------------------------------

// 513 view -> terminal (record).
struct JPriceInfoRequest {
  std::int32_t priceStepTableId = 0;
  double referencePrice = 0.0;
};

// 513 terminal -> view (record, exactly 32 bytes): the answer to the request.
struct JPriceInformation {
  double referencePrice = 0.0;  // as asked
  double tickSize = 0.0;        // the step at the reference price
  double lowerLimit = 0.0;      // lowest accepted price (0: none)
  double upperLimit = 0.0;      // highest accepted price (0: none)
};
static_assert(sizeof(JPriceInformation) == 32, "513 carries 32 bytes");

// One band of a price-step table: prices from `lower` to `upper` move by `step`.
// Table 0 is the default table.
struct TickBand {
  std::int32_t tableId = 0;
  double lower = 0.0;
  double upper = 0.0;
  double step = 0.0;
};

// 2301 terminal -> view (record): every band of every table.
struct JTickBandList {
  std::int32_t count = 0;
  const std::vector<TickBand>* bands = nullptr;
};

// ---- Sectors (2800) ---------------------------------------------------------

// 2800 terminal -> view: list of JSector, in display order. An instrument
// belongs to a sector when its `sector` text contains `sectorCode`.
struct JSector {
  std::string sectorCode;
  std::string sectorName;
};

// ---- Remark messages (504) --------------------------------------------------

// 504 terminal -> view: list of JRemarkMessage (exchange remark codes and
// their meaning).
struct JRemarkMessage {
  std::string exchangeCode;
  std::string remarkCode;
  std::string text;
};

// ---- Sizes and lookups ------------------------------------------------------

// 112 view -> terminal (record): open `className` in a frame of this size.
// 102, 103 and 110 carry a ViewSize (Records.h).
struct ViewOpenRequest {
  std::wstring className;
  std::int32_t width = 0;
  std::int32_t height = 0;
};

// 550 and 551 view -> terminal (record): look an instrument up by chart code
// (550) or instrument code (551) in `text`. The terminal answers synchronously
// with the same number whose word is `const JInstrumentUnderlying*` or 0.
// The pointer stays valid until the next 500.
struct JInstrumentLink {
  std::int64_t productId = 0;
  std::string text;
  std::int32_t number = 0;  // related order type
};

// 413 view -> terminal (record): a value split in thousands and remainder.
struct JSplitValue {
  std::int32_t thousands = 0;
  std::int32_t remainder = 0;
};

// 516 view -> terminal (record): a display or trade setting to save.
struct JSettingSave {
  std::string key;
  std::string value;
};
