#pragma once
// The advance filter of the price view (the fifth family): a list of the
// moment built from the terminal's instrument list by four cascading
// drop-down lists, each showing its caption until a choice is made:
//   2028 "Product"   every product of the product store, in store order, by name
//   2029 "Exchange"  the exchanges that list instruments of the chosen product
//                    (in the exchange store's order, others after them)
//   2030 "Sector"    "ALL" (value "***"), then the sectors of the terminal (2800)
//   2031 "A-Z"       "A" ... "Z", "Others", "ALL"
// A product refills the exchanges (and empties sector and letter); an
// exchange refills sector and letter; a sector or a letter runs the filter
// when all four are chosen. The result goes to `onResult`.
//
// The filter walks the instrument list in its order and takes an instrument
// when its product id and exchange code are the chosen ones, its sector text
// contains the chosen sector value (or the value is "***"), and its code
// starts with the chosen letter ("ALL": any; "Others": a first character
// before "A" or after "Z"); it stops at the limit: "ADVFT" when that is a
// whole number from 1 to 10000, else "MAXWL" (500 when missing).
// UI thread only.
#include <QWidget>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "data/Keys.h"
#include "hostview/HostLists.h"
#include "hostview/Records.h"

class CSkinComboBox;
class IStyleManager;

class CAdvanceFilter : public QWidget {
  Q_OBJECT
 public:
  enum ControlId : int { kProductListId = 2028, kExchangeListId = 2029, kSectorListId = 2030, kLetterListId = 2031 };
  static constexpr const wchar_t* kProductCaption = L"Product";
  static constexpr const wchar_t* kExchangeCaption = L"Exchange";
  static constexpr const wchar_t* kSectorCaption = L"Sector";
  static constexpr const wchar_t* kLetterCaption = L"A-Z";
  static constexpr const char* kAllSectorsValue = "***";
  static constexpr const wchar_t* kAllItem = L"ALL";
  static constexpr const wchar_t* kOthersItem = L"Others";
  static constexpr int kMaxAdvftLimit = 10000;

  // The four choices.
  struct Choice {
    std::int64_t productId = 0;
    std::string exchangeCode;
    std::string sector;   // a sector code, or "***"
    std::wstring letter;  // "A".."Z", "Others" or "ALL"
    bool operator==(const Choice&) const = default;
  };

  explicit CAdvanceFilter(QWidget* parent = nullptr);
  ~CAdvanceFilter() override;

  void SetStyleManager(const IStyleManager* style);
  // The drop-down list of a control id (2028 to 2031); null for another id.
  CSkinComboBox* List(int id) const;
  // Height of the bar the lists sit in.
  static int BarHeight();

  // The family button: the products again with none chosen; the other lists empty.
  void Reset();
  // The sectors of the terminal (2800). Kept; an open sector list is refilled
  // with its choice kept when it is still offered.
  void SetSectors(const std::vector<JSector>& sectors);
  bool HasSectors() const { return m_haveSectors; }

  // Choosing item `index` of a list, as the user does (the cascade follows).
  void ChooseProduct(int index);
  void ChooseExchange(int index);
  void ChooseSector(int index);
  void ChooseLetter(int index);

  // The four choices; nullopt while a list has none.
  std::optional<Choice> CurrentChoice() const;
  // Makes the choices of `choice` and runs the filter; false (and what could
  // be chosen stays) when one of them is not offered.
  bool Restore(const Choice& choice);
  // The choices as one text (start parameters) and back.
  static std::string ChoiceText(const Choice& choice);
  static std::optional<Choice> ParseChoice(const std::string& text);

  // Runs the filter on the current choices (nothing while one is missing).
  void Run();
  std::function<void(const std::vector<InstrumentKey>& result)> onResult;

  // ---- The rules ----
  static int Limit();
  // The exchanges offered for a product: codes (trimmed) of the instruments of
  // that product, in the exchange store's order, unknown ones after them.
  static std::vector<std::string> ExchangesOf(const std::vector<JInstrumentUnderlying>& instruments,
                                              std::int64_t productId);
  static bool LetterMatches(const std::string& instrumentCode, const std::wstring& letter);
  static std::vector<InstrumentKey> Filter(const std::vector<JInstrumentUnderlying>& instruments,
                                           const Choice& choice, int limit);

 private:
  void FillExchanges();
  void FillSectors();
  void FillLetters();
  void Clear(CSkinComboBox* list);

  CSkinComboBox* m_products = nullptr;
  CSkinComboBox* m_exchanges = nullptr;
  CSkinComboBox* m_sectors = nullptr;
  CSkinComboBox* m_letters = nullptr;
  std::vector<JSector> m_sectorList;
  bool m_haveSectors = false;
};
