#pragma once
// The terminal -> view messages as bytes: what the terminal writes with
// --trace-messages and what the fuzz harnesses read back and deliver. Each
// number has one shape (the record its data word points to, a text, or the
// word itself); a message is its number followed by that record, field by
// field in declaration order. Plain C++, no Qt.
//
// Encoding: whole numbers as LEB128 (signed ones zigzagged), doubles as their
// 8 bytes, narrow texts as a length and bytes, wide texts as a length and one
// number per character (any value, not only valid code points), lists as a
// count and their rows. A pointer-carrying word starts with one byte: 0 for a
// null word. Reading is total: past the end every number reads 0 and every
// text and list is empty, and no count asks for more rows than bytes remain,
// so any bytes decode to some message.
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "hostview/AlertRecords.h"
#include "hostview/HostLists.h"
#include "hostview/Records.h"
#include "hostview/Types.h"

namespace hv::trace {

// The record a message number carries from the terminal to a view.
enum class Shape : std::uint8_t {
  Word,         // the number itself (1, 2, 300, 519, 528, 529, 604, 616, 2310, 2600 and unknown numbers)
  Link,         // ViewLink (310)
  Field,        // FieldUpdate (410, 412, 414)
  Instruments,  // JInstrumentListMsg (500)
  Exchanges,    // JExchangeListMsg (503)
  Remarks,      // list of JRemarkMessage (504)
  Products,     // JProductListMsg (505)
  PriceInfo,    // JPriceInformation (513)
  WideText,     // std::wstring (514, 2814, 615)
  NarrowText,   // std::string (515, 518)
  Top30,        // list of JTop30Group (520, 521)
  Keldo,        // list of JKeldoWatchlistRow (522)
  Instrument,   // JInstrumentUnderlying (550, 551)
  MarketInfo,   // list of JMarketInfo (601)
  UserRows,     // list of JWatchlistRow (610)
  IdRows,       // list of JWatchlistIdRow (611)
  Alerts,       // list of PriceAlertItem (701)
  Alert,        // PriceAlertItem (702, 703, 705)
  AlertIds,     // list of int32 (704)
  Bands,        // JTickBandList (2301)
  Sectors,      // list of JSector (2800)
};
HV_API Shape ShapeOf(UINT message);

// Appends `message` with its data word's record to `out`.
HV_API void Encode(UINT message, LPARAM data, std::string& out);

// One decoded message: it owns every record its word points to.
struct HV_API Message {
  UINT number = 0;
  LPARAM word = 0;  // what OnHostMessage gets

  // Storage (only the members of the message's shape are used).
  ViewLink link;
  std::wstring wide;
  std::string narrow;
  FieldUpdate field;
  JInstrumentListMsg instrumentMsg;
  std::vector<JInstrumentUnderlying> instruments;
  JInstrumentUnderlying instrument;
  JExchangeListMsg exchangeMsg;
  std::vector<JExchangeList> exchanges;
  JProductListMsg productMsg;
  std::vector<JProduct> products;
  std::vector<JRemarkMessage> remarks;
  JPriceInformation priceInfo;
  std::vector<JTop30Group> top30;
  std::vector<JKeldoWatchlistRow> keldo;
  std::vector<JMarketInfo> markets;
  std::vector<JWatchlistRow> userRows;
  std::vector<JWatchlistIdRow> idRows;
  std::vector<PriceAlertItem> alerts;
  PriceAlertItem alert;
  std::vector<std::int32_t> alertIds;
  JTickBandList bandMsg;
  std::vector<TickBand> bands;
  std::vector<JSector> sectors;

  Message() = default;
  // The word points into the message itself: no copies.
  Message(const Message&) = delete;
  Message& operator=(const Message&) = delete;
};

// Bytes being read; every read is total (see above).
class HV_API Reader {
 public:
  explicit Reader(std::string_view bytes) : m_in(bytes) {}
  bool AtEnd() const { return m_in.empty(); }
  std::size_t Remaining() const { return m_in.size(); }
  std::uint8_t Byte();
  std::uint64_t Unsigned();
  std::int64_t Signed();
  double Double();
  std::string Narrow();
  std::wstring Wide();
  // A list's row count, never more than the bytes left.
  std::size_t Count();

 private:
  std::string_view m_in;
};

// Reads a message number and its record; false at the end of the bytes.
HV_API bool Decode(Reader& in, Message& out);
// Reads the record of `number` (the caller read or chose the number).
HV_API void DecodeAs(UINT number, Reader& in, Message& out);

}  // namespace hv::trace
