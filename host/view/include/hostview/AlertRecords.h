#pragma once
// The price alert record exchanged between the terminal and the views.
// The field order and types are part of the channel: 701 delivers a
// `const std::vector<PriceAlertItem>*` (the complete list, valid for the call),
// 702/703/705 carry `const PriceAlertItem*`, 704 a `const std::vector<std::int32_t>*`
// of alert ids. Plain data, no Qt.
#include <cstdint>
#include <string>

struct PriceAlertItem {
  std::int32_t alertId = -1;      // assigned by the terminal; -1: not created yet
  std::int64_t productId = -1;    // -1: no instrument chosen
  std::string exchangeCode;
  std::string instrumentCode;
  bool triggerOnce = true;        // false: fires again each time the condition turns true
  std::string validUntil;         // last day of validity, "%Y-%m-%d"
  std::string priceField;         // "ASK", "BID" or "LDONE" (anything else reads as "LDONE")
  std::string comparator;         // "<=" or ">=" (anything else reads as ">=")
  double triggerValue = 0.0;
  bool viaApp = true;
  bool viaEmail = false;
  bool viaSms = false;
  std::string status;             // "Active", "Triggered", "Expired"; set by the terminal
  std::string hostTextA;          // terminal's: time of the last trigger ("YYYY-MM-DD HH:MM:SS")
  std::string hostTextB;          // terminal's: value that triggered it
  double hostNumber = 0.0;        // terminal's: number of times it triggered
  bool ticked = false;            // the alert list's tick mark; meaningless to the terminal
};
