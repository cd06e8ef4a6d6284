#pragma once
// What both alert views share about a price alert: the codes stored in the
// record and their list positions, the language texts, the alert settings the
// terminal answers by key ("MAXPA", "ALEML", "ALSMS", "EXCPA"), the texts
// derived from a record (condition, alert via, validity), the list filter, the
// price steps of the tick bands, and the process-wide alert store.
//
// The terminal keeps and evaluates the alerts; the views only edit and list
// them. UI thread only.
#include <QDate>
#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <vector>

#include "data/ReferenceStores.h"
#include "hostview/AlertRecords.h"
#include "hostview/HostLists.h"

class ILanguage;

namespace alerts {

// ---- Language texts (section 13) ---------------------------------------------
namespace text {
inline constexpr int kFirstCached = 701;  // 701..734 go into the text cache
inline constexpr int kLastCached = 734;
inline constexpr int kHeadExchange = 701;  // 701..710: list headings in column order
inline constexpr int kNew = 711;
inline constexpr int kModify = 712;
inline constexpr int kDelete = 713;
inline constexpr int kFirstCaption = 714;  // 714..721: the form's captions in drawing order
inline constexpr int kLastCaption = 721;
inline constexpr int kEmail = 723;
inline constexpr int kSms = 724;
inline constexpr int kTitleNew = 725;
inline constexpr int kTitleModify = 726;
inline constexpr int kSubmit = 727;
inline constexpr int kFieldAsk = 728;  // 728..730 in field list order
inline constexpr int kComparatorLess = 731;  // 731, 732 in comparator list order
inline constexpr int kYes = 733;  // 733, 734 in trigger-once list order
inline constexpr int kNo = 734;
inline constexpr int kTriggered = 735;  // asked from the language service when needed
inline constexpr int kExpired = 736;
inline constexpr int kNoInstrument = 19;
inline constexpr int kInstrumentMissing = 20;
inline constexpr int kAlertMissing = 21;
}  // namespace text

// Fallbacks when the terminal has no language service or text.
inline constexpr const wchar_t* kNoInstrumentText = L"Please select instrument!";
inline constexpr const wchar_t* kInstrumentMissingText = L"This instrument code not exist!";
inline constexpr const wchar_t* kAlertMissingText = L"This alert not exist!";
inline constexpr const char* kNoExchangeCode = "17008";

// Loads 701..734 into the process-wide text cache (LanguageTextTable).
void LoadTexts(const ILanguage* language);
// A cached text (701..734); empty when the terminal has none.
std::wstring CachedText(int id);

// ---- Code tables ---------------------------------------------------------------
// Watched field: 0 "ASK", 1 "BID", 2 "LDONE"; any other stored value reads as "LDONE".
int FieldIndex(const std::string& priceField);
const char* FieldCode(int index);
// Comparator: 0 "<=", 1 ">="; any other stored value reads as ">=".
int ComparatorIndex(const std::string& comparator);
const char* ComparatorCode(int index);
// Trigger once: index 0 true, 1 false.
inline int TriggerOnceIndex(bool once) { return once ? 0 : 1; }
inline bool TriggerOnceOf(int index) { return index == 0; }

inline constexpr const char* kActive = "Active";
inline constexpr const char* kTriggered = "Triggered";
inline constexpr const char* kExpired = "Expired";

// ---- Settings ------------------------------------------------------------------
// The terminal's answers to the alert settings, filed under the key asked.
class AlertSettingsCache {
 public:
  static AlertSettingsCache& Instance();
  // The stored text, or an empty text.
  std::wstring Get(const std::string& key) const;
  // A non-empty value replaces the entry; an empty one changes nothing.
  void Set(const std::string& key, const std::wstring& value);
  void Clear() { m_values.clear(); }

 private:
  std::map<std::string, std::wstring> m_values;
};

inline constexpr const char* kMaxValidityKey = "MAXPA";
inline constexpr const char* kEmailKey = "ALEML";
inline constexpr const char* kSmsKey = "ALSMS";
inline constexpr const char* kExchangesKey = "EXCPA";
inline constexpr int kDefaultValidityDays = 15;

// Days of validity offered: "MAXPA" as a whole positive number (blanks
// around it allowed), else 15.
int MaxValidityDays();
// Whether "ALEML" or "ALSMS" offers the channel: the answer is exactly "1".
bool ChannelOffered(const char* key);
// The exchange code occurs in the "EXCPA" answer. An instrument without an
// exchange code is never permitted.
bool ExchangePermitted(const std::string& exchangeCode, const std::wstring& exchangeList);

// "Today" for the validity range: the machine's date; tests put in their own.
QDate Today();
void SetTodayForTests(std::function<QDate()> today);
struct DateRange {
  QDate first;
  QDate last;
};
// Today through today plus MaxValidityDays().
DateRange ValidityRange();

// ---- Texts of a record ---------------------------------------------------------
// "%.<n>f" for 0..10 decimals, else "%.3f".
std::string PriceFormat(int decimals);
std::wstring FormatPrice(double value, int decimals);
// "<field name> <comparator as stored> <threshold>".
std::wstring ConditionText(const PriceAlertItem& alert, int decimals);
// The chosen channels, ", "-separated: the application caption, 723, 724.
std::wstring AlertViaText(const PriceAlertItem& alert, const std::wstring& appCaption);
// `validUntil` ("%Y-%m-%d") as "%d %b %Y" ("05 Jan 2027"); the stored text
// when it does not read as a date.
std::wstring ValidityText(const std::string& validUntil);
QDate ParseDay(const std::string& text);
std::string DayText(const QDate& day);  // "%Y-%m-%d"

// ---- Filter --------------------------------------------------------------------
// Option 0 all, 1 "Triggered", 2 "Active", 3 "Expired"; any other status never shows.
bool PassesFilter(const std::string& status, int option);

// ---- Price steps ---------------------------------------------------------------
// The step from `price` in table `tableId` (table 0 when that table has no
// matching band), 0 when no band matches. Up: lower <= price < upper; down:
// lower < price <= upper (equality within 1e-6). At a boundary the step up
// comes from the band above, the step down from the band below.
double PriceStep(const std::vector<TickBand>& bands, std::int32_t tableId, double price, bool up);

// ---- The store -----------------------------------------------------------------
using AlertStore = PriceAlertStore<PriceAlertItem>;
AlertStore& Store();

}  // namespace alerts
