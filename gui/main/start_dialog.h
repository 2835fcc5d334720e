// The start dialog, shown when no database is open: create a new database,
// or open one from the list ("More files..." first, then the databases used
// last).
#pragma once

#include <QDialog>
#include <string>
#include <vector>

class QListWidget;

namespace cx::gui {

class StartDialog : public QDialog {
  Q_OBJECT

 public:
  enum class Choice { None, New, Open };

  // `entries`: the list's lines as the recent-files list gives them (8-bit
  // names, "More files..." first).
  StartDialog(const std::vector<std::string>& entries, QWidget* parent = nullptr);

  Choice choice() const { return choice_; }
  // The chosen line of the list (for Open): 0 is "More files...".
  int listIndex() const { return listIndex_; }

 private:
  void Pick(int row);

  QListWidget* list_ = nullptr;
  Choice choice_ = Choice::None;
  int listIndex_ = -1;
};

}  // namespace cx::gui
