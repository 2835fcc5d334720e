#include "gui/design/popup_list_dialog.h"

#include <QCheckBox>
#include <QDialogButtonBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QVBoxLayout>

#include "engine/format.h"
#include "gui/common/text.h"
#include "gui/design/design_widgets.h"

namespace cx::gui {

EditPopupDialog::EditPopupDialog(UiPort& ui, const QString& value, QWidget* parent)
    : QDialog(parent), ui_(ui), edit_(new QLineEdit(this)) {
  setObjectName(QStringLiteral("editPopupDialog"));
  setWindowTitle(QStringLiteral("Edit Popup"));
  edit_->setObjectName(QStringLiteral("value"));
  edit_->setMaxLength(format::kMaxPopupText);
  edit_->setText(value);
  edit_->selectAll();
  edit_->setMinimumWidth(300);
  auto* buttons = new QDialogButtonBox(
      QDialogButtonBox::Ok | QDialogButtonBox::Cancel | QDialogButtonBox::Help, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  ConnectHelp(this, buttons, QStringLiteral("Edit_Popup_List"));
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(new QLabel(QString::fromLatin1(popup_messages::kEditPopupPrompt), this));
  layout->addWidget(edit_);
  layout->addWidget(buttons);
  layout->setSizeConstraint(QLayout::SetFixedSize);
}

void EditPopupDialog::accept() {
  auto text = StorableText(this, edit_->text(), QStringLiteral("Popup value"),
                           format::kMaxPopupText);
  if (!text) return;
  if (!AcceptPopupValue(*text, ui_)) {
    edit_->setFocus();
    return;
  }
  value_ = *text;
  QDialog::accept();
}

PopupListDialog::PopupListDialog(DataSession& session, int slot, QWidget* parent)
    : QDialog(parent), session_(session), slot_(slot), editor_(session, slot),
      list_(new QListWidget(this)), new_(new QPushButton(QStringLiteral("New"), this)),
      rename_(new QPushButton(QStringLiteral("Rename"), this)),
      delete_(new QPushButton(QStringLiteral("Delete"), this)),
      sort_(new QCheckBox(QStringLiteral("Sort Popups"), this)) {
  setObjectName(QStringLiteral("popupListDialog"));
  setWindowTitle(QStringLiteral("Edit Popup List"));
  list_->setObjectName(QStringLiteral("popups"));
  new_->setObjectName(QStringLiteral("new"));
  rename_->setObjectName(QStringLiteral("rename"));
  delete_->setObjectName(QStringLiteral("delete"));
  sort_->setObjectName(QStringLiteral("sortPopups"));
  for (QPushButton* b : {new_, rename_, delete_}) b->setAutoDefault(false);
  sort_->setChecked(editor_.sorted());

  auto* field = new QLabel(QStringLiteral("Values of \"%1\"")
                               .arg(FromDb(session.db.schema().field[slot].name.str())),
                           this);
  field->setObjectName(QStringLiteral("fieldLabel"));
  connect(new_, &QPushButton::clicked, this, &PopupListDialog::OnNew);
  connect(rename_, &QPushButton::clicked, this, &PopupListDialog::OnRename);
  connect(delete_, &QPushButton::clicked, this, &PopupListDialog::OnDelete);
  connect(list_, &QListWidget::itemActivated, this, &PopupListDialog::OnRename);
  connect(list_, &QListWidget::currentRowChanged, this, &PopupListDialog::ShowButtons);
  connect(sort_, &QCheckBox::toggled, this, [this](bool on) {
    const int entry = editor_.EntryAt(list_->currentRow());
    editor_.SetSorted(on);
    Refill(entry);
  });

  auto* side = new QVBoxLayout;
  side->addWidget(new_);
  side->addWidget(rename_);
  side->addWidget(delete_);
  side->addSpacing(12);
  side->addWidget(sort_);
  side->addStretch(1);
  auto* row = new QHBoxLayout;
  row->addWidget(list_, 1);
  row->addLayout(side);
  auto* buttons = new QDialogButtonBox(
      QDialogButtonBox::Ok | QDialogButtonBox::Cancel | QDialogButtonBox::Help, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  ConnectHelp(this, buttons, QStringLiteral("Edit_Popup_List"));
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(field);
  layout->addLayout(row);
  layout->addWidget(buttons);
  resize(380, 400);
  Refill(-1);
}

void PopupListDialog::Refill(int selectEntry) {
  const QSignalBlocker block(list_);
  list_->clear();
  for (const std::string& text : editor_.ListTexts()) list_->addItem(FromDb(text));
  list_->setCurrentRow(editor_.PositionOf(selectEntry));
  ShowButtons();
}

void PopupListDialog::ShowButtons() {
  const bool selected = list_->currentRow() >= 0;
  rename_->setEnabled(selected);
  delete_->setEnabled(selected);
}

void PopupListDialog::OnNew() {
  if (editor_.entries().size() >= static_cast<size_t>(format::kMaxPopupItems)) {
    editor_.New(std::string());  // refused, with its message
    return;
  }
  EditPopupDialog prompt(session_.ui, QString(), this);
  if (prompt.exec() != QDialog::Accepted) return;
  if (editor_.New(prompt.value())) {
    Refill(static_cast<int>(editor_.entries().size()) - 1);
  }
}

void PopupListDialog::OnRename() {
  const int position = list_->currentRow();
  const int entry = editor_.EntryAt(position);
  if (entry < 0) return;
  EditPopupDialog prompt(session_.ui, FromDb(editor_.entries()[static_cast<size_t>(entry)]), this);
  if (prompt.exec() != QDialog::Accepted) return;
  if (editor_.Rename(position, prompt.value())) Refill(entry);
}

void PopupListDialog::OnDelete() {
  const int position = list_->currentRow();
  if (editor_.EntryAt(position) < 0) return;
  const bool popUp = session_.db.schema().field[slot_].type() == FieldType::PopUp;
  if (!editor_.Delete(position)) return;
  if (popUp) {
    // The records were renumbered already; that stands even after Cancel.
    recordsChanged_ = true;
    session_.db.MarkChanged();
  }
  const int count = static_cast<int>(editor_.entries().size());
  Refill(-1);
  list_->setCurrentRow(std::min(position, count - 1));
}

void PopupListDialog::accept() {
  editor_.Commit();
  QDialog::accept();
}

}  // namespace cx::gui
