#include "gui/design/security_dialog.h"

#include <QComboBox>
#include <QDialogButtonBox>
#include <QFormLayout>
#include <QLabel>
#include <QLineEdit>
#include <QVBoxLayout>

#include "gui/common/text.h"
#include "gui/design/design_widgets.h"

namespace cx::gui {

SecurityDialog::SecurityDialog(Database& db, QWidget* parent)
    : QDialog(parent), db_(db), loaded_(LoadSecuritySettings(db.schema())),
      password_(new QLineEdit(this)) {
  setObjectName(QStringLiteral("securityAccessDialog"));
  setWindowTitle(QStringLiteral("Security Access"));

  auto* intro = new QLabel(
      QStringLiteral("Choose who may do what with this database. \"Password Required\" "
                     "asks for the password below each time the operation starts."),
      this);
  intro->setWordWrap(true);

  auto* form = new QFormLayout;
  for (int op = 0; op < secured::kCount; ++op) {
    auto* list = new QComboBox(this);
    list->setObjectName(QStringLiteral("level%1").arg(op));
    for (int level = 0; level < LevelsOffered(op); ++level) {
      list->addItem(QString::fromLatin1(AccessLevelLabel(level).data(),
                                        static_cast<qsizetype>(AccessLevelLabel(level).size())));
    }
    // A level this row does not offer (set by another program) is shown and
    // written back as it is unless the user picks another.
    const int level = loaded_.levels[static_cast<size_t>(op)];
    if (level >= list->count() && level < access_level::kCount) {
      for (int extra = list->count(); extra <= level; ++extra) {
        list->addItem(QString::fromLatin1(AccessLevelLabel(extra).data(),
                                          static_cast<qsizetype>(AccessLevelLabel(extra).size())));
      }
    }
    list->setCurrentIndex(level);
    levels_[static_cast<size_t>(op)] = list;
    const auto label = OperationLabel(op);
    if (op == secured::kDeleteDatabase) {
      // No command deletes a database here; the level travels with the file.
      list->setVisible(false);
      continue;
    }
    form->addRow(QString::fromLatin1(label.data(), static_cast<qsizetype>(label.size())) +
                     QLatin1Char(':'),
                 list);
  }
  password_->setObjectName(QStringLiteral("password"));
  password_->setMaxLength(19);
  password_->setText(FromDb(loaded_.password));
  form->addRow(QStringLiteral("Password:"), password_);

  auto* buttons = new QDialogButtonBox(
      QDialogButtonBox::Ok | QDialogButtonBox::Cancel | QDialogButtonBox::Help, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  ConnectHelp(this, buttons, QStringLiteral("Security_Access"));

  auto* layout = new QVBoxLayout(this);
  layout->addWidget(intro);
  layout->addLayout(form);
  layout->addWidget(buttons);
  setMinimumWidth(360);
}

void SecurityDialog::accept() {
  auto password = StorableText(this, password_->text(), QStringLiteral("Password"), 19);
  if (!password) return;
  SecuritySettings s = loaded_;
  s.password = *password;
  for (int op = 0; op < secured::kCount; ++op) {
    s.levels[static_cast<size_t>(op)] = levels_[static_cast<size_t>(op)]->currentIndex();
  }
  ApplySecuritySettings(db_, s);
  QDialog::accept();
}

}  // namespace cx::gui
