#include <gtest/gtest.h>

#include <QFile>
#include <QImage>
#include <QTemporaryDir>

#include "RecordingView.h"
#include "terminal/host/Services.h"

TEST(HostServices, LanguageSection13HoldsEveryTextTheViewsRead) {
  term::LanguageTable lang;
  std::vector<int> ids = {7, 8, 9, 10, 11, 12, 19, 20, 21, 22, 29, 30, 31, 36, 401, 402, 403, 404, 407, 408, 409, 410,
                          411, 412, 413, 414, 415, 416, 417, 418, 419, 613, 614, 615, 663, 723, 724, 725, 726, 727,
                          728, 729, 730, 731, 732, 733, 734, 735, 736};
  auto range = [&](int a, int b) { for (int k = a; k <= b; ++k) ids.push_back(k); };
  range(101, 111); range(114, 123); range(125, 128); range(201, 205); range(501, 508); range(601, 611);
  range(651, 655); range(701, 721);
  for (int id : ids) EXPECT_FALSE(lang.GetText(13, id).empty()) << "section 13, entry " << id;
  EXPECT_NE(lang.GetText(13, 416).find(L"%s"), std::wstring::npos) << "formatted with the list name";
  EXPECT_EQ(lang.GetText(13, 99999), L"");
  EXPECT_EQ(lang.GetText(30, 2), L"Medium");
}

TEST(HostServices, StylesDifferAndResolveTheTerminalImagePaths) {
  EnsureApp();
  QTemporaryDir dir;
  term::StyleManager light(dir.path().toStdString(), term::StyleManager::kLight);
  term::StyleManager dark(dir.path().toStdString(), term::StyleManager::kDark);
  for (int id : {24, 101, 106, 107, 109, 204, 3101, 3102, 3103, 3105})
    EXPECT_NE(light.GetColor(id), dark.GetColor(id)) << id;
  EXPECT_NE(light.GetColor(3101), light.GetColor(3102));
  EXPECT_TRUE(light.GetFont(19).bold());
  EXPECT_TRUE(light.GetFont(40).underline());
  for (const wchar_t* p : {L".\\images\\Toolbar\\[styleID]\\InstrumentExplorer.bmp", L".\\images\\QuickBar\\[styleID]\\toList.bmp",
                           L".\\images\\QuickBar\\[styleID]\\tradeboard.bmp", L".\\images\\Bitmaps\\[styleID]\\help.bmp",
                           L"images/QuickBar/[styleID]/CompanyInfo.bmp", L"images/QuickBar/[styleID]/toclose.bmp"}) {
    std::wstring path = p;
    const std::size_t at = path.find(L"[styleID]");
    for (int style : {1, 2, 7}) {
      std::wstring concrete = path;
      concrete.replace(at, 9, std::to_wstring(style));
      const std::wstring file = light.ResolveImagePath(concrete, style);
      ASSERT_FALSE(file.empty()) << hv::Narrow(concrete);
      EXPECT_NE(file.find(L"/" + std::to_wstring(style) + L"/"), std::wstring::npos);
      QImage img(QString::fromStdWString(file));
      EXPECT_FALSE(img.isNull()) << hv::Narrow(file);
    }
  }
  const std::wstring dark1 = dark.ResolveImagePath(L".\\images\\QuickBar\\2\\toList.bmp", 2);
  EXPECT_FALSE(dark1.empty());
  EXPECT_EQ(light.ResolveImagePath(L".\\images\\nothing\\1\\x.bmp", 1), L"");
  EXPECT_EQ(light.ResolveImagePath(L"..\\..\\etc\\passwd", 1), L"");
  EXPECT_FALSE(light.ResolveImagePath(L"images/Products/CFD.bmp", 1).empty());
}

TEST(HostServices, LogFactoryWritesTheViewsLinesToTheRotatingFile) {
  QTemporaryDir dir;
  const std::string file = dir.filePath("log/terminal.log").toStdString();
  {
    term::LogFactory f(file, false);
    ILogger* logger = f.CreateLogger();
    ASSERT_NE(logger, nullptr);
    logger->Log(3, "Info:%s file:%s line:%d", "CMarketDepthAdv::PrepareBasicData", "MarketDepthAdv.cpp", 42);
    logger->Log(5, "broken %s", "thing");
    f.Flush();
  }
  QFile in(QString::fromStdString(file));
  ASSERT_TRUE(in.open(QIODevice::ReadOnly));
  const QString text = QString::fromUtf8(in.readAll());
  EXPECT_TRUE(text.contains("info Info:CMarketDepthAdv::PrepareBasicData file:MarketDepthAdv.cpp line:42")) << text.toStdString();
  EXPECT_TRUE(text.contains("error broken thing"));
}

TEST(HostServices, ViewsGetTheServicesWhenCreatedThroughTheirDescriptor) {
  Harness h;
  static CRuntimeClass rc{"CTradeSummaryAdv", int(sizeof(RecordingView)), 0xFFFF,
                          [] { return static_cast<CSuperBaseView*>(new RecordingView("CTradeSummaryAdv")); }, nullptr};
  StartParamMap params{{"User_field_save_space", L"1"}};
  CSuperBaseView* v = h.runtime->CreateView(&rc, nullptr, 101, "D05", params);
  ASSERT_NE(v, nullptr);
  EXPECT_TRUE(v->IsCreated());
  EXPECT_EQ(v->GetLanguage(), &h.runtime->Language());
  EXPECT_EQ(v->GetStyleManager(), &h.runtime->Styles());
  EXPECT_EQ(v->GetLogFactory(), &h.runtime->LogFactory());
  EXPECT_EQ(v->GetAppTitle(), L"Brantic Terminal");
  EXPECT_EQ(h.runtime->ClassNameOf(v), "CTradeSummaryAdv");
  h.runtime->Activate(v);
  h.runtime->DeliverStartLink(v);
  auto* rv = static_cast<RecordingView*>(v);
  ASSERT_EQ(rv->Of(hm::Activate).size(), 1u);
  const auto links = rv->Of(hm::LinkData);
  ASSERT_EQ(links.size(), 1u);
  EXPECT_NE(links[0]->wtext.find(L"\"Field_instrument_code\":\"D05\""), std::wstring::npos);
  EXPECT_NE(links[0]->wtext.find(L"\"Field_product_id\":\"101\""), std::wstring::npos);
  EXPECT_NE(links[0]->wtext.find(L"\"User_field_save_space\":\"1\""), std::wstring::npos);
  h.runtime->DestroyView(v, true);
  EXPECT_TRUE(h.runtime->Views().empty());
}

// A view that sends its title only from ApplyLanguage must not stay untitled
// until the user reloads the language.
TEST(HostServices, ViewsLoadTheirTextsOnceWhenCreated) {
  struct TitledView : RecordingView {
    TitledView() : RecordingView("CNewPriceAlertAdv") {}
    void ApplyLanguage() override {
      ++applied;
      static const std::wstring title = L"New Price Alert";
      SendChildFeedback(hm::Title, ToLParam(&title));
    }
    int applied = 0;
  };
  Harness h;
  static CRuntimeClass rc{"CNewPriceAlertAdv", int(sizeof(TitledView)), 0xFFFF,
                          [] { return static_cast<CSuperBaseView*>(new TitledView); }, nullptr};
  auto* v = static_cast<TitledView*>(h.runtime->CreateView(&rc, nullptr, -1, "", {}));
  ASSERT_NE(v, nullptr);
  EXPECT_EQ(v->applied, 1);
  h.runtime->DestroyView(v, true);
}
