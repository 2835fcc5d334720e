#include "gui/main/delete_records_dialog.h"

#include <QDialogButtonBox>
#include <QLabel>
#include <QRadioButton>
#include <QVBoxLayout>

#include "gui/common/help.h"

namespace cx::gui {

DeleteRecordsDialog::DeleteRecordsDialog(QWidget* parent) : QDialog(parent) {
  setObjectName(QStringLiteral("deleteRecordsDialog"));
  setWindowTitle(QStringLiteral("Delete Records"));
  InstallHelpShortcut(this, QStringLiteral("Delete_Records"));

  auto* layout = new QVBoxLayout(this);
  layout->addWidget(new QLabel(QStringLiteral("Delete which Records:"), this));
  // The handheld underlined "Within" and "Outside"; a radio button shows
  // plain text, and the words alone tell the choices apart.
  within_ = new QRadioButton(QStringLiteral("All Records Within Filter Range"), this);
  within_->setObjectName(QStringLiteral("withinFilterRange"));
  outside_ = new QRadioButton(QStringLiteral("All Records Outside Filter Range"), this);
  outside_->setObjectName(QStringLiteral("outsideFilterRange"));
  all_ = new QRadioButton(QStringLiteral("All Records"), this);
  all_->setObjectName(QStringLiteral("allRecords"));
  within_->setChecked(true);
  for (QRadioButton* b : {within_, outside_, all_}) layout->addWidget(b);
  layout->addSpacing(6);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  layout->addWidget(buttons);
  layout->setSizeConstraint(QLayout::SetFixedSize);
}

DeleteScope DeleteRecordsDialog::scope() const {
  if (outside_->isChecked()) return DeleteScope::OutsideFilterRange;
  if (all_->isChecked()) return DeleteScope::All;
  return DeleteScope::WithinFilterRange;
}

}  // namespace cx::gui
