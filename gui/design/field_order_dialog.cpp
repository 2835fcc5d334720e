#include "gui/design/field_order_dialog.h"

#include <QDialogButtonBox>
#include <QGridLayout>
#include <QLabel>
#include <QListWidget>
#include <QShortcut>
#include <QToolButton>
#include <QVBoxLayout>

#include "gui/common/text.h"
#include "gui/design/design_widgets.h"

namespace cx::gui {

FieldOrderDialog::FieldOrderDialog(Database& db, QWidget* parent)
    : QDialog(parent), db_(db), editor_(db.schema()), list_(new QListWidget(this)),
      up_(new QToolButton(this)), down_(new QToolButton(this)) {
  setObjectName(QStringLiteral("fieldOrderDialog"));
  setWindowTitle(QStringLiteral("Edit Field Order"));
  list_->setObjectName(QStringLiteral("order"));
  list_->setSelectionMode(QAbstractItemView::SingleSelection);
  up_->setObjectName(QStringLiteral("moveUp"));
  down_->setObjectName(QStringLiteral("moveDown"));
  up_->setArrowType(Qt::UpArrow);
  down_->setArrowType(Qt::DownArrow);
  up_->setToolTip(QStringLiteral("Move the field up (Ctrl+Up)"));
  down_->setToolTip(QStringLiteral("Move the field down (Ctrl+Down)"));
  for (QToolButton* b : {up_, down_}) {
    b->setFixedSize(32, 32);
    // A hidden arrow keeps its place, so the other one does not jump.
    QSizePolicy p = b->sizePolicy();
    p.setRetainSizeWhenHidden(true);
    b->setSizePolicy(p);
  }
  connect(up_, &QToolButton::clicked, this, [this] { Move(true); });
  connect(down_, &QToolButton::clicked, this, [this] { Move(false); });
  connect(new QShortcut(QKeySequence(Qt::CTRL | Qt::Key_Up), this), &QShortcut::activated, this,
          [this] { Move(true); });
  connect(new QShortcut(QKeySequence(Qt::CTRL | Qt::Key_Down), this), &QShortcut::activated, this,
          [this] { Move(false); });
  connect(list_, &QListWidget::currentRowChanged, this, [this](int row) {
    editor_.Select(row);
    ShowArrows();
  });

  auto* grid = new QGridLayout;
  grid->addWidget(new QLabel(QStringLiteral("Current Field Order"), this), 0, 0);
  grid->addWidget(list_, 1, 0, 4, 1);
  grid->addWidget(up_, 2, 1);
  grid->addWidget(down_, 3, 1);
  grid->setRowStretch(1, 1);
  grid->setRowStretch(4, 1);
  auto* buttons = new QDialogButtonBox(
      QDialogButtonBox::Ok | QDialogButtonBox::Cancel | QDialogButtonBox::Help, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  ConnectHelp(this, buttons, QStringLiteral("Edit_Field_Order"));
  auto* layout = new QVBoxLayout(this);
  layout->addLayout(grid);
  layout->addWidget(buttons);
  resize(320, 460);
  Refill();
}

void FieldOrderDialog::Refill() {
  const QSignalBlocker block(list_);
  list_->clear();
  for (const std::string& name : editor_.ListTexts()) list_->addItem(FromDb(name));
  list_->setCurrentRow(editor_.selection());
  ShowArrows();
}

void FieldOrderDialog::ShowArrows() {
  up_->setVisible(editor_.CanMoveUp());
  down_->setVisible(editor_.CanMoveDown());
}

void FieldOrderDialog::Move(bool up) {
  if (!(up ? editor_.MoveUp() : editor_.MoveDown())) return;
  Refill();
  list_->scrollToItem(list_->currentItem());
}

void FieldOrderDialog::accept() {
  editor_.Commit(db_);
  QDialog::accept();
}

}  // namespace cx::gui
