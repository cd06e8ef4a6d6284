#include "hostview/MessageTrace.h"

#include <algorithm>
#include <cstring>
#include <type_traits>

#include "hostview/MessageIds.h"

namespace hv::trace {
namespace {

// ---- The fields of each record, in declaration order -----------------------------------

template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, FieldUpdate>
void Fields(IO& io, R& r) {
  io(r.productId), io(r.instrumentCode), io(r.fieldName), io(r.value), io(r.param), io(r.kind);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JInstrumentUnderlying>
void Fields(IO& io, R& r) {
  io(r.exchangeCode), io(r.instrumentCode), io(r.productId), io(r.instrumentName), io(r.symbol), io(r.decimals);
  io(r.displayCode), io(r.accessStatus), io(r.altAccessStatus), io(r.lotSize), io(r.maxQty1), io(r.maxQty2);
  io(r.sector), io(r.priceStepTableId), io(r.referencePrice), io(r.chartCode), io(r.currency), io(r.isin);
  io(r.productType);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JProduct>
void Fields(IO& io, R& r) {
  io(r.productId), io(r.productType), io(r.productName), io(r.pictureFile);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JExchangeList>
void Fields(IO& io, R& r) {
  io(r.exchangeCode), io(r.marketName), io(r.exchangeName), io(r.productId);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JRemarkMessage>
void Fields(IO& io, R& r) {
  io(r.exchangeCode), io(r.remarkCode), io(r.text);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JPriceInformation>
void Fields(IO& io, R& r) {
  io(r.referencePrice), io(r.tickSize), io(r.lowerLimit), io(r.upperLimit);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JTop30Item>
void Fields(IO& io, R& r) {
  io(r.productId), io(r.instrumentCode), io(r.exchangeCode);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JTop30List>
void Fields(IO& io, R& r) {
  io(r.listName), io(r.instruments);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JTop30Group>
void Fields(IO& io, R& r) {
  io(r.groupName), io(r.lists);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JKeldoWatchlistRow>
void Fields(IO& io, R& r) {
  io(r.watchlistId), io(r.watchlistName), io(r.productId), io(r.instrumentCode), io(r.exchangeCode), io(r.seqId);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JMarketInfo>
void Fields(IO& io, R& r) {
  io(r.productId), io(r.exchangeCode), io(r.delay), io(r.marketStatus), io(r.openTime), io(r.closeTime);
  io(r.marketName);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JWatchlistRow>
void Fields(IO& io, R& r) {
  io(r.watchlistId), io(r.productId), io(r.watchlistName), io(r.instrumentCode), io(r.seqId), io(r.listSeqId);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JWatchlistIdRow>
void Fields(IO& io, R& r) {
  io(r.watchlistId), io(r.watchlistName);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, PriceAlertItem>
void Fields(IO& io, R& r) {
  io(r.alertId), io(r.productId), io(r.exchangeCode), io(r.instrumentCode), io(r.triggerOnce), io(r.validUntil);
  io(r.priceField), io(r.comparator), io(r.triggerValue), io(r.viaApp), io(r.viaEmail), io(r.viaSms);
  io(r.status), io(r.hostTextA), io(r.hostTextB), io(r.hostNumber), io(r.ticked);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, TickBand>
void Fields(IO& io, R& r) {
  io(r.tableId), io(r.lower), io(r.upper), io(r.step);
}
template <class IO, class R>
  requires std::is_same_v<std::remove_const_t<R>, JSector>
void Fields(IO& io, R& r) {
  io(r.sectorCode), io(r.sectorName);
}

// ---- Writing ----------------------------------------------------------------------

struct Writer {
  std::string& out;

  void Unsigned(std::uint64_t v) {
    while (v >= 0x80) {
      out.push_back(static_cast<char>((v & 0x7f) | 0x80));
      v >>= 7;
    }
    out.push_back(static_cast<char>(v));
  }
  void Signed(std::int64_t v) {
    Unsigned((static_cast<std::uint64_t>(v) << 1) ^ static_cast<std::uint64_t>(v >> 63));
  }
  void Byte(std::uint8_t b) { out.push_back(static_cast<char>(b)); }

  // One field, by type.
  void operator()(const std::string& s) {
    Unsigned(s.size());
    out += s;
  }
  void operator()(const std::wstring& s) {
    Unsigned(s.size());
    for (wchar_t c : s) Unsigned(static_cast<std::uint32_t>(c));
  }
  void operator()(double d) {
    char bytes[sizeof d];
    std::memcpy(bytes, &d, sizeof d);
    out.append(bytes, sizeof d);
  }
  void operator()(bool b) { Byte(b ? 1 : 0); }
  template <class T>
    requires std::is_integral_v<T>
  void operator()(T v) {
    Signed(static_cast<std::int64_t>(v));
  }
  template <class Row>
  void operator()(const std::vector<Row>& rows) {
    Unsigned(rows.size());
    for (const Row& r : rows) (*this)(r);
  }
  template <class R>
    requires std::is_class_v<R>
  void operator()(const R& r) {
    Fields(*this, r);
  }
};

// ---- Reading into records ------------------------------------------------------------

struct Filler {
  Reader& in;

  void operator()(std::string& s) { s = in.Narrow(); }
  void operator()(std::wstring& s) { s = in.Wide(); }
  void operator()(double& d) { d = in.Double(); }
  void operator()(bool& b) { b = (in.Byte() & 1) != 0; }
  template <class T>
    requires std::is_integral_v<T>
  void operator()(T& v) {
    v = static_cast<T>(in.Signed());
  }
  template <class Row>
  void operator()(std::vector<Row>& rows) {
    rows.clear();
    const std::size_t n = in.Count();
    rows.reserve(n);
    for (std::size_t i = 0; i < n && !in.AtEnd(); ++i) {
      rows.emplace_back();
      (*this)(rows.back());
    }
  }
  template <class R>
    requires std::is_class_v<R>
  void operator()(R& r) {
    Fields(*this, r);
  }
};

// A pointer word: the presence byte, then the record.
template <class T>
void Put(Writer& w, LPARAM data) {
  if (!data) {
    w.Byte(0);
    return;
  }
  w.Byte(1);
  w(*FromLParam<const T>(data));
}

}  // namespace

Shape ShapeOf(UINT message) {
  switch (message) {
    case hm::LinkData: return Shape::Link;
    case hm::FieldValue:
    case hm::RequestField:
    case hm::InstrumentFieldUpdate: return Shape::Field;
    case hm::InstrumentList: return Shape::Instruments;
    case hm::ExchangeList: return Shape::Exchanges;
    case hm::RemarkMessages: return Shape::Remarks;
    case hm::ProductList: return Shape::Products;
    case hm::AlertBoardRequest: return Shape::PriceInfo;
    case hm::TextByKey:
    case hm::MessageText:
    case hm::LinkedInstrument: return Shape::WideText;
    case hm::SystemParameter:
    case hm::NoticeParameter: return Shape::NarrowText;
    case hm::WatchlistGroups520:
    case hm::WatchlistGroups521: return Shape::Top30;
    case hm::WatchlistRows522: return Shape::Keldo;
    case hm::FindByChartCode:
    case hm::FindByCode: return Shape::Instrument;
    case hm::MarketInfo: return Shape::MarketInfo;
    case hm::WatchlistList: return Shape::UserRows;
    case hm::SaveWatchlistNames: return Shape::IdRows;
    case hm::Alert701: return Shape::Alerts;
    case hm::Alert702:
    case hm::Alert703:
    case hm::Alert705: return Shape::Alert;
    case hm::Alert704: return Shape::AlertIds;
    case hm::PriceBands: return Shape::Bands;
    case hm::Sectors: return Shape::Sectors;
    default: return Shape::Word;
  }
}

void Encode(UINT message, LPARAM data, std::string& out) {
  Writer w{out};
  w.Unsigned(message);
  switch (ShapeOf(message)) {
    case Shape::Word: w.Signed(data); return;
    case Shape::Link: {
      if (!data) return w.Byte(0);
      w.Byte(1);
      const auto& link = *FromLParam<const ViewLink>(data);
      w(link.className), w(link.flag), w(link.reserved);
      w(link.link != nullptr);
      if (link.link) w(*link.link);
      return;
    }
    case Shape::Field: return Put<FieldUpdate>(w, data);
    case Shape::Instruments: {
      if (!data) return w.Byte(0);
      w.Byte(1);
      const auto& msg = *FromLParam<const JInstrumentListMsg>(data);
      w(static_cast<std::int64_t>(msg.count)), w(static_cast<std::int64_t>(msg.reserved));
      w(msg.instruments != nullptr);
      if (msg.instruments) w(*msg.instruments);
      return;
    }
    case Shape::Exchanges: {
      if (!data) return w.Byte(0);
      w.Byte(1);
      const auto& msg = *FromLParam<const JExchangeListMsg>(data);
      w(static_cast<std::int64_t>(msg.count)), w(static_cast<std::int64_t>(msg.reserved));
      w(msg.exchanges != nullptr);
      if (msg.exchanges) w(*msg.exchanges);
      return;
    }
    case Shape::Products: {
      if (!data) return w.Byte(0);
      w.Byte(1);
      const auto& msg = *FromLParam<const JProductListMsg>(data);
      w(static_cast<std::int64_t>(msg.count));
      w(msg.products != nullptr);
      if (msg.products) w(*msg.products);
      return;
    }
    case Shape::Bands: {
      if (!data) return w.Byte(0);
      w.Byte(1);
      const auto& msg = *FromLParam<const JTickBandList>(data);
      w(msg.count);
      w(msg.bands != nullptr);
      if (msg.bands) w(*msg.bands);
      return;
    }
    case Shape::Remarks: return Put<std::vector<JRemarkMessage>>(w, data);
    case Shape::PriceInfo: return Put<JPriceInformation>(w, data);
    case Shape::WideText: return Put<std::wstring>(w, data);
    case Shape::NarrowText: return Put<std::string>(w, data);
    case Shape::Top30: return Put<std::vector<JTop30Group>>(w, data);
    case Shape::Keldo: return Put<std::vector<JKeldoWatchlistRow>>(w, data);
    case Shape::Instrument: return Put<JInstrumentUnderlying>(w, data);
    case Shape::MarketInfo: return Put<std::vector<JMarketInfo>>(w, data);
    case Shape::UserRows: return Put<std::vector<JWatchlistRow>>(w, data);
    case Shape::IdRows: return Put<std::vector<JWatchlistIdRow>>(w, data);
    case Shape::Alerts: return Put<std::vector<PriceAlertItem>>(w, data);
    case Shape::Alert: return Put<PriceAlertItem>(w, data);
    case Shape::AlertIds: return Put<std::vector<std::int32_t>>(w, data);
    case Shape::Sectors: return Put<std::vector<JSector>>(w, data);
  }
}

// ---- Reader ------------------------------------------------------------------------------

std::uint8_t Reader::Byte() {
  if (m_in.empty()) return 0;
  const auto b = static_cast<std::uint8_t>(m_in.front());
  m_in.remove_prefix(1);
  return b;
}

std::uint64_t Reader::Unsigned() {
  std::uint64_t v = 0;
  for (int shift = 0; shift < 64 && !m_in.empty(); shift += 7) {
    const std::uint8_t b = Byte();
    v |= static_cast<std::uint64_t>(b & 0x7f) << shift;
    if (!(b & 0x80)) break;
  }
  return v;
}

std::int64_t Reader::Signed() {
  const std::uint64_t u = Unsigned();
  return static_cast<std::int64_t>((u >> 1) ^ (~(u & 1) + 1));
}

double Reader::Double() {
  double d = 0.0;
  if (m_in.size() < sizeof d) {
    m_in = {};
    return d;
  }
  std::memcpy(&d, m_in.data(), sizeof d);
  m_in.remove_prefix(sizeof d);
  return d;
}

std::string Reader::Narrow() {
  const std::uint64_t length = Unsigned();  // read before the bytes left are counted
  const std::size_t n = static_cast<std::size_t>(std::min<std::uint64_t>(length, m_in.size()));
  std::string s(m_in.substr(0, n));
  m_in.remove_prefix(n);
  return s;
}

std::wstring Reader::Wide() {
  const std::size_t n = Count();
  std::wstring s;
  s.reserve(n);
  for (std::size_t i = 0; i < n && !m_in.empty(); ++i) s.push_back(static_cast<wchar_t>(static_cast<std::uint32_t>(Unsigned())));
  return s;
}

std::size_t Reader::Count() {
  const std::uint64_t count = Unsigned();
  return static_cast<std::size_t>(std::min<std::uint64_t>(count, m_in.size()));
}

// ---- Decoding ----------------------------------------------------------------------------

bool Decode(Reader& in, Message& out) {
  if (in.AtEnd()) return false;
  const auto number = static_cast<UINT>(in.Unsigned());
  DecodeAs(number, in, out);
  return true;
}

void DecodeAs(UINT number, Reader& in, Message& out) {
  out.number = number;
  out.word = 0;
  Filler f{in};
  const Shape shape = ShapeOf(number);
  if (shape == Shape::Word) {
    out.word = static_cast<LPARAM>(in.Signed());
    return;
  }
  if (in.Byte() == 0) return;  // a null word
  switch (shape) {
    case Shape::Word: break;
    case Shape::Link: {
      f(out.link.className), f(out.link.flag), f(out.link.reserved);
      bool hasLink = false;
      f(hasLink);
      if (hasLink) f(out.wide);
      out.link.link = hasLink ? &out.wide : nullptr;
      out.word = ToLParam(&out.link);
      break;
    }
    case Shape::Field: f(out.field), out.word = ToLParam(&out.field); break;
    case Shape::Instruments: {
      std::int64_t count = 0, reserved = 0;
      bool has = false;
      f(count), f(reserved), f(has);
      if (has) f(out.instruments);
      out.instrumentMsg = {static_cast<std::intptr_t>(count), static_cast<std::intptr_t>(reserved),
                           has ? &out.instruments : nullptr};
      out.word = ToLParam(&out.instrumentMsg);
      break;
    }
    case Shape::Exchanges: {
      std::int64_t count = 0, reserved = 0;
      bool has = false;
      f(count), f(reserved), f(has);
      if (has) f(out.exchanges);
      out.exchangeMsg = {static_cast<std::intptr_t>(count), static_cast<std::intptr_t>(reserved),
                         has ? &out.exchanges : nullptr};
      out.word = ToLParam(&out.exchangeMsg);
      break;
    }
    case Shape::Products: {
      std::int64_t count = 0;
      bool has = false;
      f(count), f(has);
      if (has) f(out.products);
      out.productMsg = {static_cast<std::intptr_t>(count), has ? &out.products : nullptr};
      out.word = ToLParam(&out.productMsg);
      break;
    }
    case Shape::Bands: {
      bool has = false;
      f(out.bandMsg.count), f(has);
      if (has) f(out.bands);
      out.bandMsg.bands = has ? &out.bands : nullptr;
      out.word = ToLParam(&out.bandMsg);
      break;
    }
    case Shape::Remarks: f(out.remarks), out.word = ToLParam(&out.remarks); break;
    case Shape::PriceInfo: f(out.priceInfo), out.word = ToLParam(&out.priceInfo); break;
    case Shape::WideText: f(out.wide), out.word = ToLParam(&out.wide); break;
    case Shape::NarrowText: f(out.narrow), out.word = ToLParam(&out.narrow); break;
    case Shape::Top30: f(out.top30), out.word = ToLParam(&out.top30); break;
    case Shape::Keldo: f(out.keldo), out.word = ToLParam(&out.keldo); break;
    case Shape::Instrument: f(out.instrument), out.word = ToLParam(&out.instrument); break;
    case Shape::MarketInfo: f(out.markets), out.word = ToLParam(&out.markets); break;
    case Shape::UserRows: f(out.userRows), out.word = ToLParam(&out.userRows); break;
    case Shape::IdRows: f(out.idRows), out.word = ToLParam(&out.idRows); break;
    case Shape::Alerts: f(out.alerts), out.word = ToLParam(&out.alerts); break;
    case Shape::Alert: f(out.alert), out.word = ToLParam(&out.alert); break;
    case Shape::AlertIds: f(out.alertIds), out.word = ToLParam(&out.alertIds); break;
    case Shape::Sectors: f(out.sectors), out.word = ToLParam(&out.sectors); break;
  }
}

}  // namespace hv::trace
