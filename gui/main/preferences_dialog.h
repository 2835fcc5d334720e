// The Preferences dialog: the five flags as check boxes. It changes only
// the copy it is given; the caller keeps it on OK.
#pragma once

#include <QDialog>
#include <vector>

#include "app/preferences.h"

class QCheckBox;

namespace cx::gui {

class PreferencesDialog : public QDialog {
  Q_OBJECT

 public:
  PreferencesDialog(const PreferenceFlags& flags, QWidget* parent = nullptr);
  PreferenceFlags flags() const;

 private:
  PreferenceFlags initial_;
  std::vector<QCheckBox*> boxes_;
};

}  // namespace cx::gui
