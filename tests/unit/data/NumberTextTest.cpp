#include <gtest/gtest.h>

#include <cmath>

#include "data/Keys.h"
#include "data/NumberText.h"
#include "hostview/Text.h"

TEST(ParseNumber_Separators, CommasAreRemovedEverywhere) {
  double v = 0;
  ASSERT_TRUE(mvd::ParseNumber(std::wstring_view(L"1,234,567.25"), v));
  EXPECT_DOUBLE_EQ(v, 1234567.25);
  ASSERT_TRUE(mvd::ParseNumber(std::wstring_view(L" -12,5 "), v));
  EXPECT_DOUBLE_EQ(v, -125);
  ASSERT_TRUE(mvd::ParseNumber(std::string_view("+3.5"), v));
  EXPECT_DOUBLE_EQ(v, 3.5);
  ASSERT_TRUE(mvd::ParseNumber(std::wstring_view(L"1e3"), v));
  EXPECT_DOUBLE_EQ(v, 1000);
}

TEST(ParseNumber_NotFinite, RejectedAndOutputUntouched) {
  for (const wchar_t* bad : {L"nan", L"NaN", L"inf", L"-infinity", L"1e999", L"-1e999", L"abc", L"12abc", L"", L",",
                             L"  ", L"1.2.3", L"+-1", L"0x10", L"12\u00e9"}) {
    double v = 42;
    EXPECT_FALSE(mvd::ParseNumber(std::wstring_view(bad), v)) << hv::Narrow(bad);
    EXPECT_EQ(v, 42);
  }
}

TEST(IsNonFiniteText_Kinds, OnlyNumbersThatAreNotFinite) {
  for (const wchar_t* t : {L"nan", L"NaN", L"-nan", L" inf ", L"-inf", L"+Infinity", L"1e999", L"-1,0e400"})
    EXPECT_TRUE(mvd::IsNonFiniteText(t)) << t;
  // Prices as received that are no number, tiny numbers and plain numbers stay.
  for (const wchar_t* t : {L"", L"-", L"MKT", L"1.5", L"-1", L"1e-400", L"info", L"nano", L"\xfffe"})
    EXPECT_FALSE(mvd::IsNonFiniteText(t)) << t;
}

TEST(FormatFixed_Printf, MatchesPrintfOutput) {
  const double values[] = {0, 1, -1, 0.0005, 0.0015, 2.5, 3.5, 1234567.891, -0.0004, 1e15 + 0.5, 12.3456789};
  for (int dec : {0, 2, 3, 4, 10}) {
    for (double v : values) {
      char buf[128];
      std::snprintf(buf, sizeof buf, "%.*f", dec, v);
      EXPECT_EQ(hv::Narrow(mvd::FixedText(v, dec)), buf) << v << " with " << dec;
    }
  }
  EXPECT_EQ(mvd::NumberFormat(3), L"%.3f");
  EXPECT_EQ(mvd::RecordDecimals(12), 3);
  EXPECT_EQ(mvd::RecordDecimals(-1), 3);
  EXPECT_EQ(mvd::RecordDecimals(0), 0);
  EXPECT_EQ(mvd::RecordDecimals(10), 10);
}

TEST(DisplayName_Instrument, TrimsEachPart) {
  JInstrumentUnderlying ins;
  ins.instrumentName = "  Acme Holdings ";
  ins.exchangeCode = " XSES";
  ins.symbol = "ACM  ";
  EXPECT_EQ(DisplayName(ins), L"Acme Holdings [XSES : ACM]");
}

TEST(InstrumentKeyOf_InvalidUtf8, WidensWithoutLosingTheRest) {
  JInstrumentUnderlying ins;
  ins.productId = 5;
  ins.instrumentCode = std::string("AB\xff\xfe" "CD\xc3", 7);
  const InstrumentKey k = InstrumentKeyOf(ins);
  EXPECT_EQ(k.ProductID, 5);
  EXPECT_EQ(k.InstrumentCode, L"AB\uFFFD\uFFFDCD\uFFFD");
  ins.symbol = "S\x80Y";
  ins.exchangeCode = "X";
  ins.instrumentName = "N\xe2\x82";
  EXPECT_EQ(SymbolKeyOf(ins).Symbol, L"S\uFFFDY");
  EXPECT_EQ(DisplayName(ins), L"N\uFFFD\uFFFD [X : S\uFFFDY]");
}

TEST(InstrumentKey_Order, ByProductThenCode) {
  EXPECT_LT((InstrumentKey{1, L"Z"}), (InstrumentKey{2, L"A"}));
  EXPECT_LT((InstrumentKey{2, L"A"}), (InstrumentKey{2, L"B"}));
  EXPECT_EQ((InstrumentKey{2, L"A"}), (InstrumentKey{2, L"A"}));
  EXPECT_NE((SymbolKey{1, L"S", L"X"}), (SymbolKey{1, L"S", L"Y"}));
}
