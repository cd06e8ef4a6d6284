#pragma once
// Records exchanged over the numbered message channel between the terminal and
// the add-on. Plain data, no Qt: the add-on's data layer includes this header.
//
// Ownership: a record passed with a request is built by the sender for the call
// and owned by it; the receiver copies what it keeps. Lists delivered with 500
// stay owned by the terminal, unchanged, until it delivers the next 500.
#include <cstdint>
#include <string>
#include <vector>

// One field subscription request (messages 400, 401, 412 view -> host).
struct FieldRequest {
  std::int64_t productId = 0;
  std::string instrumentCode;
  std::string fieldName;  // a field, "PMP_Submit", or for 400 a ","-joined list
  std::int32_t param = 0;  // 0 quotes; depth level count; T&S page or 99999; summary page
  std::int32_t kind = 0;   // 0 quote/depth, 1 depth (batch 3), 2 time and sales, 3 trade summary
};

// One field value (messages 410 and 412 host -> view).
struct FieldUpdate {
  std::int64_t productId = 0;
  std::string instrumentCode;
  std::string fieldName;
  std::string value;
  std::int32_t param = 0;  // 0 for quotes; price level 1..99 for depth
  std::int32_t kind = 0;   // 1 for depth
};

// Opens another view and hands it a JSON link text (messages 200 and 310).
struct ViewLink {
  std::wstring className;
  std::int32_t flag = 1;
  std::int32_t reserved = 0;
  const std::wstring* link = nullptr;  // wide JSON link text, or none
};

// One instrument. The add-on reads the named members and carries the rest.
struct JInstrumentUnderlying {
  std::string exchangeCode;
  std::string instrumentCode;
  std::int64_t productId = 0;
  std::string instrumentName;
  std::string symbol;
  std::int32_t decimals = 2;
  // Written to saved watchlists for codes without "[KELDO]"; also the code
  // shown to users (the "display code").
  std::string displayCode;
  std::int32_t accessStatus = 3;     // primary: 0/2 not viewable, 1 view only, 3 view and trade
  std::int32_t altAccessStatus = 3;  // used when the terminal says the alternate status applies
  std::int64_t lotSize = 1;
  std::int64_t maxQty1 = 0;  // maximum quantity in the first trading mode (0: no limit)
  std::int64_t maxQty2 = 0;  // maximum quantity in the second trading mode (0: no limit)
  std::string sector;
  std::int32_t priceStepTableId = 0;
  double referencePrice = 0.0;
  std::string chartCode;
  std::string currency;
  std::string isin;
  std::string productType;  // "ES", "CS", "CFD", "FUT", "FX", "DMA" (copy of the product's type)
};

// One product, keyed by its id.
struct JProduct {
  std::int64_t productId = 0;
  std::string productType;  // "ES", "CS", "CFD", "FUT", "FX", "DMA"
  std::string productName;
  // The product's picture as a terminal image path (".\images\Products\ES.bmp");
  // resolve it with IStyleManager::ResolveImagePath. Empty: no picture.
  std::string pictureFile;
};

// One exchange, keyed by its code.
struct JExchangeList {
  std::string exchangeCode;
  std::string marketName;  // written to saved watchlists
  std::string exchangeName;
  std::int64_t productId = 0;
};

// Data of notification 505: the product list at the second word.
struct JProductListMsg {
  std::intptr_t count = 0;
  const std::vector<JProduct>* products = nullptr;
};

// Data of notification 503: the exchange list at the third word.
struct JExchangeListMsg {
  std::intptr_t count = 0;
  std::intptr_t reserved = 0;
  const std::vector<JExchangeList>* exchanges = nullptr;
};

// Data of notification 500: the terminal's instrument list at the third word.
// The terminal keeps the list alive and unchanged until the next 500.
struct JInstrumentListMsg {
  std::intptr_t count = 0;
  std::intptr_t reserved = 0;
  const std::vector<JInstrumentUnderlying>* instruments = nullptr;
};

// Request 102: a view's preferred size.
struct ViewSize {
  std::int32_t width = 0;
  std::int32_t height = 0;
};
