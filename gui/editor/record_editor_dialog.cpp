#include "gui/editor/record_editor_dialog.h"

#include <QApplication>
#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QGridLayout>
#include <QKeyEvent>
#include <QLabel>
#include <QLineEdit>
#include <QMenuBar>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QRegularExpressionValidator>
#include <QScrollArea>
#include <QScrollBar>
#include <QShortcut>
#include <QToolButton>
#include <QVBoxLayout>
#include <memory>

#include "app/pickers.h"
#include "design/security.h"
#include "engine/value_text.h"
#include "gui/common/help.h"
#include "gui/common/qt_ui_port.h"
#include "gui/common/text.h"
#include "gui/design/design_commands.h"
#include "gui/data/data_commands.h"
#include "gui/editor/image_editor_dialog.h"
#include "gui/editor/picker_dialogs.h"
#include "ops/linked_listing.h"
#include "ops/links.h"
#include "ops/listing.h"
#include "platform/qt/qt_platform.h"

namespace cx::gui {
namespace {

constexpr int kMinimumValueWidth = 60;

// Edit boxes hold Unicode with "\n" line ends; the record holds 8-bit text
// with CR LF.
QString ForEditBox(const std::string& stored) {
  QString text = FromDb(stored);
  text.replace(QStringLiteral("\r\n"), QStringLiteral("\n"));
  text.replace(QLatin1Char('\r'), QLatin1Char('\n'));
  return text;
}

std::optional<std::string> FromEditBox(const QString& text, bool multiLine) {
  QString t = text;
  if (multiLine) {
    t.replace(QStringLiteral("\n"), QStringLiteral("\r\n"));
  } else {
    t.replace(QLatin1Char('\n'), QLatin1Char(' '));
  }
  return ToDb(t);
}

QString FieldName(const FieldDef& f) { return FromDb(f.name.str()); }

// A box that only shows its value looks like one: the window's colour
// behind the text instead of the colour of a box to type in.
void LookReadOnly(QWidget* box) {
  QPalette p = box->palette();
  p.setColor(QPalette::Base, p.color(QPalette::Window));
  box->setPalette(p);
}

}  // namespace

RecordEditorDialog::RecordEditorDialog(Document& doc, size_t record, bool viewOnly,
                                       RecordHistory* history, QWidget* parent,
                                       std::optional<size_t> copyFrom)
    : QDialog(parent), doc_(doc), history_(history), viewOnly_(viewOnly) {
  setObjectName(QStringLiteral("recordEditor"));
  auto* layout = new QVBoxLayout(this);
  BuildMenus();
  scroll_ = new QScrollArea(this);
  scroll_->setObjectName(QStringLiteral("recordScroll"));
  scroll_->setWidgetResizable(true);
  scroll_->setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
  // The label column is a share of the width the rows really get.
  scroll_->viewport()->installEventFilter(this);
  layout->addWidget(scroll_, 1);

  auto* buttons = new QDialogButtonBox(this);
  buttons->setObjectName(QStringLiteral("editorButtons"));
  if (viewOnly_) {
    buttons->addButton(QDialogButtonBox::Close);
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  } else {
    QPushButton* ok = buttons->addButton(QDialogButtonBox::Ok);
    ok->setToolTip(QStringLiteral("Save the record (Ctrl+Enter)"));
    buttons->addButton(QDialogButtonBox::Cancel);
    connect(buttons, &QDialogButtonBox::accepted, this, [this] {
      if (Apply()) {
        exit_ = Exit::Saved;
        accept();
      }
    });
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  }
  for (QAbstractButton* b : buttons->buttons()) {
    if (auto* p = qobject_cast<QPushButton*>(b)) p->setAutoDefault(false);
  }
  layout->addWidget(buttons);

  auto* previous = new QShortcut(QKeySequence(Qt::Key_PageUp), this);
  connect(previous, &QShortcut::activated, this, [this] { Step(-1); });
  auto* next = new QShortcut(QKeySequence(Qt::Key_PageDown), this);
  connect(next, &QShortcut::activated, this, [this] { Step(+1); });
  InstallHelpShortcut(this, QStringLiteral("Edit_Record"));

  Load(record, copyFrom);
  // Tall enough for the form, within reason; the form scrolls beyond.
  resize(560, std::clamp(rows_->sizeHint().height() + 110, 260, 640));
}

RecordEditorDialog::~RecordEditorDialog() = default;

QWidget* RecordEditorDialog::ControlFor(int field) const {
  auto it = controls_.find(field);
  return it == controls_.end() ? nullptr : it->second;
}

QAction* RecordEditorDialog::action(const QString& text) const {
  auto it = actions_.find(text);
  return it == actions_.end() ? nullptr : it->second;
}

void RecordEditorDialog::BuildMenus() {
  auto* bar = new QMenuBar(this);
  bar->setObjectName(QStringLiteral("editorMenuBar"));
  layout()->setMenuBar(bar);
  auto add = [&](QMenu* menu, const QString& text, const QKeySequence& key, auto&& slot) {
    QAction* a = menu->addAction(text);
    a->setShortcut(key);
    connect(a, &QAction::triggered, this, slot);
    actions_[text] = a;
    return a;
  };
  QMenu* record = bar->addMenu(QStringLiteral("&Record"));
  add(record, QStringLiteral("New Record"), QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_N), [this] { NewRecord(); });
  add(record, QStringLiteral("Copy Record To New"), QKeySequence(), [this] { CopyToNew(); });
  record->addSeparator();
  add(record, QStringLiteral("Move Record To..."), QKeySequence(), [this] { Transfer(true); });
  add(record, QStringLiteral("Copy Record To..."), QKeySequence(), [this] { Transfer(false); });
  add(record, QStringLiteral("Export Record..."), QKeySequence(), [this] { ExportRecord(); });
  add(record, QStringLiteral("Print Record..."), QKeySequence::Print, [this] { PrintRecord(); });
  add(record, QStringLiteral("Beam Record..."), QKeySequence(), [this] { BeamRecord(); });
  record->addSeparator();
  add(record, QStringLiteral("Delete Record"), QKeySequence(), [this] { DeleteRecord(); });
  record->addSeparator();
  add(record, QStringLiteral("Increase Field Width"), QKeySequence(Qt::CTRL | Qt::Key_Plus),
      [this] { ChangeFieldWidth(true); });
  add(record, QStringLiteral("Decrease Field Width"), QKeySequence(Qt::CTRL | Qt::Key_Minus),
      [this] { ChangeFieldWidth(false); });
  for (const char* changing : {"Move Record To...", "Delete Record"}) {
    actions_[QString::fromLatin1(changing)]->setEnabled(!viewOnly_);
  }

