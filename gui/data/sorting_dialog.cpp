#include "gui/data/sorting_dialog.h"

#include <QButtonGroup>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QFormLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QRadioButton>
#include <QVBoxLayout>

#include "gui/common/help.h"
#include "engine/format.h"
#include "gui/common/text.h"

namespace cx::gui {

SortingDialog::SortingDialog(Database& db, UiPort& ui, QWidget* parent) : QDialog(parent), db_(db), ui_(ui) {
  setObjectName("sortingDialog");
  setWindowTitle("Sorting");
  setMinimumWidth(300);
  InstallHelpShortcut(this, QStringLiteral("Sort_Dialog"));
  auto* layout = new QVBoxLayout(this);
  const char* titles[3] = {"Primary Sort", "Secondary Sort", "Tertiary Sort"};
  const char* names[3] = {"primary", "secondary", "tertiary"};
  for (int k = 0; k < 3; ++k) {
    auto* box = new QGroupBox(titles[k], this);
    auto* v = new QVBoxLayout(box);
    field_[k] = new QComboBox(box);
    field_[k]->setObjectName(QString(names[k]) + "Field");
    field_[k]->addItem("No Field");
    // Every slot is listed, unused ones too, so that entry n + 1 is field n.
    for (int f = 0; f < format::kFieldCount; ++f) field_[k]->addItem(FromDb(db.schema().field[f].name.str()));
    v->addWidget(field_[k]);
    auto* pair = new QHBoxLayout;
    forward_[k] = new QRadioButton("Forward", box);
    reverse_[k] = new QRadioButton("Reverse", box);
    forward_[k]->setObjectName(QString(names[k]) + "Forward");
    reverse_[k]->setObjectName(QString(names[k]) + "Reverse");
    auto* group = new QButtonGroup(box);
    group->addButton(forward_[k]);
    group->addButton(reverse_[k]);
    pair->addWidget(forward_[k]);
    pair->addWidget(reverse_[k]);
    pair->addStretch();
    v->addLayout(pair);
    layout->addWidget(box);
  }
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  buttons->setObjectName("buttons");
  connect(buttons, &QDialogButtonBox::accepted, this, &SortingDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &SortingDialog::reject);
  layout->addWidget(buttons);
  setChoice(OpenSortingDialog(db.schema()));
}

SortingChoice SortingDialog::choice() const {
  SortingChoice c;
  for (int k = 0; k < 3; ++k) {
    c.entry[k] = field_[k]->currentIndex();
    c.forward[k] = forward_[k]->isChecked();
  }
  return c;
}

void SortingDialog::setChoice(const SortingChoice& c) {
  for (int k = 0; k < 3; ++k) {
    field_[k]->setCurrentIndex(c.entry[k]);
    (c.forward[k] ? forward_[k] : reverse_[k])->setChecked(true);
  }
}

void SortingDialog::accept() {
  if (!AcceptSortingDialog(db_, choice(), ui_)) return;
  QDialog::accept();
}

}  // namespace cx::gui
