#include "views/price/AdvanceFilter.h"

#include <QHBoxLayout>
#include <algorithm>
#include <set>

#include "addon/TextTables.h"
#include "data/ReferenceStores.h"
#include "hostview/Text.h"
#include "skin/Skin.h"

namespace {

constexpr int kBarHeight = 24;
constexpr int kListHeight = 22;
constexpr int kProductWidth = 190;
constexpr int kExchangeWidth = 120;
constexpr int kSectorWidth = 170;
constexpr int kLetterWidth = 80;
constexpr int kVisibleItems = 16;

QString Q(const std::wstring& s) { return QString::fromStdWString(s); }
QString Q(const std::string& s) { return QString::fromUtf8(s.data(), qsizetype(s.size())); }

std::string Trimmed(const std::string& s) {
  const auto b = s.find_first_not_of(" \t");
  if (b == std::string::npos) return {};
  const auto e = s.find_last_not_of(" \t");
  return s.substr(b, e - b + 1);
}

}  // namespace

CAdvanceFilter::CAdvanceFilter(QWidget* parent) : QWidget(parent) {
  setObjectName(QStringLiteral("AdvanceFilter"));
  auto* row = new QHBoxLayout(this);
  row->setContentsMargins(2, 1, 2, 1);
  row->setSpacing(4);
  auto make = [this, row](int id, const wchar_t* caption, int width, const char* name) {
    auto* list = new CSkinComboBox(this);
    list->setObjectName(QString::fromLatin1(name));
    list->setProperty("controlId", id);
    list->setPlaceholderText(QString::fromWCharArray(caption));
    list->setFixedSize(width, kListHeight);
    list->setMaxVisibleItems(kVisibleItems);
    list->setFocusPolicy(Qt::StrongFocus);
    row->addWidget(list);
    return list;
  };
  m_products = make(kProductListId, kProductCaption, kProductWidth, "FilterProduct");
  m_exchanges = make(kExchangeListId, kExchangeCaption, kExchangeWidth, "FilterExchange");
  m_sectors = make(kSectorListId, kSectorCaption, kSectorWidth, "FilterSector");
  m_letters = make(kLetterListId, kLetterCaption, kLetterWidth, "FilterLetter");
  row->addStretch(1);
  connect(m_products, &QComboBox::activated, this, [this](int i) { ChooseProduct(i); });
  connect(m_exchanges, &QComboBox::activated, this, [this](int i) { ChooseExchange(i); });
  connect(m_sectors, &QComboBox::activated, this, [this](int i) { ChooseSector(i); });
  connect(m_letters, &QComboBox::activated, this, [this](int i) { ChooseLetter(i); });
  setFixedHeight(kBarHeight);
}

CAdvanceFilter::~CAdvanceFilter() = default;

int CAdvanceFilter::BarHeight() { return kBarHeight; }

void CAdvanceFilter::SetStyleManager(const IStyleManager* style) {
  for (CSkinComboBox* list : {m_products, m_exchanges, m_sectors, m_letters}) list->SetStyleManager(style);
}

CSkinComboBox* CAdvanceFilter::List(int id) const {
  switch (id) {
    case kProductListId: return m_products;
    case kExchangeListId: return m_exchanges;
    case kSectorListId: return m_sectors;
    case kLetterListId: return m_letters;
    default: return nullptr;
  }
}

void CAdvanceFilter::Clear(CSkinComboBox* list) {
  const QSignalBlocker block(list);
  list->clear();
  list->setCurrentIndex(-1);
}

// ---- The cascade -----------------------------------------------------------------

void CAdvanceFilter::Reset() {
  Clear(m_products);
  {
    const QSignalBlocker block(m_products);
    for (const JProduct& p : ProductMgr().Records()) {
      const std::string name = Trimmed(p.productName).empty() ? p.productType : Trimmed(p.productName);
      m_products->addItem(Q(name), QVariant::fromValue<qlonglong>(p.productId));
    }
    m_products->setCurrentIndex(-1);
  }
  FillExchanges();
}