  // The edit commands work on the focused box; their shortcuts are the
  // boxes' own, so the menu shows them without taking the keys.
  QMenu* edit = bar->addMenu(QStringLiteral("&Edit"));
  const std::pair<const char*, const char*> editCommands[] = {
      {"Undo", "undo"}, {"Cut", "cut"}, {"Copy", "copy"}, {"Paste", "paste"}, {"Select All", "selectAll"}};
  for (auto [text, method] : editCommands) {
    QAction* a = edit->addAction(QString::fromLatin1(text));
    const char* m = method;
    connect(a, &QAction::triggered, this, [this, m] { EditCommand(m); });
    actions_[QString::fromLatin1(text)] = a;
  }
}

void RecordEditorDialog::EditCommand(const char* method) {
  QWidget* focus = QApplication::focusWidget();
  if (qobject_cast<QLineEdit*>(focus) || qobject_cast<QPlainTextEdit*>(focus)) {
    QMetaObject::invokeMethod(focus, method);
  }
}

void RecordEditorDialog::Load(size_t record, std::optional<size_t> copyFrom) {
  form_ = std::make_unique<RecordForm>(doc_.session(), record, doc_.context().clock, copyFrom);
  const bool isNew = form_->isNew();
  for (const char* onExisting : {"Copy Record To New", "Move Record To...", "Copy Record To...",
                                 "Export Record...", "Print Record...", "Beam Record..."}) {
    actions_[QString::fromLatin1(onExisting)]->setEnabled(!isNew);
  }
  actions_[QStringLiteral("Move Record To...")]->setEnabled(!isNew && !viewOnly_);
  UpdateTitle();
  BuildRows();
}

