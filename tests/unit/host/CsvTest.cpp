#include <gtest/gtest.h>

#include "hostview/Csv.h"

TEST(Csv, ParsesRowsWithEveryLineEnding) {
  Csv csv;
  ASSERT_TRUE(csv.Parse("a,b,c\r\n1,2,3\n4,5,6\rx,y,z\n"));
  ASSERT_EQ(csv.GetRowCount(), 4u);
  EXPECT_EQ(csv.GetValue(0, 2), "c");
  EXPECT_EQ(csv.GetValue(2, 0), "4");
  EXPECT_EQ(csv.GetValue(3, 1), "y");
  EXPECT_TRUE(csv.GetErrorInfo().empty());
}

TEST(Csv, QuotedCellsHoldSeparatorsQuotesAndLineBreaks) {
  Csv csv;
  ASSERT_TRUE(csv.Parse("\"Smith, J\",\"say \"\"hi\"\"\",\"line1\r\nline2\",plain\n"));
  ASSERT_EQ(csv.GetRowCount(), 1u);
  ASSERT_EQ(csv.GetGridData()[0].size(), 4u);
  EXPECT_EQ(csv.GetValue(0, 0), "Smith, J");
  EXPECT_EQ(csv.GetValue(0, 1), "say \"hi\"");
  EXPECT_EQ(csv.GetValue(0, 2), "line1\r\nline2");
  EXPECT_EQ(csv.GetValue(0, 3), "plain");
}

TEST(Csv, EmptyCellsBlankLinesAndLiteralQuotes) {
  Csv csv;
  ASSERT_TRUE(csv.Parse("\xEF\xBB\xBF" "a,,c,\n\n\"\"\nx\"y,z"));
  ASSERT_EQ(csv.GetRowCount(), 3u);
  EXPECT_EQ(csv.GetGridData()[0], (Csv::Row{"a", "", "c", ""}));  // BOM dropped, trailing empty cell kept
  EXPECT_EQ(csv.GetGridData()[1], (Csv::Row{""}));                // "" is one empty cell; the blank line is no row
  EXPECT_EQ(csv.GetGridData()[2], (Csv::Row{"x\"y", "z"}));        // a quote inside a cell is data
}

TEST(Csv, MalformedTextIsReportedAndKeepsEarlierRows) {
  Csv csv;
  EXPECT_FALSE(csv.Parse("a,b\nc,\"open\nd,e\n"));
  EXPECT_NE(csv.GetErrorInfo().find("line 2"), std::string::npos) << csv.GetErrorInfo();
  ASSERT_EQ(csv.GetRowCount(), 1u);
  EXPECT_EQ(csv.GetValue(0, 1), "b");

  EXPECT_FALSE(csv.Parse("\"ab\"cd,e"));
  EXPECT_FALSE(csv.GetErrorInfo().empty());

  // A good parse clears the old error.
  EXPECT_TRUE(csv.Parse("ok"));
  EXPECT_TRUE(csv.GetErrorInfo().empty());
}

TEST(Csv, OutOfRangeValuesAreEmpty) {
  Csv csv;
  ASSERT_TRUE(csv.Parse("a,b\nc"));
  std::string v = "unchanged";
  EXPECT_FALSE(csv.GetValue(1, 1, v));
  EXPECT_EQ(v, "unchanged");
  EXPECT_EQ(csv.GetValue(5, 0), "");
  EXPECT_TRUE(csv.GetValue(1, 0, v));
  EXPECT_EQ(v, "c");
}

TEST(Csv, OtherSeparatorsAndRefusedOnes) {
  Csv csv;
  ASSERT_TRUE(csv.SetSeparateChar(';'));
  ASSERT_TRUE(csv.Parse("1,5;\"a;b\";c"));
  EXPECT_EQ(csv.GetGridData()[0], (Csv::Row{"1,5", "a;b", "c"}));
  EXPECT_FALSE(csv.SetSeparateChar('"'));
  EXPECT_FALSE(csv.SetSeparateChar('\n'));
  EXPECT_EQ(csv.GetSeparateChar(), ';');
  ASSERT_TRUE(csv.SetSeparateChar('\t'));
  ASSERT_TRUE(csv.Parse("a b\tc"));
  EXPECT_EQ(csv.GetGridData()[0], (Csv::Row{"a b", "c"}));
}

TEST(Csv, BuildsRowsWithQuotingWhereNeeded) {
  Csv csv;
  csv.AddData("plain");
  csv.AddData("with,comma");
  csv.AddData("say \"hi\"");
  csv.AddData(" padded ");
  csv.AddData("");
  EXPECT_EQ(csv.GenerateRow(), "plain,\"with,comma\",\"say \"\"hi\"\"\",\" padded \",");
  // Generating does not clear; ClearRow does.
  EXPECT_EQ(csv.GetPendingRow().size(), 5u);
  csv.ClearRow();
  EXPECT_EQ(csv.GenerateRow(), "");
  csv.AddData("x");
  csv.ClearData();
  EXPECT_TRUE(csv.GetPendingRow().empty());
}

TEST(Csv, GeneratedTextParsesBackToTheSameGrid) {
  const Csv::Grid grid{
      {"code", "name", "price"},
      {"D05.SI", "DBS \"Group\", Holdings", "1,234.50"},
      {"", "multi\nline\r\ntext", " lead"},
      {""},
      {"\xE4\xB8\xAD\xE6\x96\x87", "tab\there", "trail "},
  };
  for (char sep : {',', ';', '\t', '|'}) {
    Csv csv;
    ASSERT_TRUE(csv.SetSeparateChar(sep));
    const std::string text = csv.GenerateText(grid);
    ASSERT_TRUE(csv.Parse(text)) << csv.GetErrorInfo();
    EXPECT_EQ(csv.GetGridData(), grid) << "separator " << int(sep);
  }
}