void CAdvanceFilter::FillExchanges() {
  Clear(m_exchanges);
  Clear(m_sectors);
  Clear(m_letters);
  const int product = m_products->currentIndex();
  if (product < 0) return;
  const std::int64_t productId = m_products->itemData(product).toLongLong();
  const QSignalBlocker block(m_exchanges);
  for (const std::string& code : ExchangesOf(InstrumentMgr_ReadOnly().Records(), productId)) {
    const JExchangeList* exchange = ExchangeMgr().FindPtr(code);
    m_exchanges->addItem(Q(code), Q(code));
    if (exchange && !exchange->exchangeName.empty())
      m_exchanges->setItemData(m_exchanges->count() - 1, Q(exchange->exchangeName), Qt::ToolTipRole);
  }
  m_exchanges->setCurrentIndex(-1);
}

void CAdvanceFilter::FillSectors() {
  const QString kept = m_sectors->currentIndex() >= 0 ? m_sectors->currentData().toString() : QString();
  Clear(m_sectors);
  if (m_exchanges->currentIndex() < 0) return;
  const QSignalBlocker block(m_sectors);
  m_sectors->addItem(Q(std::wstring(kAllItem)), QString::fromLatin1(kAllSectorsValue));
  for (const JSector& s : m_sectorList)
    m_sectors->addItem(Q(Trimmed(s.sectorName).empty() ? s.sectorCode : Trimmed(s.sectorName)), Q(s.sectorCode));
  m_sectors->setCurrentIndex(kept.isEmpty() ? -1 : m_sectors->findData(kept));
}

void CAdvanceFilter::FillLetters() {
  Clear(m_letters);
  if (m_exchanges->currentIndex() < 0) return;
  const QSignalBlocker block(m_letters);
  for (char c = 'A'; c <= 'Z'; ++c) m_letters->addItem(QString(QLatin1Char(c)));
  m_letters->addItem(Q(std::wstring(kOthersItem)));
  m_letters->addItem(Q(std::wstring(kAllItem)));
  m_letters->setCurrentIndex(-1);
}

void CAdvanceFilter::SetSectors(const std::vector<JSector>& sectors) {
  m_sectorList = sectors;
  m_haveSectors = true;
  FillSectors();
}

void CAdvanceFilter::ChooseProduct(int index) {
  {
    const QSignalBlocker block(m_products);
    m_products->setCurrentIndex(index < m_products->count() ? index : -1);
  }
  FillExchanges();
}

void CAdvanceFilter::ChooseExchange(int index) {
  {
    const QSignalBlocker block(m_exchanges);
    m_exchanges->setCurrentIndex(index < m_exchanges->count() ? index : -1);
  }
  Clear(m_sectors);
  FillSectors();
  FillLetters();
}

void CAdvanceFilter::ChooseSector(int index) {
  {
    const QSignalBlocker block(m_sectors);
    m_sectors->setCurrentIndex(index < m_sectors->count() ? index : -1);
  }
  Run();
}

void CAdvanceFilter::ChooseLetter(int index) {
  {
    const QSignalBlocker block(m_letters);
    m_letters->setCurrentIndex(index < m_letters->count() ? index : -1);
  }
  Run();
}

std::optional<CAdvanceFilter::Choice> CAdvanceFilter::CurrentChoice() const {
  if (m_products->currentIndex() < 0 || m_exchanges->currentIndex() < 0 || m_sectors->currentIndex() < 0 ||
      m_letters->currentIndex() < 0)
    return std::nullopt;
  Choice c;
  c.productId = m_products->currentData().toLongLong();
  c.exchangeCode = m_exchanges->currentData().toString().toStdString();
  c.sector = m_sectors->currentData().toString().toStdString();
  c.letter = m_letters->currentText().toStdWString();
  return c;
}

void CAdvanceFilter::Run() {
  const auto choice = CurrentChoice();
  if (!choice) return;
  const std::vector<InstrumentKey> result = Filter(InstrumentMgr_ReadOnly().Records(), *choice, Limit());
  if (onResult) onResult(result);
}