void RecordEditorDialog::UpdateTitle() {
  QString title = form_->isNew() ? QStringLiteral("Edit Record (new)") : QStringLiteral("Edit Record");
  title += QStringLiteral(" - ") + FromDb(doc_.name());
  if (viewOnly_) title += QStringLiteral(" (view only)");
  setWindowTitle(title);
}

void RecordEditorDialog::BuildRows() {
  const int scrollTo = scroll_->verticalScrollBar()->value();
  controls_.clear();
  labels_.clear();
  rows_ = new QWidget;
  rows_->setObjectName(QStringLiteral("recordRows"));
  grid_ = new QGridLayout(rows_);
  grid_->setColumnStretch(1, 1);
  grid_->setVerticalSpacing(4);
  int row = 0;
  for (int field : form_->fields()) AddRow(field, row++);
  grid_->setRowStretch(row, 1);
  if (form_->fields().empty()) {
    auto* none = new QLabel(QStringLiteral("This database has no fields to show."), rows_);
    none->setObjectName(QStringLiteral("noFieldsLabel"));
    none->setEnabled(false);
    grid_->addWidget(none, 0, 0, 1, 2, Qt::AlignCenter);
  }
  scroll_->setWidget(rows_);  // deletes the previous rows
  UpdateLabelWidths();
  scroll_->verticalScrollBar()->setValue(scrollTo);

  // Tab order runs down the form.
  QWidget* previous = nullptr;
  for (int field : form_->fields()) {
    QWidget* w = ControlFor(field);
    if (!w || w->focusPolicy() == Qt::NoFocus) continue;
    if (previous) setTabOrder(previous, w);
    previous = w;
  }
  for (int field : form_->fields()) {
    QWidget* w = ControlFor(field);
    if (w && w->focusPolicy() != Qt::NoFocus && w->isEnabled()) {
      w->setFocus();
      break;
    }
  }
}

