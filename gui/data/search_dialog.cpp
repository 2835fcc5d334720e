#include "gui/data/search_dialog.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QFormLayout>
#include <QLineEdit>
#include <QMessageBox>
#include <QPushButton>
#include <QVBoxLayout>

#include "gui/common/help.h"
#include "engine/format.h"
#include "gui/common/text.h"

namespace cx::gui {

// The stored search text holds 34 characters and its terminator.
constexpr int kSearchTextChars = 34;

SearchDialog::SearchDialog(const Database& db, QWidget* parent) : QDialog(parent) {
  setObjectName("searchDialog");
  setWindowTitle("Search Database");
  setMinimumWidth(320);
  InstallHelpShortcut(this, QStringLiteral("Find_Dialog"));
  auto* layout = new QVBoxLayout(this);
  auto* form = new QFormLayout;
  text_ = new QLineEdit(this);
  text_->setObjectName("searchText");
  text_->setMaxLength(kSearchTextChars);
  form->addRow("Search For:", text_);
  allFields_ = new QCheckBox("Search All Fields", this);
  allFields_->setObjectName("searchAllFields");
  form->addRow(allFields_);
  field_ = new QComboBox(this);
  field_->setObjectName("searchField");
  for (int f = 0; f < format::kFieldCount; ++f) field_->addItem(FromDb(db.schema().field[f].name.str()));
  form->addRow("Select Field", field_);
  caseSensitive_ = new QCheckBox("Case Sensitive", this);
  caseSensitive_->setObjectName("searchCaseSensitive");
  beginsWith_ = new QCheckBox("Field Begins with...", this);
  beginsWith_->setObjectName("searchBeginsWith");
  form->addRow(caseSensitive_);
  form->addRow(beginsWith_);
  layout->addLayout(form);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  buttons->setObjectName("buttons");
  buttons->button(QDialogButtonBox::Ok)->setText("Find");
  connect(buttons, &QDialogButtonBox::accepted, this, &SearchDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &SearchDialog::reject);
  connect(allFields_, &QCheckBox::toggled, field_, &QWidget::setDisabled);
  layout->addWidget(buttons);
  setSettings(LoadSearchSettings(db.schema()));
}

SearchSettings SearchDialog::settings() const {
  SearchSettings s;
  s.text = ToDb(text_->text()).value_or(std::string());
  s.field = allFields_->isChecked() ? -1 : field_->currentIndex();
  s.caseSensitive = caseSensitive_->isChecked();
  s.beginsWith = beginsWith_->isChecked();
  return s;
}

void SearchDialog::setSettings(const SearchSettings& s) {
  text_->setText(FromDb(s.text));
  allFields_->setChecked(s.field < 0);
  field_->setCurrentIndex(s.field < 0 || s.field >= format::kFieldCount ? 0 : s.field);
  field_->setDisabled(s.field < 0);
  caseSensitive_->setChecked(s.caseSensitive);
  beginsWith_->setChecked(s.beginsWith);
  text_->selectAll();
}

void SearchDialog::accept() {
  if (!ToDb(text_->text())) {
    QMessageBox::warning(this, windowTitle(),
                         "The text contains \"" + FirstUnstorableCharacter(text_->text()) +
                             "\", which a database cannot hold.");
    return;
  }
  QDialog::accept();
}

}  // namespace cx::gui
