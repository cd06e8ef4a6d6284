#pragma once
// Keys of the reference and market-data stores. Codes arrive from the terminal
// as narrow UTF-8 and are widened once, when the key is built.
#include <compare>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

#include "hostview/Records.h"

// One instrument: product id and instrument code. Orders by product id, then code.
struct InstrumentKey {
  std::int64_t ProductID = 0;
  std::wstring InstrumentCode;

  friend bool operator==(const InstrumentKey&, const InstrumentKey&) = default;
  friend auto operator<=>(const InstrumentKey&, const InstrumentKey&) = default;
};

// One listing by symbol: product id, symbol and exchange code.
struct SymbolKey {
  std::int64_t ProductID = 0;
  std::wstring Symbol;
  std::wstring ExchangeCode;

  friend bool operator==(const SymbolKey&, const SymbolKey&) = default;
  friend auto operator<=>(const SymbolKey&, const SymbolKey&) = default;
};

// One price level (1..99) of an instrument's depth.
struct DepthKey {
  std::int64_t ProductID = 0;
  std::wstring InstrumentCode;
  std::int32_t Level = 0;

  friend bool operator==(const DepthKey&, const DepthKey&) = default;
  friend auto operator<=>(const DepthKey&, const DepthKey&) = default;
};

// One page of an instrument's trade tape.
struct PageKey {
  std::int64_t ProductID = 0;
  std::wstring InstrumentCode;
  std::int32_t Page = 0;

  friend bool operator==(const PageKey&, const PageKey&) = default;
  friend auto operator<=>(const PageKey&, const PageKey&) = default;
};

// One line of an instrument's trade summary.
struct LineKey {
  std::int64_t ProductID = 0;
  std::wstring InstrumentCode;
  std::int32_t Line = 0;

  friend bool operator==(const LineKey&, const LineKey&) = default;
  friend auto operator<=>(const LineKey&, const LineKey&) = default;
};

namespace mvd {
inline std::size_t MixHash(std::size_t h, std::uint64_t v) noexcept {
  // splitmix64 finaliser folded into h
  v += 0x9E3779B97F4A7C15ull + h;
  v = (v ^ (v >> 30)) * 0xBF58476D1CE4E5B9ull;
  v = (v ^ (v >> 27)) * 0x94D049BB133111EBull;
  return static_cast<std::size_t>(v ^ (v >> 31));
}
inline std::size_t HashText(std::wstring_view s) noexcept { return std::hash<std::wstring_view>{}(s); }
}  // namespace mvd

template <>
struct std::hash<InstrumentKey> {
  std::size_t operator()(const InstrumentKey& k) const noexcept {
    return mvd::MixHash(mvd::HashText(k.InstrumentCode), static_cast<std::uint64_t>(k.ProductID));
  }
};
template <>
struct std::hash<SymbolKey> {
  std::size_t operator()(const SymbolKey& k) const noexcept {
    const std::size_t h = mvd::MixHash(mvd::HashText(k.Symbol), static_cast<std::uint64_t>(k.ProductID));
    return mvd::MixHash(h, mvd::HashText(k.ExchangeCode));
  }
};
template <>
struct std::hash<DepthKey> {
  std::size_t operator()(const DepthKey& k) const noexcept {
    const std::size_t h = mvd::MixHash(mvd::HashText(k.InstrumentCode), static_cast<std::uint64_t>(k.ProductID));
    return mvd::MixHash(h, static_cast<std::uint32_t>(k.Level));
  }
};
template <>
struct std::hash<PageKey> {
  std::size_t operator()(const PageKey& k) const noexcept {
    const std::size_t h = mvd::MixHash(mvd::HashText(k.InstrumentCode), static_cast<std::uint64_t>(k.ProductID));
    return mvd::MixHash(h, static_cast<std::uint32_t>(k.Page));
  }
};
template <>
struct std::hash<LineKey> {
  std::size_t operator()(const LineKey& k) const noexcept {
    const std::size_t h = mvd::MixHash(mvd::HashText(k.InstrumentCode), static_cast<std::uint64_t>(k.ProductID));
    return mvd::MixHash(h, static_cast<std::uint32_t>(k.Line));
  }
};

#if defined(__GLIBCXX__)
// Keep hash codes in the hash-table nodes: comparing keys while walking a
// bucket would otherwise read each code's heap text (a cache miss per node).
template <> struct std::__is_fast_hash<std::hash<InstrumentKey>> : std::false_type {};
template <> struct std::__is_fast_hash<std::hash<SymbolKey>> : std::false_type {};
template <> struct std::__is_fast_hash<std::hash<DepthKey>> : std::false_type {};
template <> struct std::__is_fast_hash<std::hash<PageKey>> : std::false_type {};
template <> struct std::__is_fast_hash<std::hash<LineKey>> : std::false_type {};
#endif

// Keys of a terminal instrument record; the narrow strings are widened
// (invalid UTF-8 becomes U+FFFD, the rest of the text is kept).
InstrumentKey InstrumentKeyOf(const JInstrumentUnderlying& ins);
SymbolKey SymbolKeyOf(const JInstrumentUnderlying& ins);

// "<name> [<exchange> : <symbol>]", each part trimmed of surrounding blanks.
std::wstring DisplayName(const JInstrumentUnderlying& ins);

namespace mvd {
// Surrounding blanks (space, tab, CR, LF) removed, then widened.
std::wstring TrimmedWide(std::string_view s);
}  // namespace mvd