void RecordEditorDialog::AddRow(int field, int row) {
  const FieldDef& def = form_->schema().field[field];
  const FieldType type = def.type();
  QWidget* label = nullptr;
  QWidget* control = nullptr;
  const QString slot = QString::number(field);

  switch (type) {
    case FieldType::Heading: {
      auto* heading = new QLabel(FieldName(def), rows_);
      heading->setAlignment(Qt::AlignCenter);
      QFont f = heading->font();
      f.setBold(true);
      heading->setFont(f);
      heading->setObjectName(QStringLiteral("heading_") + slot);
      grid_->addWidget(heading, row, 0, 1, 2);
      controls_[field] = heading;
      return;
    }
    case FieldType::Link:
    case FieldType::Linked:
      label = MakeLinkButton(field);
      break;
    default: {
      auto* text = new QLabel(FieldName(def), rows_);
      text->setObjectName(QStringLiteral("label_") + slot);
      text->setTextFormat(Qt::PlainText);
      label = text;
      break;
    }
  }

  switch (type) {
    case FieldType::Text:
    case FieldType::DBPopup:
      control = MakeTextBox(field, 40);
      break;
    case FieldType::Note:
      control = MakeTextBox(field, 100);
      break;
    case FieldType::Integer:
    case FieldType::Float:
      control = MakeNumberBox(field);
      break;
    case FieldType::PopUp:
      control = MakePopupBox(field);
      break;
    case FieldType::CheckBox: {
      auto* box = new QCheckBox(rows_);
      box->setChecked(form_->Byte(field) != 0);
      box->setEnabled(!viewOnly_);
      connect(box, &QCheckBox::clicked, this, [this, field](bool on) { form_->SetByte(field, on ? 1 : 0); });
      control = box;
      break;
    }
    case FieldType::Date:
      control = MakeDateButton(field);
      control->setMaximumWidth(220);
      break;
    case FieldType::Time:
      control = MakeTimeButton(field);
      control->setMaximumWidth(220);
      break;
    case FieldType::Image:
      control = MakeImageButton(field);
      break;
    case FieldType::Unique:
    case FieldType::Link:
    case FieldType::Calculated: {
      auto* value = new QLabel(FromDb(form_->DisplayText(field)), rows_);
      value->setTextInteractionFlags(Qt::TextSelectableByMouse);
      control = value;
      break;
    }
    case FieldType::Linked: {
      const std::string text = form_->Text(field);
      auto* value = new QLabel(text.empty() ? QString::number(form_->Number(field)) : FromDb(text), rows_);
      value->setTextInteractionFlags(Qt::TextSelectableByMouse);
      control = value;
      break;
    }
    case FieldType::NotUsed:
    case FieldType::Heading:
      return;
  }
  control->setObjectName(QStringLiteral("field_") + slot);
  label->setToolTip(FromDb(std::string(FieldTypeLabel(type))));

  if (type == FieldType::DBPopup) {
    // The value comes from the other database: a button beside the label
    // leads there to choose it.
    auto* cell = new QWidget(rows_);
    auto* h = new QHBoxLayout(cell);
    h->setContentsMargins(0, 0, 0, 0);
    h->addWidget(label, 1);
    auto* choose = new QToolButton(cell);
    choose->setText(QStringLiteral("..."));
    choose->setObjectName(QStringLiteral("choose_") + slot);
    choose->setToolTip(QStringLiteral("Choose the value from the other database"));
    choose->setEnabled(!viewOnly_);
    connect(choose, &QToolButton::clicked, this, [this, field] { FollowLink(field); });
    h->addWidget(choose);
    label = cell;
  }
  const bool tall = type == FieldType::Text || type == FieldType::Note || type == FieldType::DBPopup;
  grid_->addWidget(label, row, 0, tall ? Qt::AlignTop : Qt::AlignVCenter);
  grid_->addWidget(control, row, 1, control->maximumWidth() < QWIDGETSIZE_MAX ? Qt::AlignLeft : Qt::Alignment());
  labels_.push_back(label);
  controls_[field] = control;
}

QWidget* RecordEditorDialog::MakeTextBox(int field, int height) {
  auto* box = new QPlainTextEdit(rows_);
  box->setPlainText(ForEditBox(form_->Text(field)));
  box->setFixedHeight(height + box->frameWidth() * 2 + 8);
  box->setTabChangesFocus(true);
  box->setReadOnly(viewOnly_);
  if (viewOnly_) LookReadOnly(box);
  box->installEventFilter(this);
  auto lastGood = std::make_shared<QString>(box->toPlainText());
  connect(box, &QPlainTextEdit::textChanged, this, [this, box, field, lastGood] {
    const QString now = box->toPlainText();
    if (now == *lastGood) return;
    std::optional<std::string> bytes = FromEditBox(now, true);
    if (!bytes || static_cast<int>(bytes->size()) > form_->TextRoom(field)) {
      // Characters the file cannot hold, or more than the field's room:
      // the box keeps what it had.
      const QSignalBlocker block(box);
      const int cursor = box->textCursor().position();
      box->setPlainText(*lastGood);
      QTextCursor c = box->textCursor();
      c.setPosition(std::min(cursor, static_cast<int>(lastGood->size())));
      box->setTextCursor(c);
      QApplication::beep();
      return;
    }
    *lastGood = now;
    form_->SetText(field, *bytes);
  });
  return box;
}

