#include "data/ReferenceStores.h"

ProductStore& ProductMgr() {
  static ProductStore s;
  return s;
}

ExchangeStore& ExchangeMgr() {
  static ExchangeStore s;
  return s;
}

InstrumentStore_ReadOnly& InstrumentMgr_ReadOnly() {
  static InstrumentStore_ReadOnly s;
  return s;
}

SymbolStore_ReadOnly& SymbolMgr_ReadOnly() {
  static SymbolStore_ReadOnly s;
  static std::int32_t builtFrom = 0;  // version of InstrumentMgr_ReadOnly indexed
  auto& ins = InstrumentMgr_ReadOnly();
  if (ins.IsLoaded() && ins.Version() != builtFrom) {
    s.Fill(ins.Source());
    builtFrom = ins.Version();
  }
  return s;
}

InstrumentStore& InstrumentMgr() {
  static InstrumentStore s;
  return s;
}

int InstrumentDecimals(const InstrumentKey& key) {
  if (const auto* r = InstrumentMgr_ReadOnly().FindPtr(key)) return r->decimals;
  if (const auto* r = InstrumentMgr().FindPtr(key)) return r->decimals;
  return -1;
}
