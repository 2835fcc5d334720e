#include "gui/main/start_dialog.h"

#include <QDialogButtonBox>
#include <QFrame>
#include <QKeyEvent>
#include <QLabel>
#include <QListWidget>
#include <QPushButton>
#include <QVBoxLayout>

#include "gui/common/help.h"
#include "gui/common/icons.h"
#include "gui/common/text.h"

namespace cx::gui {

StartDialog::StartDialog(const std::vector<std::string>& entries, QWidget* parent) : QDialog(parent) {
  setObjectName(QStringLiteral("startDialog"));
  setWindowTitle(QStringLiteral("Cardovex"));
  InstallHelpShortcut(this, QStringLiteral("Start_Dialog"));

  auto* heading = new QLabel(QStringLiteral("Select an option"), this);
  QFont bold = heading->font();
  bold.setBold(true);
  bold.setPointSizeF(bold.pointSizeF() * 1.15);
  heading->setFont(bold);
  auto* line = new QFrame(this);
  line->setFrameShape(QFrame::HLine);
  line->setFrameShadow(QFrame::Sunken);

  auto* create = new QPushButton(NewRecordIcon(), QStringLiteral("Create a new database"), this);
  create->setObjectName(QStringLiteral("createButton"));
  create->setAutoDefault(false);
  connect(create, &QPushButton::clicked, this, [this] {
    choice_ = Choice::New;
    accept();
  });

  auto* orLabel = new QLabel(QStringLiteral("Or"), this);
  orLabel->setAlignment(Qt::AlignHCenter);
  auto* openLabel = new QLabel(QStringLiteral("Open an existing file"), this);

  list_ = new QListWidget(this);
  list_->setObjectName(QStringLiteral("recentList"));
  for (const std::string& entry : entries) list_->addItem(FromDb(entry));
  if (list_->count() > 0) list_->setCurrentRow(0);
  openLabel->setBuddy(list_);
  connect(list_, &QListWidget::itemActivated, this,
          [this](QListWidgetItem* item) { Pick(list_->row(item)); });

  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Open | QDialogButtonBox::Cancel, this);
  connect(buttons, &QDialogButtonBox::accepted, this, [this] { Pick(list_->currentRow()); });
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  buttons->button(QDialogButtonBox::Open)->setDefault(true);

  auto* layout = new QVBoxLayout(this);
  layout->addWidget(heading);
  layout->addWidget(line);
  layout->addSpacing(4);
  layout->addWidget(create);
  layout->addWidget(orLabel);
  layout->addWidget(openLabel);
  layout->addWidget(list_, 1);
  layout->addWidget(buttons);
  resize(360, 380);
}

void StartDialog::Pick(int row) {
  if (row < 0) return;
  choice_ = Choice::Open;
  listIndex_ = row;
  accept();
}

}  // namespace cx::gui