QWidget* RecordEditorDialog::MakeNumberBox(int field) {
  auto* box = new QLineEdit(FromDb(form_->Text(field)), rows_);
  box->setMaxLength(14);
  const bool isFloat = form_->TypeOf(field) == FieldType::Float;
  const QString pattern = isFloat ? QStringLiteral("[+-]?[0-9]*([.,][0-9]*)?") : QStringLiteral("[+-]?[0-9]*");
  box->setValidator(new QRegularExpressionValidator(QRegularExpression(pattern), box));
  box->setReadOnly(viewOnly_);
  if (viewOnly_) LookReadOnly(box);
  connect(box, &QLineEdit::textEdited, this, [this, field](const QString& text) {
    form_->SetText(field, text.toStdString());
  });
  // Enter moves on down the form, as in a paper form.
  connect(box, &QLineEdit::returnPressed, this, [this] { focusNextChild(); });
  return box;
}

QWidget* RecordEditorDialog::MakePopupBox(int field) {
  auto* combo = new QComboBox(rows_);
  const Database& db = doc_.db();
  for (const PopupMenuEntry& e : PopupMenuEntries(db, field, true, !viewOnly_)) {
    const int index = PopupResultForEntry(db, field, {e}, e.id);
    if (index == kPopupEditList) {
      combo->insertSeparator(combo->count());
      combo->addItem(FromDb(e.text) + "...", kPopupEditList);
      continue;
    }
    combo->addItem(FromDb(e.text), index == kPopupNoValue ? 255 : index);
  }
  const uint8_t stored = form_->Byte(field);
  int at = combo->findData(static_cast<int>(stored));
  if (at < 0) {
    // A byte no entry stands for (254 from an in-place "No Value", or an
    // entry since deleted): shown as what the list would show.
    combo->insertItem(0, FromDb(form_->DisplayText(field)), static_cast<int>(stored));
    at = 0;
  }
  combo->setCurrentIndex(at);
  combo->setEnabled(!viewOnly_);
  connect(combo, &QComboBox::activated, this, [this, combo, field](int i) {
    if (combo->itemData(i).toInt() == kPopupEditList) {
      combo->setCurrentIndex(combo->findData(static_cast<int>(form_->Byte(field))));
      // Queued: the combo must not be rebuilt under its own signal.
      QMetaObject::invokeMethod(this, [this, field] { EditPopups(field); }, Qt::QueuedConnection);
      return;
    }
    form_->SetByte(field, static_cast<uint8_t>(combo->itemData(i).toInt()));
  });
  return combo;
}

QWidget* RecordEditorDialog::MakeDateButton(int field) {
  auto* button = new QPushButton(rows_);
  auto show = [this, button, field] {
    button->setText(FromDb(DateText(form_->Number(field), doc_.session().locale)));
  };
  show();
  button->setEnabled(!viewOnly_);
  connect(button, &QPushButton::clicked, this, [this, button, field, show] {
    const int choice = ExecDateMenu(this, button->mapToGlobal(QPoint(0, button->height())), true);
    const Clock& clock = doc_.context().clock;
    if (auto day = DayNumberForChoice(choice, form_->Number(field), clock, CalendarFor(this, clock))) {
      form_->SetNumber(field, *day);
      show();
    }
  });
  return button;
}

QWidget* RecordEditorDialog::MakeTimeButton(int field) {
  auto* button = new QPushButton(rows_);
  auto show = [this, button, field] {
    const TimeBytes t = form_->Time(field);
    button->setText(FromDb(TimeText(t.seconds, t.minutes, t.hours, doc_.session().locale)));
  };
  show();
  button->setEnabled(!viewOnly_);
  connect(button, &QPushButton::clicked, this, [this, field, show] {
    const Clock& clock = doc_.context().clock;
    form_->SetTime(field, TimeForChooser(form_->Time(field), clock, TimeChooserFor(this, clock)));
    show();
  });
  return button;
}

