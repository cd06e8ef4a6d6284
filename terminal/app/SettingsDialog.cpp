#include "terminal/app/SettingsDialog.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QFormLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QListWidget>
#include <QPushButton>
#include <QVBoxLayout>

#include "hostview/Services.h"
#include "terminal/host/Services.h"

namespace term {

QString SettingsDialog::ColumnName(const ColumnSettingItem& item, const ILanguage* language) {
  std::wstring text = language && item.textId > 0 ? language->GetText(13, item.textId) : std::wstring();
  if (text.empty()) text = item.header;
  if (text.empty() && language && item.textId > 0) text = language->GetText(kTerminalSection, item.textId);
  return text.empty() ? QString::fromStdString(item.key) : QString::fromStdWString(text);
}

SettingsDialog::SettingsDialog(const ILanguage* language, QWidget* parent) : QDialog(parent) {
  setWindowTitle("Settings");
  CUserSettings& s = GetUserSettings();
  m_watchlist = s.GetWatchlistSetting();
  auto* layout = new QVBoxLayout(this);

  auto* columnsBox = new QGroupBox("Quote grid columns (first layout; tick to show, order top to bottom)", this);
  auto* columnsLayout = new QHBoxLayout(columnsBox);
  m_columns = new QListWidget(columnsBox);
  m_columns->setObjectName("columns");
  const auto& layouts = m_watchlist.GetSetInfoList();
  if (!layouts.empty()) {
    for (const auto& item : layouts.front().items) {
      auto* li = new QListWidgetItem(ColumnName(item, language));
      li->setData(Qt::UserRole, QString::fromStdString(item.key));
      li->setFlags(li->flags() | Qt::ItemIsUserCheckable);
      li->setCheckState(item.visible ? Qt::Checked : Qt::Unchecked);
      m_columns->addItem(li);
    }
  }
  auto* buttons = new QVBoxLayout;
  auto* up = new QPushButton("Up", columnsBox);
  auto* down = new QPushButton("Down", columnsBox);
  buttons->addWidget(up);
  buttons->addWidget(down);
  buttons->addStretch();
  columnsLayout->addWidget(m_columns, 1);
  columnsLayout->addLayout(buttons);
  connect(up, &QPushButton::clicked, this, [this] { Move(-1); });
  connect(down, &QPushButton::clicked, this, [this] { Move(1); });
  layout->addWidget(columnsBox, 1);

  auto* form = new QFormLayout;
  m_font = new QComboBox(this);
  for (const auto& text : m_watchlist.GetFontSizeItems()) m_font->addItem(QString::fromStdWString(text));
  m_font->setCurrentIndex(m_watchlist.GetFontSize());
  form->addRow("Grid font size", m_font);
  m_shortcuts = new QCheckBox("Enable keyboard shortcuts", this);
  m_shortcuts->setChecked(s.GetKeyboardShortcutsSetting().GetEnableKeyboardShortcuts());
  form->addRow(QString(), m_shortcuts);
  m_alertFilter = new QComboBox(this);
  m_alertFilter->addItems({"Show all", "Triggered", "Active", "Expired"});
  m_alertFilter->setCurrentIndex(s.GetAlertSetting().GetPriceAlertOption());
  form->addRow("Price alerts shown", m_alertFilter);
  m_orderNumbers = new QCheckBox("Show order numbers", this);
  m_orderNumbers->setChecked(s.GetGeneralSetting().GetEnableONDisplay());
  form->addRow(QString(), m_orderNumbers);
  layout->addLayout(form);

  auto* box = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  connect(box, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(box, &QDialogButtonBox::rejected, this, &QDialog::reject);
  layout->addWidget(box);
  resize(480, 560);
}

void SettingsDialog::Move(int delta) {
  const int row = m_columns->currentRow();
  const int target = row + delta;
  if (row < 0 || target < 0 || target >= m_columns->count()) return;
  QListWidgetItem* item = m_columns->takeItem(row);
  m_columns->insertItem(target, item);
  m_columns->setCurrentRow(target);
}

bool SettingsDialog::Apply(CUserSettings& settings, std::string& problem) const {
  CWatchlistSetting watchlist = m_watchlist;
  if (!watchlist.GetSetInfoList().empty()) {
    ColumnSettingInfo info = watchlist.GetSetInfoList().front();
    std::vector<ColumnSettingItem> ordered;
    for (int i = 0; i < m_columns->count(); ++i) {
      const std::string key = m_columns->item(i)->data(Qt::UserRole).toString().toStdString();
      for (const auto& item : info.items) {
        if (item.key != key) continue;
        ColumnSettingItem copy = item;
        copy.visible = m_columns->item(i)->checkState() == Qt::Checked;
        ordered.push_back(copy);
      }
    }
    info.items = ordered;
    watchlist.SetSettingInfo(info.id, info);
  }
  watchlist.SetFontSize(m_font->currentIndex());
  CKeyboardShortcutsSetting keys = settings.GetKeyboardShortcutsSetting();
  keys.SetEnableKeyboardShortcuts(m_shortcuts->isChecked());
  CAlertSetting alert = settings.GetAlertSetting();
  alert.SetPriceAlertOption(m_alertFilter->currentIndex());
  CGeneralSetting general = settings.GetGeneralSetting();
  general.SetEnableONDisplay(m_orderNumbers->isChecked());
  bool ok = settings.SetWatchlistSetting(watchlist);
  ok = settings.SetKeyboardShortcutsSetting(keys) && ok;
  ok = settings.SetAlertSetting(alert) && ok;
  ok = settings.SetGeneralSetting(general) && ok;
  if (!ok) problem = "The settings apply now but could not be saved: " + settings.GetErrorInfo();
  return ok;
}

}  // namespace term
