#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>

#include "hostview/NumberText.h"

TEST(Integer2Str, GroupsThousandsWithCommas) {
  EXPECT_EQ(Integer2Str(0), "0");
  EXPECT_EQ(Integer2Str(999), "999");
  EXPECT_EQ(Integer2Str(1000), "1,000");
  EXPECT_EQ(Integer2Str(100000), "100,000");
  EXPECT_EQ(Integer2Str(1234567), "1,234,567");
  EXPECT_EQ(Integer2Str(std::numeric_limits<std::int64_t>::max()), "9,223,372,036,854,775,807");
}

TEST(Integer2Str, NegativesKeepSignBeforeFirstGroup) {
  EXPECT_EQ(Integer2Str(-1), "-1");
  EXPECT_EQ(Integer2Str(-999), "-999");
  EXPECT_EQ(Integer2Str(-1000), "-1,000");
  EXPECT_EQ(Integer2Str(-123456), "-123,456");
  EXPECT_EQ(Integer2Str(std::numeric_limits<std::int64_t>::min()), "-9,223,372,036,854,775,808");
}

TEST(Double2Str, RoundsHalfAwayFromZeroAsWritten) {
  // Binary forms of these lie just below the half; traders read them as written.
  EXPECT_EQ(Double2Str(2.675, 2), "2.68");
  EXPECT_EQ(Double2Str(1.005, 2), "1.01");
  EXPECT_EQ(Double2Str(-2.675, 2), "-2.68");
  EXPECT_EQ(Double2Str(0.125, 2), "0.13");
  EXPECT_EQ(Double2Str(0.5, 0), "1");
  EXPECT_EQ(Double2Str(-0.5, 0), "-1");
  EXPECT_EQ(Double2Str(0.124999, 2), "0.12");
}

TEST(Double2Str, CarriesIntoIntegerPartAndGroups) {
  EXPECT_EQ(Double2Str(9.995, 2), "10.00");
  EXPECT_EQ(Double2Str(999999.995, 2), "1,000,000.00");
  EXPECT_EQ(Double2Str(1234.5, 2), "1,234.50");
  EXPECT_EQ(Double2Str(-1234567.25, 1), "-1,234,567.3");
  EXPECT_EQ(Double2Str(1e20, 0), "100,000,000,000,000,000,000");
}

TEST(Double2Str, ZeroHasNoSignAndOddInputsAreSafe) {
  EXPECT_EQ(Double2Str(-0.0, 2), "0.00");
  EXPECT_EQ(Double2Str(-0.001, 2), "0.00");
  EXPECT_EQ(Double2Str(1e-7, 3), "0.000");
  EXPECT_EQ(Double2Str(1.5, -3), "2");                 // negative decimals count as 0
  EXPECT_EQ(Double2Str(1.0, 40), "1.000000000000000");  // at most 15 decimals
  EXPECT_EQ(Double2Str(std::nan(""), 2), "");
  EXPECT_EQ(Double2Str(std::numeric_limits<double>::infinity(), 2), "");
}

TEST(GenerateQtyList, OffersOneToFivePerDecadeOfLots) {
  EXPECT_EQ(GenerateQtyList(100, 7), (std::vector<int>{100, 200, 300, 400, 500, 1000, 2000}));
  EXPECT_EQ(GenerateQtyList(1, 3), (std::vector<int>{1, 2, 3}));
  EXPECT_TRUE(GenerateQtyList(0, 5).empty());
  EXPECT_TRUE(GenerateQtyList(-100, 5).empty());
  EXPECT_TRUE(GenerateQtyList(100, 0).empty());
  // Stops before overflowing rather than wrapping to negative quantities.
  EXPECT_EQ(GenerateQtyList(1000000000, 5), (std::vector<int>{1000000000, 2000000000}));
}