QWidget* RecordEditorDialog::MakeImageButton(int field) {
  auto* cell = new QWidget(rows_);
  auto* h = new QHBoxLayout(cell);
  h->setContentsMargins(0, 0, 0, 0);
  auto* button = new QPushButton(QStringLiteral("Edit Image"), cell);
  button->setObjectName(QStringLiteral("editImage_") + QString::number(field));
  button->setFixedWidth(std::max(80, button->sizeHint().width()));
  auto* state = new QLabel(cell);
  auto show = [this, state, field] {
    state->setText(form_->Image(field).empty() ? QStringLiteral("No picture") : QStringLiteral("Picture"));
  };
  show();
  h->addWidget(button);
  h->addWidget(state, 1);
  connect(button, &QPushButton::clicked, this, [this, field, show] {
    ImageEditorDialog dialog(form_->Image(field), viewOnly_, this);
    if (dialog.exec() == QDialog::Accepted && dialog.edited()) {
      form_->SetImage(field, dialog.result());
      show();
    }
  });
  cell->setFocusProxy(button);
  return cell;
}

QWidget* RecordEditorDialog::MakeLinkButton(int field) {
  const FieldDef& def = form_->schema().field[field];
  auto* button = new QPushButton(EscapeMnemonic(FieldName(def)), rows_);
  button->setObjectName(QStringLiteral("link_") + QString::number(field));
  button->setToolTip(def.type() == FieldType::Link ? QStringLiteral("Show the linked records")
                                                   : QStringLiteral("Go to the record this one is linked to"));
  connect(button, &QPushButton::clicked, this, [this, field] { FollowLink(field); });
  return button;
}

void RecordEditorDialog::UpdateLabelWidths() {
  const int width = scroll_->viewport()->width();
  FormLayout layout = LayoutForm(form_->schema(), width);
  const int label = std::clamp(layout.labelWidth, 0, std::max(0, width - kMinimumValueWidth - 3));
  grid_->setColumnMinimumWidth(0, label);
  for (QWidget* w : labels_) w->setFixedWidth(std::max(label - grid_->horizontalSpacing(), 0));
}

void RecordEditorDialog::resizeEvent(QResizeEvent* event) {
  QDialog::resizeEvent(event);
  if (grid_) UpdateLabelWidths();
}

void RecordEditorDialog::keyPressEvent(QKeyEvent* event) {
  const bool enter = event->key() == Qt::Key_Return || event->key() == Qt::Key_Enter;
  if (enter && (event->modifiers() & Qt::ControlModifier)) {
    if (viewOnly_) {
      reject();
    } else if (Apply()) {
      exit_ = Exit::Saved;
      accept();
    }
    return;
  }
  if (enter) {
    focusNextChild();
    return;
  }
  QDialog::keyPressEvent(event);
}

bool RecordEditorDialog::eventFilter(QObject* watched, QEvent* event) {
  if (event->type() == QEvent::Resize && scroll_ && watched == scroll_->viewport()) {
    if (grid_) UpdateLabelWidths();
    return false;
  }
  // A text box would page through its own text: in this form the page
  // keys go from record to record.
  if (event->type() == QEvent::KeyPress) {
    auto* key = static_cast<QKeyEvent*>(event);
    if (key->modifiers() == Qt::NoModifier && (key->key() == Qt::Key_PageUp || key->key() == Qt::Key_PageDown)) {
      Step(key->key() == Qt::Key_PageUp ? -1 : +1);
      return true;
    }
  }
  return QDialog::eventFilter(watched, event);
}

void RecordEditorDialog::EditPopups(int field) {
  // A Delete in the list renumbers stored records: what was typed is stored
  // first (as following a link does), and the form reloads afterwards.
  if (viewOnly_) return;
  // An untouched new form is no record yet: nothing to store.
  const bool blank = form_->isNew() && !form_->AnyModified();
  if (!blank && !Apply()) return;
  if (!EditPopupList(this, doc_, field)) return;
  doc_.ViewChangedExternally(false);
  Load(form_->index(), std::nullopt);
}

bool RecordEditorDialog::Apply() {
  if (viewOnly_) return false;
  AppendTypedToPopups(*form_);
  StoreOutcome out = CommitForm(*form_, history_);
  if (!out.ok) return false;
  doc_.SetCurrentRecord(out.index);
  if (out.stored) doc_.ViewChangedExternally(false);
  // The form goes on from the record as stored.
  form_ = std::make_unique<RecordForm>(doc_.session(), out.index, doc_.context().clock);
  return true;
}

