#include "gui/design/edit_database_dialog.h"

#include <QDialogButtonBox>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QVBoxLayout>

#include "design/properties.h"
#include "engine/field_types.h"
#include "gui/common/text.h"
#include "gui/design/author_dialog.h"
#include "gui/design/design_widgets.h"
#include "gui/design/field_editor_dialog.h"
#include "gui/design/field_order_dialog.h"
#include "gui/design/security_dialog.h"

namespace cx::gui {

EditDatabaseDialog::EditDatabaseDialog(DataSession& session, QWidget* parent)
    : QDialog(parent), session_(session), name_(new QLineEdit(this)),
      fields_(new QListWidget(this)) {
  setObjectName(QStringLiteral("editDatabaseDialog"));
  setWindowTitle(QStringLiteral("Edit Database"));
  name_->setObjectName(QStringLiteral("databaseName"));
  name_->setMaxLength(static_cast<int>(kDatabaseNameChars));
  name_->setText(FromDb(session.db.Name()));
  fields_->setObjectName(QStringLiteral("fields"));
  fields_->setToolTip(QStringLiteral("Double-click a field (or press Enter) to edit it"));

  auto* security = new QPushButton(QStringLiteral("Security Settings"), this);
  security->setObjectName(QStringLiteral("securitySettings"));
  auto* author = new QPushButton(QStringLiteral("Author"), this);
  author->setObjectName(QStringLiteral("author"));
  auto* order = new QPushButton(QStringLiteral("Field Order"), this);
  order->setObjectName(QStringLiteral("fieldOrder"));
  auto* edit = new QPushButton(QStringLiteral("Edit Field..."), this);
  edit->setObjectName(QStringLiteral("editField"));
  for (QPushButton* b : {security, author, order, edit}) b->setAutoDefault(false);

  connect(fields_, &QListWidget::itemActivated, this,
          [this](QListWidgetItem* item) { EditField(fields_->row(item)); });
  connect(edit, &QPushButton::clicked, this, [this] { EditField(fields_->currentRow()); });
  connect(security, &QPushButton::clicked, this, [this] {
    SecurityDialog dialog(session_.db, this);
    if (dialog.exec() == QDialog::Accepted) designChanged_ = true;
  });
  connect(author, &QPushButton::clicked, this, [this] {
    AuthorDialog dialog(session_.db, this);
    if (dialog.exec() == QDialog::Accepted) designChanged_ = true;
  });
  connect(order, &QPushButton::clicked, this, [this] {
    FieldOrderDialog dialog(session_.db, this);
    if (dialog.exec() == QDialog::Accepted) designChanged_ = true;
  });

  auto* form = new QFormLayout;
  form->addRow(QStringLiteral("Database Name:"), name_);
  auto* side = new QVBoxLayout;
  side->addWidget(edit);
  side->addSpacing(12);
  side->addWidget(security);
  side->addWidget(author);
  side->addWidget(order);
  side->addStretch(1);
  auto* row = new QHBoxLayout;
  row->addWidget(fields_, 1);
  row->addLayout(side);
  auto* buttons = new QDialogButtonBox(
      QDialogButtonBox::Ok | QDialogButtonBox::Cancel | QDialogButtonBox::Help, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  ConnectHelp(this, buttons, QStringLiteral("Edit_Database"));

  auto* layout = new QVBoxLayout(this);
  layout->addLayout(form);
  layout->addWidget(new QLabel(QStringLiteral("Edit Fields:"), this));
  layout->addLayout(row, 1);
  layout->addWidget(buttons);
  resize(440, 520);
  RefillFields();
  fields_->setCurrentRow(0);
}

void EditDatabaseDialog::RefillFields() {
  const int current = fields_->currentRow();
  fields_->clear();
  const Schema& schema = session_.db.schema();
  const auto names = FieldListEntries(schema);
  for (size_t slot = 0; slot < names.size(); ++slot) {
    auto* item = new QListWidgetItem(FromDb(names[slot]), fields_);
    const auto type = FieldTypeLabel(schema.field[slot].type());
    item->setToolTip(QStringLiteral("Field %1: %2")
                         .arg(slot + 1)
                         .arg(QString::fromLatin1(type.data(), static_cast<qsizetype>(type.size()))));
    if (schema.field[slot].type() == FieldType::NotUsed) {
      item->setForeground(palette().color(QPalette::Disabled, QPalette::Text));
    }
  }
  fields_->setCurrentRow(current);
}

void EditDatabaseDialog::EditField(int slot) {
  if (slot < 0 || slot >= fields_->count()) return;
  FieldEditorDialog editor(session_, slot, this);
  editor.setProgressThreshold(progressFrom_);
  if (editor.exec() == QDialog::Accepted) designChanged_ = true;
  recordsChanged_ = recordsChanged_ || editor.recordsChanged();
  RefillFields();
  fields_->setCurrentRow(slot);
}

void EditDatabaseDialog::accept() {
  auto name = StorableText(this, name_->text(), QStringLiteral("Database Name"),
                           kDatabaseNameChars);
  if (!name) return;
  SetDatabaseName(session_.db, *name);
  designChanged_ = true;
  QDialog::accept();
}

}  // namespace cx::gui
