// "Edit Field": one field slot's name, type and the settings that belong
// to its type. OK stores them, converting every record when the type
// change needs it, after the questions that change may ask.
#pragma once

#include <QDialog>

#include "design/field_editor.h"

class QCheckBox;
class QComboBox;
class QFormLayout;
class QLabel;
class QLineEdit;
class QPushButton;
class QToolButton;

namespace cx::gui {

class FieldEditorDialog : public QDialog {
  Q_OBJECT
 public:
  FieldEditorDialog(DataSession& session, int slot, QWidget* parent = nullptr);
  void accept() override;

  int slot() const { return slot_; }
  // What OK did; meaningful after the dialog was accepted. A No to the
  // data-loss question also closes the dialog with Accepted: the outcome
  // then says Declined.
  const FieldApplyOutcome& outcome() const { return outcome_; }
  // True when records were rewritten: by a conversion, or by a Delete in
  // the popup list editor (which stays whatever the outcome here).
  bool recordsChanged() const { return recordsChanged_; }
  // True when the progress window showed during the conversion.
  bool showedProgress() const { return showedProgress_; }
  // Records from which the conversion shows a progress window besides the
  // wait cursor.
  void setProgressThreshold(size_t records) { progressFrom_ = records; }

 private:
  void Build();
  void Load(const FieldSettings& s);
  void ShowControls();
  void OnTypeChosen(int type);
  void OnEditPopups();
  void OnPickOtherDatabase();
  void RefillDefaultValues(int select);
  // The settings the controls hold; texts that the code page cannot hold
  // read as empty here (accept() refuses them with a message).
  FieldSettings Collect() const;

  DataSession& session_;
  int slot_;
  int lastType_ = 0;
  FieldApplyOutcome outcome_;
  bool recordsChanged_ = false;
  bool showedProgress_ = false;
  size_t progressFrom_ = 5000;

  QFormLayout* form_ = nullptr;
  QLineEdit* name_ = nullptr;
  QComboBox* type_ = nullptr;
  QLineEdit* maxChars_ = nullptr;
  QComboBox* places_ = nullptr;
  QLineEdit* pixels_ = nullptr;
  QCheckBox* visible_ = nullptr;
  QCheckBox* exportPrint_ = nullptr;
  QCheckBox* popupsAppend_ = nullptr;
  QPushButton* editPopups_ = nullptr;
  QComboBox* defaultValue_ = nullptr;
  QComboBox* dateBehavior_ = nullptr;
  QComboBox* timeBehavior_ = nullptr;
  QLineEdit* otherDatabase_ = nullptr;
  QToolButton* pickDatabase_ = nullptr;
  QLineEdit* otherField_ = nullptr;
  QLineEdit* group_ = nullptr;
  QComboBox* showValueFrom_ = nullptr;
  QComboBox* value1_ = nullptr;
  QLineEdit* constant1_ = nullptr;
  QCheckBox* prev1_ = nullptr;
  QComboBox* operation_ = nullptr;
  QComboBox* value2_ = nullptr;
  QLineEdit* constant2_ = nullptr;
  QCheckBox* prev2_ = nullptr;
  QComboBox* resultFormat_ = nullptr;
  QWidget* checksRow_ = nullptr;
  QWidget* popupsRow_ = nullptr;
  QWidget* otherDatabaseRow_ = nullptr;
  QWidget* value1Row_ = nullptr;
  QWidget* value2Row_ = nullptr;
};

}  // namespace cx::gui