bool CAdvanceFilter::Restore(const Choice& choice) {
  Reset();
  const int product = m_products->findData(QVariant::fromValue<qlonglong>(choice.productId));
  if (product < 0) return false;
  ChooseProduct(product);
  const int exchange = m_exchanges->findData(Q(choice.exchangeCode));
  if (exchange < 0) return false;
  ChooseExchange(exchange);
  const int letter = m_letters->findText(Q(choice.letter));
  if (letter < 0) return false;
  {
    const QSignalBlocker block(m_letters);
    m_letters->setCurrentIndex(letter);
  }
  const int sector = m_sectors->findData(Q(choice.sector));
  if (sector < 0) return false;
  ChooseSector(sector);
  return true;
}

std::string CAdvanceFilter::ChoiceText(const Choice& choice) {
  return std::to_string(choice.productId) + "|" + choice.exchangeCode + "|" + choice.sector + "|" +
         hv::Narrow(choice.letter);
}

std::optional<CAdvanceFilter::Choice> CAdvanceFilter::ParseChoice(const std::string& text) {
  std::vector<std::string> parts;
  std::size_t from = 0;
  for (;;) {
    const std::size_t bar = text.find('|', from);
    parts.push_back(text.substr(from, bar == std::string::npos ? std::string::npos : bar - from));
    if (bar == std::string::npos) break;
    from = bar + 1;
  }
  if (parts.size() != 4 || parts[1].empty() || parts[2].empty() || parts[3].empty()) return std::nullopt;
  Choice c;
  try {
    std::size_t used = 0;
    c.productId = std::stoll(parts[0], &used);
    if (used != parts[0].size()) return std::nullopt;
  } catch (...) {
    return std::nullopt;
  }
  c.exchangeCode = parts[1];
  c.sector = parts[2];
  c.letter = hv::Widen(parts[3]);
  return c;
}

// ---- The rules -----------------------------------------------------------------------

int CAdvanceFilter::Limit() {
  const auto& settings = addon::SettingTextTable::Instance();
  const int advft = settings.GetNumber("ADVFT", 0);
  return advft >= 1 && advft <= kMaxAdvftLimit ? advft : settings.MaxWatchlistItems();
}

std::vector<std::string> CAdvanceFilter::ExchangesOf(const std::vector<JInstrumentUnderlying>& instruments,
                                                     std::int64_t productId) {
  std::vector<std::string> seen;
  std::set<std::string> known;
  for (const JInstrumentUnderlying& i : instruments) {
    if (i.productId != productId) continue;
    std::string code = Trimmed(i.exchangeCode);
    if (!code.empty() && known.insert(code).second) seen.push_back(std::move(code));
  }
  // The exchange store's order first.
  std::vector<std::string> out;
  for (const JExchangeList& e : ExchangeMgr().Records()) {
    const std::string code = Trimmed(e.exchangeCode);
    if (known.count(code) && std::find(out.begin(), out.end(), code) == out.end()) out.push_back(code);
  }
  for (const std::string& code : seen)
    if (std::find(out.begin(), out.end(), code) == out.end()) out.push_back(code);
  return out;
}

bool CAdvanceFilter::LetterMatches(const std::string& instrumentCode, const std::wstring& letter) {
  if (letter == kAllItem) return true;
  const char first = instrumentCode.empty() ? '\0' : instrumentCode.front();
  if (letter == kOthersItem) return first < 'A' || first > 'Z';
  return letter.size() == 1 && !instrumentCode.empty() && wchar_t(static_cast<unsigned char>(first)) == letter[0];
}

std::vector<InstrumentKey> CAdvanceFilter::Filter(const std::vector<JInstrumentUnderlying>& instruments,
                                                  const Choice& choice, int limit) {
  std::vector<InstrumentKey> out;
  if (limit <= 0) return out;
  const bool allSectors = choice.sector == kAllSectorsValue;
  for (const JInstrumentUnderlying& i : instruments) {
    if (i.productId != choice.productId) continue;
    if (Trimmed(i.exchangeCode) != choice.exchangeCode) continue;
    if (!allSectors && i.sector.find(choice.sector) == std::string::npos) continue;
    if (!LetterMatches(i.instrumentCode, choice.letter)) continue;
    out.push_back(InstrumentKeyOf(i));
    if (int(out.size()) >= limit) break;
  }
  return out;
}
