#include "gui/main/preferences_dialog.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QLabel>
#include <QVBoxLayout>

#include "gui/common/help.h"

namespace cx::gui {

PreferencesDialog::PreferencesDialog(const PreferenceFlags& flags, QWidget* parent)
    : QDialog(parent), initial_(flags) {
  setObjectName(QStringLiteral("preferencesDialog"));
  setWindowTitle(QStringLiteral("Preferences"));
  InstallHelpShortcut(this, QStringLiteral("Preferences_Dialog"));

  auto* layout = new QVBoxLayout(this);
  const auto& items = PreferenceItems();
  for (const PreferenceItem& item : items) {
    auto* box = new QCheckBox(QString::fromLatin1(item.label), this);
    box->setObjectName(QString::fromLatin1(item.valueName));
    box->setChecked(flags.*(item.flag));
    layout->addWidget(box);
    boxes_.push_back(box);
  }
  // Timed saving was planned and never built: the controls exist, hidden,
  // bound to nothing; the only automatic save is the one on close.
  auto* timedLabel = new QLabel(QStringLiteral("Auto Save Database Changes:"), this);
  auto* timed = new QComboBox(this);
  timed->setObjectName(QStringLiteral("autoSaveInterval"));
  timed->addItems({QStringLiteral("Never"), QStringLiteral("After 1 minute"), QStringLiteral("After 5 minutes"),
                   QStringLiteral("After 30 minutes"), QStringLiteral("After 1 Hour"),
                   QStringLiteral("After 5 Hours")});
  timedLabel->hide();
  timed->hide();
  layout->addWidget(timedLabel);
  layout->addWidget(timed);

  layout->addSpacing(6);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  layout->addWidget(buttons);
  layout->setSizeConstraint(QLayout::SetFixedSize);
}

PreferenceFlags PreferencesDialog::flags() const {
  PreferenceFlags out = initial_;
  const auto& items = PreferenceItems();
  for (size_t i = 0; i < items.size() && i < boxes_.size(); ++i) out.*(items[i].flag) = boxes_[i]->isChecked();
  return out;
}

}  // namespace cx::gui
