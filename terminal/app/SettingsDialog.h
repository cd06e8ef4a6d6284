#pragma once
// The host settings the views read: quote-grid columns and font size, keyboard
// shortcuts, the alert list's filter option and the order-number display.
#include <QDialog>
#include <string>

#include "hostconfig/UserSettings.h"

class ILanguage;
class QCheckBox;
class QComboBox;
class QListWidget;

namespace term {

class SettingsDialog : public QDialog {
  Q_OBJECT
 public:
  // Shows the current values of GetUserSettings(); column names come from
  // `language` (the keys when there is none).
  explicit SettingsDialog(const ILanguage* language, QWidget* parent = nullptr);
  // The name a person reads for a quote column: its heading, else the
  // terminal's name for a column whose heading is blank, else its key.
  static QString ColumnName(const ColumnSettingItem& item, const ILanguage* language);
  // Writes the dialog's values into `settings` (each group stored at once).
  // False with `problem` when the storage refused a group (the values still apply).
  bool Apply(CUserSettings& settings, std::string& problem) const;

 private:
  void Move(int delta);
  CWatchlistSetting m_watchlist;
  QListWidget* m_columns = nullptr;
  QComboBox* m_font = nullptr;
  QCheckBox* m_shortcuts = nullptr;
  QComboBox* m_alertFilter = nullptr;
  QCheckBox* m_orderNumbers = nullptr;
};

}  // namespace term
