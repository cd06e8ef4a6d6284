#include "data/ReferenceStores.h"

// Each store registers its reset for tests when it is made (data/ProcessState.h).

ProductStore& ProductMgr() {
  static ProductStore s;
  static const bool hook = mvd::OnResetForTests([] { s.ResetForTests(); });
  (void)hook;
  return s;
}

ExchangeStore& ExchangeMgr() {
  static ExchangeStore s;
  static const bool hook = mvd::OnResetForTests([] { s.ResetForTests(); });
  (void)hook;
  return s;
}

InstrumentStore_ReadOnly& InstrumentMgr_ReadOnly() {
  static InstrumentStore_ReadOnly s;
  static const bool hook = mvd::OnResetForTests([] { s.ResetForTests(); });
  (void)hook;
  return s;
}

SymbolStore_ReadOnly& SymbolMgr_ReadOnly() {
  static SymbolStore_ReadOnly s;
  static std::int32_t builtFrom = 0;  // version of InstrumentMgr_ReadOnly indexed
  static const bool hook = mvd::OnResetForTests([] {
    s.ResetForTests();
    builtFrom = 0;
  });
  (void)hook;
  auto& ins = InstrumentMgr_ReadOnly();
  if (ins.IsLoaded() && ins.Version() != builtFrom) {
    s.Fill(ins.Source());
    builtFrom = ins.Version();
  }
  return s;
}

InstrumentStore& InstrumentMgr() {
  static InstrumentStore s;
  static const bool hook = mvd::OnResetForTests([] { s.ResetForTests(); });
  (void)hook;
  return s;
}

int InstrumentDecimals(const InstrumentKey& key) {
  if (const auto* r = InstrumentMgr_ReadOnly().FindPtr(key)) return r->decimals;
  if (const auto* r = InstrumentMgr().FindPtr(key)) return r->decimals;
  return -1;
}