bool RecordEditorDialog::Step(int delta) {
  if (!viewOnly_ && !Apply()) return false;
  if (form_->isNew()) return false;
  const int row = doc_.rowOf(form_->index());
  const int target = row + delta;
  if (row < 0 || target < 0 || target >= static_cast<int>(doc_.rowCount())) {
    QApplication::beep();
    if (!viewOnly_) Load(form_->index(), std::nullopt);
    return false;
  }
  doc_.SetCurrentRecord(doc_.recordAt(static_cast<size_t>(target)));
  Load(doc_.recordAt(static_cast<size_t>(target)), std::nullopt);
  return true;
}

void RecordEditorDialog::FollowLink(int field) {
  if (!viewOnly_ && !Apply()) return;
  exit_ = Exit::FollowLink;
  linkField_ = field;
  accept();
}

void RecordEditorDialog::NewRecord() {
  if (!Allowed(CheckAccess(doc_.db(), secured::kAddRecords, doc_.session().ui))) return;
  if (!viewOnly_ && !Apply()) return;
  Load(kNewRecordIndex, std::nullopt);
}

void RecordEditorDialog::CopyToNew() {
  if (form_->isNew()) return;
  if (!Allowed(CheckAccess(doc_.db(), secured::kAddRecords, doc_.session().ui))) return;
  if (!viewOnly_ && !Apply()) return;
  Load(kNewRecordIndex, form_->index());
}

void RecordEditorDialog::Transfer(bool move) {
  if (form_->isNew() || (move && viewOnly_)) return;
  if (!viewOnly_ && !Apply()) return;
  LinkServices services = doc_.MakeLinkServices();
  TransferWhich which;
  which.allInView = false;
  which.index = form_->index();
  TransferResult result = TransferRecords(move, which, doc_.session(), services);
  if (!result.done) return;
  doc_.ViewChangedExternally(false);
  if (move && result.deleted > 0) {
    exit_ = Exit::Moved;
    accept();
  } else {
    Load(std::min(form_->index(), doc_.db().recordCount() - 1), std::nullopt);
  }
}

void RecordEditorDialog::ExportRecord() {
  if (form_->isNew()) return;
  if (!viewOnly_ && !Apply()) return;
  LinkServices services = doc_.MakeLinkServices();
  LinkedRecordsListing linked(services, doc_.session().locale);
  ListingContext ctx{doc_.session().locale, &linked};
  ExportRecordsText(doc_.db(), false, form_->index(), doc_.session().ui, ctx);
}

void RecordEditorDialog::PrintRecord() {
  if (form_->isNew()) return;
  if (!viewOnly_ && !Apply()) return;
  DataTarget target = TargetFor(doc_);
  target.current = form_->index();
  PrintCommand(this, target, false);
}

void RecordEditorDialog::BeamRecord() {
  if (form_->isNew()) return;
  if (!viewOnly_ && !Apply()) return;
  DataTarget target = TargetFor(doc_);
  target.current = form_->index();
  std::unique_ptr<Settings> own = settings_ ? nullptr : OpenDesktopSettings();
  BeamCommand(this, target, settings_ ? *settings_ : *own, obex::BeamWhat::kRecord);
}

void RecordEditorDialog::DeleteRecord() {
  if (viewOnly_) return;
  if (form_->isNew()) {
    // Nothing stored yet: deleting a new record is dropping it.
    reject();
    return;
  }
  LinkServices services = doc_.MakeLinkServices();
  LinkedRecordsDeleter linked(services);
  if (!DeleteRecordCommand(doc_.session(), form_->index(), &linked, history_)) return;
  doc_.ViewChangedExternally(false);
  exit_ = Exit::Deleted;
  accept();
}

void RecordEditorDialog::ChangeFieldWidth(bool increase) {
  const bool moved = increase ? IncreaseFieldWidth(doc_.db()) : DecreaseFieldWidth(doc_.db());
  if (!moved) {
    QApplication::beep();
    return;
  }
  doc_.MarkChanged();
  UpdateLabelWidths();
}

}  // namespace cx::gui
