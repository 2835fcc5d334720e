#include "gui/design/field_editor_dialog.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLineEdit>
#include <QPushButton>
#include <QSignalBlocker>
#include <QToolButton>
#include <QVBoxLayout>
#include <filesystem>

#include "design/field_controls.h"
#include "design/security.h"
#include "gui/common/text.h"
#include "gui/design/design_widgets.h"
#include "gui/design/popup_list_dialog.h"

namespace cx::gui {
namespace {

constexpr int kNameChars = 19;
constexpr int kOtherDatabaseChars = 19;
constexpr int kConstantChars = 8;
constexpr const char* kOpenTitle = "Cardovex";
constexpr const char* kOpenFilter = "Cardovex Files (*.pdb)|*.pdb|All Files (*.*)|*.*||";

QString Label(std::string_view text) {
  return QString::fromLatin1(text.data(), static_cast<qsizetype>(text.size()));
}

template <typename List>
QComboBox* MakeList(QWidget* parent, const char* name, const List& entries) {
  auto* box = new QComboBox(parent);
  box->setObjectName(QString::fromLatin1(name));
  for (const auto& e : entries) box->addItem(Label(e));
  return box;
}

QLineEdit* MakeEdit(QWidget* parent, const char* name) {
  auto* edit = new QLineEdit(parent);
  edit->setObjectName(QString::fromLatin1(name));
  return edit;
}

void FillFieldChoices(QComboBox* box, const Schema& schema) {
  for (const std::string& entry : FieldChoiceList(schema)) box->addItem(FromDb(entry));
}

// A row of several controls that hide one by one.
QWidget* Row(QWidget* parent, std::initializer_list<QWidget*> widgets, bool stretch = true) {
  auto* row = new QWidget(parent);
  auto* box = new QHBoxLayout(row);
  box->setContentsMargins(0, 0, 0, 0);
  for (QWidget* w : widgets) box->addWidget(w);
  if (stretch) box->addStretch(1);
  return row;
}

}  // namespace

FieldEditorDialog::FieldEditorDialog(DataSession& session, int slot, QWidget* parent)
    : QDialog(parent), session_(session), slot_(slot) {
  setObjectName(QStringLiteral("editFieldDialog"));
  setWindowTitle(QString::fromStdString(FieldEditorTitle(slot)));
  Build();
  const FieldSettings s = LoadFieldSettings(session.db, slot);
  lastType_ = s.type;
  Load(s);
  ShowControls();
}

void FieldEditorDialog::Build() {
  const Schema& schema = session_.db.schema();
  name_ = MakeEdit(this, "name");
  name_->setMaxLength(kNameChars);
  name_->setMinimumWidth(240);
  type_ = new QComboBox(this);
  type_->setObjectName(QStringLiteral("type"));
  for (int t = 0; t < kFieldTypeCount; ++t) type_->addItem(Label(FieldTypeLabel(TypeFromNumber(t))));
  type_->setMaxVisibleItems(kFieldTypeCount);
  maxChars_ = MakeEdit(this, "maxCharacters");
  MakeDigitEdit(maxChars_, 3);
  places_ = MakeList(this, "places", kDecimalPlaces);
  pixels_ = MakeEdit(this, "pixelsShown");
  MakeDigitEdit(pixels_, 3);
  for (QLineEdit* e : {maxChars_, pixels_}) e->setMaximumWidth(60);
  visible_ = new QCheckBox(QStringLiteral("Visible"), this);
  visible_->setObjectName(QStringLiteral("visible"));
  exportPrint_ = new QCheckBox(QStringLiteral("Export/Print"), this);
  exportPrint_->setObjectName(QStringLiteral("exportPrint"));
  popupsAppend_ = new QCheckBox(QStringLiteral("Popups Append"), this);
  popupsAppend_->setObjectName(QStringLiteral("popupsAppend"));
  editPopups_ = new QPushButton(QStringLiteral("Edit Popups"), this);
  editPopups_->setObjectName(QStringLiteral("editPopups"));
  editPopups_->setAutoDefault(false);
  defaultValue_ = new QComboBox(this);
  defaultValue_->setObjectName(QStringLiteral("defaultValue"));
  dateBehavior_ = MakeList(this, "dateBehavior", kDateBehaviors);
  timeBehavior_ = MakeList(this, "timeBehavior", kTimeBehaviors);
  otherDatabase_ = MakeEdit(this, "otherDatabase");
  otherDatabase_->setMaxLength(kOtherDatabaseChars);
  pickDatabase_ = new QToolButton(this);
  pickDatabase_->setObjectName(QStringLiteral("pickOtherDatabase"));
  pickDatabase_->setText(QStringLiteral("..."));
  pickDatabase_->setToolTip(QStringLiteral("Take the name from a database file"));
  otherField_ = MakeEdit(this, "otherField");
  MakeDigitEdit(otherField_, 3);
  otherField_->setMaximumWidth(60);
  group_ = MakeEdit(this, "group");
  group_->setMaximumWidth(60);
  showValueFrom_ = new QComboBox(this);
  showValueFrom_->setObjectName(QStringLiteral("showValueFrom"));
  value1_ = new QComboBox(this);
  value1_->setObjectName(QStringLiteral("value1"));
  value2_ = new QComboBox(this);
  value2_->setObjectName(QStringLiteral("value2"));
  for (QComboBox* box : {showValueFrom_, value1_, value2_}) FillFieldChoices(box, schema);
  constant1_ = MakeEdit(this, "constant1");
  constant2_ = MakeEdit(this, "constant2");
  for (QLineEdit* e : {constant1_, constant2_}) {
    e->setMaxLength(kConstantChars);
    e->setMaximumWidth(90);
    e->setPlaceholderText(QStringLiteral("constant"));
  }
  prev1_ = new QCheckBox(QStringLiteral("Prev Record"), this);
  prev1_->setObjectName(QStringLiteral("prevRecord1"));
  prev2_ = new QCheckBox(QStringLiteral("Prev Record"), this);
  prev2_->setObjectName(QStringLiteral("prevRecord2"));
  operation_ = MakeList(this, "operation", kCalcOperations);
  resultFormat_ = MakeList(this, "resultFormat", kResultFormats);

  checksRow_ = Row(this, {visible_, exportPrint_});
  popupsRow_ = Row(this, {editPopups_, popupsAppend_});
  otherDatabaseRow_ = Row(this, {otherDatabase_, pickDatabase_}, false);
  value1Row_ = Row(this, {value1_, constant1_, prev1_});
  value2Row_ = Row(this, {value2_, constant2_, prev2_});

  form_ = new QFormLayout;
  form_->setFieldGrowthPolicy(QFormLayout::ExpandingFieldsGrow);
  form_->addRow(QString::fromStdString(FieldNameLabel(slot_)) + QLatin1Char(':'), name_);
  form_->addRow(QStringLiteral("Field Type:"), type_);
  form_->addRow(QStringLiteral("Max Characters:"), maxChars_);
  form_->addRow(QStringLiteral("Places after decimal:"), places_);
  form_->addRow(QStringLiteral("Pixels Shown:"), pixels_);
  form_->addRow(QStringLiteral("Default Value:"), defaultValue_);
  form_->addRow(QStringLiteral("Behavior:"), dateBehavior_);
  form_->addRow(QStringLiteral("Behavior:"), timeBehavior_);
  form_->addRow(QStringLiteral("Other Database:"), otherDatabaseRow_);
  form_->addRow(QStringLiteral("Other Field #:"), otherField_);
  form_->addRow(QStringLiteral("Group (0=none):"), group_);
  form_->addRow(QStringLiteral("Show Value From:"), showValueFrom_);
  form_->addRow(QStringLiteral("Value 1:"), value1Row_);
  form_->addRow(QStringLiteral("Operation:"), operation_);
  form_->addRow(QStringLiteral("Value 2:"), value2Row_);
  form_->addRow(QStringLiteral("Result Format:"), resultFormat_);
  form_->addRow(QString(), checksRow_);
  form_->addRow(QString(), popupsRow_);

  auto* buttons = new QDialogButtonBox(
      QDialogButtonBox::Ok | QDialogButtonBox::Cancel | QDialogButtonBox::Help, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  ConnectHelp(this, buttons, QStringLiteral("Edit_Field"));
  auto* layout = new QVBoxLayout(this);
  layout->addLayout(form_);
  layout->addStretch(1);
  layout->addWidget(buttons);
  layout->setSizeConstraint(QLayout::SetFixedSize);

  connect(type_, &QComboBox::currentIndexChanged, this, &FieldEditorDialog::OnTypeChosen);
  connect(value1_, &QComboBox::currentIndexChanged, this, &FieldEditorDialog::ShowControls);
  connect(value2_, &QComboBox::currentIndexChanged, this, &FieldEditorDialog::ShowControls);
  connect(editPopups_, &QPushButton::clicked, this, &FieldEditorDialog::OnEditPopups);
  connect(pickDatabase_, &QToolButton::clicked, this, &FieldEditorDialog::OnPickOtherDatabase);
}

void FieldEditorDialog::Load(const FieldSettings& s) {
  const QSignalBlocker blockType(type_);
  const QSignalBlocker block1(value1_);
  const QSignalBlocker block2(value2_);
  name_->setText(FromDb(s.name));
  type_->setCurrentIndex(s.type);
  maxChars_->setText(QString::number(s.maxCharacters));
  places_->setCurrentIndex(s.places);
  pixels_->setText(QString::number(s.pixelsShown));
  visible_->setChecked(s.visible);
  exportPrint_->setChecked(s.exportPrint);
  popupsAppend_->setChecked(s.popupsAppend);
  RefillDefaultValues(s.defaultValue);
  // Date and Time share the behaviour byte; each list shows it when it can.
  for (QComboBox* list : {dateBehavior_, timeBehavior_}) {
    list->setCurrentIndex(s.behavior >= 0 && s.behavior < list->count() ? s.behavior : 0);
  }
  otherDatabase_->setText(FromDb(s.otherDatabase));
  otherField_->setText(QString::number(s.otherFieldNumber));
  group_->setText(QString::number(s.group));
  showValueFrom_->setCurrentIndex(s.showValueFrom);
  value1_->setCurrentIndex(s.value1);
  value2_->setCurrentIndex(s.value2);
  constant1_->setText(FromDb(s.constant1));
  constant2_->setText(FromDb(s.constant2));
  prev1_->setChecked(s.prevRecord1);
  prev2_->setChecked(s.prevRecord2);
  operation_->setCurrentIndex(s.operation);
  resultFormat_->setCurrentIndex(s.resultFormat);
}

void FieldEditorDialog::RefillDefaultValues(int select) {
  const QSignalBlocker block(defaultValue_);
  defaultValue_->clear();
  for (const std::string& entry : DefaultValueList(session_.db, slot_)) {
    defaultValue_->addItem(FromDb(entry));
  }
  const int last = defaultValue_->count() - 1;
  defaultValue_->setCurrentIndex(select >= 0 && select <= last ? select : last);
}

void FieldEditorDialog::ShowControls() {
  const FieldType type = TypeFromNumber(type_->currentIndex());
  const FieldControls c = ControlsForType(type);
  form_->setRowVisible(pixels_, c.pixelsShown);
  form_->setRowVisible(maxChars_, c.maxCharacters);
  form_->setRowVisible(places_, c.placesAfterDecimal);
  form_->setRowVisible(defaultValue_, c.defaultValue);
  form_->setRowVisible(dateBehavior_, c.dateBehavior);
  form_->setRowVisible(timeBehavior_, c.timeBehavior);
  form_->setRowVisible(otherDatabaseRow_, c.otherDatabase);
  form_->setRowVisible(otherField_, c.otherDatabase);
  form_->setRowVisible(group_, c.group);
  form_->setRowVisible(showValueFrom_, c.showValueFrom);
  form_->setRowVisible(value1Row_, c.calc);
  form_->setRowVisible(operation_, c.calc);
  form_->setRowVisible(value2Row_, c.calc);
  form_->setRowVisible(resultFormat_, c.calc);
  const OperandControls op1 = ControlsForOperand(value1_->currentIndex());
  const OperandControls op2 = ControlsForOperand(value2_->currentIndex());
  constant1_->setVisible(op1.constant);
  prev1_->setVisible(op1.prevRecord);
  constant2_->setVisible(op2.constant);
  prev2_->setVisible(op2.prevRecord);
  visible_->setVisible(c.visible);
  exportPrint_->setVisible(c.exportPrint);
  form_->setRowVisible(checksRow_, c.visible || c.exportPrint);
  editPopups_->setVisible(c.editPopups);
  popupsAppend_->setVisible(c.popupsAppend);
  form_->setRowVisible(popupsRow_, c.editPopups || c.popupsAppend);
}

void FieldEditorDialog::OnTypeChosen(int type) {
  FieldSettings s = Collect();
  s.type = type;
  ChooseFieldType(s, lastType_, session_.db, slot_);
  lastType_ = type;
  popupsAppend_->setChecked(s.popupsAppend);
  if (s.defaultValue != defaultValue_->currentIndex()) RefillDefaultValues(s.defaultValue);
  ShowControls();
}

void FieldEditorDialog::OnEditPopups() {
  if (!Allowed(CheckAccess(session_.db, secured::kEditPopups, session_.ui))) return;
  const bool wasNoValue = defaultValue_->currentIndex() == defaultValue_->count() - 1;
  const int selected = defaultValue_->currentIndex();
  PopupListDialog popups(session_, slot_, this);
  popups.exec();
  recordsChanged_ = recordsChanged_ || popups.recordsChanged();
  RefillDefaultValues(wasNoValue ? -1 : selected);
}

void FieldEditorDialog::OnPickOtherDatabase() {
  FileDialogRequest request;
  request.title = kOpenTitle;
  request.filter = kOpenFilter;
  // Linked databases usually sit beside this one.
  const std::string& own = session_.db.path();
  if (own.find('*') == std::string::npos) {
    request.folder = std::filesystem::path(own).parent_path().string();
  }
  auto path = session_.ui.ChooseOpenFile(request);
  if (!path) return;
  FieldSettings s;
  if (PickOtherDatabase(*path, s)) otherDatabase_->setText(FromDb(s.otherDatabase));
}

FieldSettings FieldEditorDialog::Collect() const {
  FieldSettings s;
  auto text = [](const QLineEdit* edit) { return ToDb(edit->text()).value_or(std::string()); };
  s.name = text(name_);
  s.type = type_->currentIndex();
  s.maxCharacters = ReadNumberEdit(text(maxChars_));
  s.places = places_->currentIndex();
  s.pixelsShown = ReadNumberEdit(text(pixels_));
  s.visible = visible_->isChecked();
  s.exportPrint = exportPrint_->isChecked();
  s.popupsAppend = popupsAppend_->isChecked();
  s.defaultValue = defaultValue_->currentIndex();
  s.behavior = TypeFromNumber(s.type) == FieldType::Time ? timeBehavior_->currentIndex()
                                                          : dateBehavior_->currentIndex();
  s.otherDatabase = text(otherDatabase_);
  s.otherFieldNumber = ReadNumberEdit(text(otherField_));
  s.group = ReadNumberEdit(text(group_));
  s.showValueFrom = showValueFrom_->currentIndex();
  s.value1 = value1_->currentIndex();
  s.value2 = value2_->currentIndex();
  s.constant1 = text(constant1_);
  s.constant2 = text(constant2_);
  s.prevRecord1 = prev1_->isChecked();
  s.prevRecord2 = prev2_->isChecked();
  s.operation = operation_->currentIndex();
  s.resultFormat = resultFormat_->currentIndex();
  return s;
}

void FieldEditorDialog::accept() {
  FieldSettings s = Collect();
  auto name = StorableText(this, name_->text(), QStringLiteral("Field Name"), kNameChars);
  if (!name) return;
  s.name = *name;
  const FieldControls c = ControlsForType(TypeFromNumber(s.type));
  if (c.otherDatabase) {
    auto other = StorableText(this, otherDatabase_->text(), QStringLiteral("Other Database"),
                              kOtherDatabaseChars);
    if (!other) return;
    s.otherDatabase = *other;
  }
  if (c.calc) {
    auto one = StorableText(this, constant1_->text(), QStringLiteral("Value 1"), kConstantChars);
    if (!one) return;
    auto two = StorableText(this, constant2_->text(), QStringLiteral("Value 2"), kConstantChars);
    if (!two) return;
    s.constant1 = *one;
    s.constant2 = *two;
  }

  // The questions go to the user as they are; only the rewrite itself gets
  // the wait cursor (and a progress window on large databases).
  BusyFeedbackPort port(session_.ui, this, session_.db.recordCount(), progressFrom_);
  DataSession work(session_.db, session_.locale, port, session_.link);
  work.view = std::move(session_.view);
  work.found = session_.found;
  work.calc = session_.calc;
  outcome_ = ApplyFieldSettings(work, slot_, s);
  session_.view = std::move(work.view);
  session_.found = work.found;
  session_.calc = work.calc;
  showedProgress_ = port.showedProgress();
  recordsChanged_ = recordsChanged_ || outcome_.converted;
  QDialog::accept();
}

}  // namespace cx::gui
