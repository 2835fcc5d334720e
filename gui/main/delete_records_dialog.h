// "Delete Records": which records go (within the filter range, outside it,
// or all).
#pragma once

#include <QDialog>

#include "ops/delete_records.h"

class QRadioButton;

namespace cx::gui {

class DeleteRecordsDialog : public QDialog {
  Q_OBJECT

 public:
  explicit DeleteRecordsDialog(QWidget* parent = nullptr);
  DeleteScope scope() const;

 private:
  QRadioButton* within_;
  QRadioButton* outside_;
  QRadioButton* all_;
};

}  // namespace cx::gui
