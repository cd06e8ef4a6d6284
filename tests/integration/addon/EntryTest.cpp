#include <gtest/gtest.h>

#include <cstring>

#include "mvtest/ScriptedHost.h"

namespace {

const char* const kViews[] = {"CPriceViewAdv",   "CMarketDepthAdv", "CTimeAndSalesAdv",
                              "CTradeSummaryAdv", "CPriceAlertList", "CNewPriceAlertAdv"};

TEST(GetBaseViewPointer_Lookup, FindsTheSixClassesByExactName) {
  auto& library = mvtest::AddonLibrary::Get();
  ASSERT_TRUE(library.Loaded()) << library.Path() << ": " << library.Error();
  for (const char* name : kViews) {
    const CRuntimeClass* descriptor = library.Find(name);
    ASSERT_NE(descriptor, nullptr) << name;
    EXPECT_STREQ(descriptor->m_lpszClassName, name);
    EXPECT_EQ(descriptor->m_wSchema, 0xFFFFu);
    ASSERT_NE(descriptor->m_pBaseClass, nullptr);
    EXPECT_STREQ(descriptor->m_pBaseClass->m_lpszClassName, "CSuperBaseView");
    EXPECT_GT(descriptor->m_nObjectSize, 0);
    EXPECT_EQ(library.Find(name), descriptor);  // one static descriptor per class
  }
}

TEST(GetBaseViewPointer_Lookup, RefusesOtherCaseEmptyNullAndUnknownNames) {
  auto& library = mvtest::AddonLibrary::Get();
  ASSERT_TRUE(library.Loaded()) << library.Error();
  for (const char* name : {"cpriceviewadv", "CPRICEVIEWADV", "CMarketDepthADV", "", " CPriceViewAdv",
                           "CPriceViewAdv ", "CSuperBaseView", "CTradeView", "CPriceViewAdvX"})
    EXPECT_EQ(library.Find(name), nullptr) << "'" << name << "'";
  EXPECT_EQ(library.Find(nullptr), nullptr);
}

TEST(ViewDescriptor_Create, TwoObjectsFromOneDescriptorAreIndependent) {
  mvtest::ScriptedHost host;
  CSuperBaseView* a = host.Create("CMarketDepthAdv");
  CSuperBaseView* b = host.Create("CMarketDepthAdv");
  ASSERT_NE(a, nullptr);
  ASSERT_NE(b, nullptr);
  EXPECT_NE(a, b);
  EXPECT_EQ(a->GetRuntimeClass(), b->GetRuntimeClass());
  EXPECT_STREQ(a->GetRuntimeClass()->m_lpszClassName, "CMarketDepthAdv");

  // State set on one does not show on the other.
  host.Send(a, hm::LinkModeFlag, 1);
  a->SetAppTitle(L"A");
  EXPECT_EQ(a->GetAppTitle(), L"A");
  EXPECT_EQ(b->GetAppTitle(), host.appTitle);
  host.Send(a, hm::Activate);
  host.Send(b, hm::Activate);
  ASSERT_EQ(host.RequestsOf(hm::ViewSizeRequest).size(), 2u);
  EXPECT_EQ(host.RequestsOf(hm::ViewSizeRequest)[0].view, a);
  EXPECT_EQ(host.RequestsOf(hm::ViewSizeRequest)[1].view, b);
  host.Destroy(a);
  host.Send(b, hm::Deactivate);  // the other keeps working after one is gone
}

TEST(ViewDescriptor_Create, EveryViewTakesServicesStartParametersAndCreatesItsWindow) {
  mvtest::ScriptedHost host;
  for (const char* name : kViews) {
    CSuperBaseView* view = host.Create(name, 12, "0005", {{"User_field_save_space", L"1"}});
    ASSERT_NE(view, nullptr) << name;
    EXPECT_TRUE(view->IsCreated());
    EXPECT_EQ(view->GetStartProductId(), 12);
    EXPECT_EQ(view->GetStartInstrumentCode(), "0005");
    EXPECT_EQ(view->GetStartParams().at("User_field_save_space"), L"1");
    EXPECT_EQ(view->GetLanguage(), &host.language);
    EXPECT_EQ(view->GetLogFactory(), &host.logs);
    EXPECT_EQ(view->GetStyleManager(), &host.style);
    EXPECT_EQ(view->GetAppTitle(), host.appTitle);
  }
  EXPECT_TRUE(host.Requests().empty());  // nothing is asked before activation
}

}  // namespace
