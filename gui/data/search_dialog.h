// "Search Database": the text, the field (or all fields), case and
// begins-with. The dialog only collects; the command runs the search.
#pragma once

#include <QDialog>

#include "engine/record_store.h"
#include "ops/database_settings.h"

class QCheckBox;
class QComboBox;
class QLineEdit;

namespace cx::gui {

class SearchDialog : public QDialog {
  Q_OBJECT
 public:
  SearchDialog(const Database& db, QWidget* parent = nullptr);

  SearchSettings settings() const;
  void setSettings(const SearchSettings& settings);

 public slots:
  void accept() override;

 private:
  QLineEdit* text_;
  QCheckBox* allFields_;
  QComboBox* field_;
  QCheckBox* caseSensitive_;
  QCheckBox* beginsWith_;
};

}  // namespace cx::gui
