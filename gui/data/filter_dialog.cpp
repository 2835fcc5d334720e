#include "gui/data/filter_dialog.h"

#include <QButtonGroup>
#include <QCheckBox>
#include <QComboBox>
#include <QDateEdit>
#include <QDialogButtonBox>
#include <QFormLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QMessageBox>
#include <QRadioButton>
#include <QStackedWidget>
#include <QTimeEdit>
#include <QVBoxLayout>

#include "gui/common/help.h"
#include "app/data_dialogs.h"
#include "engine/dates.h"
#include "engine/format.h"
#include "engine/popups.h"
#include "gui/common/text.h"

namespace cx::gui {
namespace {

// Pages of the per-type stack, in FilterControls order.
int PageOf(FilterControls c) { return static_cast<int>(c); }

QDate ToQDate(uint32_t day) {
  const CalendarDate d = DayNumberToDate(day == 0 ? 0 : day);
  return QDate(d.year, d.month, d.day);
}

// The engine counts every fourth year as a leap year; QDate arithmetic
// would not, so only the calendar fields cross over.
uint32_t ToDay(const QDate& date) { return DateToDayNumber({date.year(), date.month(), date.day()}); }

QDateEdit* DatePicker(QWidget* parent, const QString& name) {
  auto* e = new QDateEdit(parent);
  e->setObjectName(name);
  e->setCalendarPopup(true);
  e->setMinimumDate(QDate(1904, 1, 1));
  e->setMaximumDate(QDate(2079, 12, 31));
  return e;
}

QTimeEdit* TimePicker(QWidget* parent, const QString& name) {
  auto* e = new QTimeEdit(parent);
  e->setObjectName(name);
  e->setDisplayFormat("HH:mm:ss");
  return e;
}

QLineEdit* TextBox(QWidget* parent, const QString& name, int maxChars) {
  auto* e = new QLineEdit(parent);
  e->setObjectName(name);
  e->setMaxLength(maxChars);
  return e;
}

}  // namespace

EditFiltersDialog::EditFiltersDialog(Database& db, QWidget* parent) : QDialog(parent), db_(db) {
  setObjectName("editFiltersDialog");
  setWindowTitle("Edit Filters");
  InstallHelpShortcut(this, QStringLiteral("Filter_Dialog"));
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(BuildFilter(0));
  auto* join = new QHBoxLayout;
  and_ = new QRadioButton("AND", this);
  or_ = new QRadioButton("OR", this);
  and_->setObjectName("andButton");
  or_->setObjectName("orButton");
  auto* group = new QButtonGroup(this);
  group->addButton(and_);
  group->addButton(or_);
  join->addStretch();
  join->addWidget(and_);
  join->addWidget(or_);
  join->addStretch();
  layout->addLayout(join);
  layout->addWidget(BuildFilter(1));
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  buttons->setObjectName("buttons");
  connect(buttons, &QDialogButtonBox::accepted, this, &EditFiltersDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &EditFiltersDialog::reject);
  layout->addWidget(buttons);
  opened_ = OpenFilterDialog(db);
  setValues(opened_);
}

QWidget* EditFiltersDialog::BuildFilter(int n) {
  const QString k = QString::number(n + 1);
  auto* box = new QGroupBox(this);
  box->setObjectName("filter" + k);
  Controls& c = c_[n];
  auto* form = new QFormLayout(box);
  auto* top = new QHBoxLayout;
  c.enabled = new QCheckBox("Filter " + k + " Enabled", box);
  c.enabled->setObjectName("filter" + k + "Enabled");
  c.negate = new QCheckBox("NOT", box);
  c.negate->setObjectName("filter" + k + "Not");
  top->addWidget(c.enabled);
  top->addStretch();
  top->addWidget(c.negate);
  form->addRow(top);
  c.field = new QComboBox(box);
  c.field->setObjectName("filter" + k + "Field");
  for (int f = 0; f < format::kFieldCount; ++f) c.field->addItem(FromDb(db_.schema().field[f].name.str()));
  form->addRow("Select Field", c.field);

  c.pages = new QStackedWidget(box);
  c.pages->setObjectName("filter" + k + "Controls");
  auto page = [&](auto build) {
    auto* w = new QWidget(c.pages);
    auto* f = new QFormLayout(w);
    f->setContentsMargins(0, 0, 0, 0);
    build(w, f);
    c.pages->addWidget(w);
  };
  page([&](QWidget* w, QFormLayout* f) { f->addRow(new QLabel("This field's type has nothing to set.", w)); });
  page([&](QWidget* w, QFormLayout* f) {
    c.mustContain = TextBox(w, "filter" + k + "MustContain", 39);
    f->addRow("Must Contain", c.mustContain);
  });
  auto limits = [&](QWidget* w, QFormLayout* f) {
    if (!c.lower) {
      c.lower = TextBox(w, "filter" + k + "Lower", 39);
      c.upper = TextBox(w, "filter" + k + "Upper", 39);
      f->addRow("Lower Limit", c.lower);
      f->addRow("Upper Limit", c.upper);
    }
  };
  // Whole and decimal limits share the two boxes: only one is ever shown.
  page(limits);
  c.pages->addWidget(new QWidget(c.pages));
  page([&](QWidget* w, QFormLayout* f) {
    c.lowerDate = DatePicker(w, "filter" + k + "LowerDate");
    c.upperDate = DatePicker(w, "filter" + k + "UpperDate");
    f->addRow("Lower Limit", c.lowerDate);
    f->addRow("Upper Limit", c.upperDate);
  });
  page([&](QWidget* w, QFormLayout* f) {
    c.lowerTime = TimePicker(w, "filter" + k + "LowerTime");
    c.upperTime = TimePicker(w, "filter" + k + "UpperTime");
    f->addRow("Lower Limit", c.lowerTime);
    f->addRow("Upper Limit", c.upperTime);
  });
  page([&](QWidget* w, QFormLayout* f) {
    c.popup = new QComboBox(w);
    c.popup->setObjectName("filter" + k + "Popup");
    f->addRow("Value Must Be", c.popup);
  });
  page([&](QWidget* w, QFormLayout* f) {
    c.check = new QCheckBox(w);
    c.check->setObjectName("filter" + k + "Check");
    f->addRow("Value Must Be", c.check);
  });
  form->addRow(c.pages);
  connect(c.field, &QComboBox::currentIndexChanged, this, [this, n] { ShowControlsFor(n); });
  return box;
}

void EditFiltersDialog::ShowControlsFor(int n) {
  Controls& c = c_[n];
  const int field = c.field->currentIndex();
  FilterControls kind = FilterControlsFor(db_.schema(), field);
  // Both number kinds use the page of the two text boxes.
  c.pages->setCurrentIndex(PageOf(kind == FilterControls::DecimalLimits ? FilterControls::WholeLimits : kind));
  if (kind == FilterControls::PopupValue) {
    const int keep = c.popup->currentIndex();
    c.popup->clear();
    c.popup->addItem("No Value", kNoValueChoice);
    const auto& items = db_.popups()[field].items;
    for (size_t i = 0; i < items.size(); ++i) c.popup->addItem(FromDb(items[i]), static_cast<int>(i));
    if (keep >= 0 && keep < c.popup->count()) c.popup->setCurrentIndex(keep);
  }
}

FilterDialogValues EditFiltersDialog::values() const {
  FilterDialogValues v = opened_;
  for (int n = 0; n < 2; ++n) {
    const Controls& c = c_[n];
    FilterDialogFilter& f = v.filter[n];
    f.enabled = c.enabled->isChecked();
    f.field = c.field->currentIndex();
    f.notChecked = c.negate->isChecked();
    switch (FilterControlsFor(db_.schema(), f.field)) {
      case FilterControls::MustContain:
        f.mustContain = ToDb(c.mustContain->text()).value_or(f.mustContain);
        break;
      case FilterControls::WholeLimits:
      case FilterControls::DecimalLimits:
        f.lowerLimit = c.lower->text().trimmed().toStdString();
        f.upperLimit = c.upper->text().trimmed().toStdString();
        break;
      case FilterControls::DateLimits:
        f.lowerDay = ToDay(c.lowerDate->date());
        f.upperDay = ToDay(c.upperDate->date());
        break;
      case FilterControls::TimeLimits: {
        auto t = [](const QTime& q) {
          return TimeOfDay{static_cast<uint8_t>(q.hour()), static_cast<uint8_t>(q.minute()),
                           static_cast<uint8_t>(q.second())};
        };
        f.lowerTime = t(c.lowerTime->time());
        f.upperTime = t(c.upperTime->time());
        break;
      }
      case FilterControls::PopupValue:
        f.popupChoice = c.popup->currentData().toInt();
        break;
      case FilterControls::CheckValue:
        f.checked = c.check->isChecked();
        break;
      case FilterControls::None:
        break;
    }
  }
  v.orBetween = or_->isChecked();
  return v;
}

void EditFiltersDialog::setValues(const FilterDialogValues& v) {
  for (int n = 0; n < 2; ++n) {
    Controls& c = c_[n];
    const FilterDialogFilter& f = v.filter[n];
    c.enabled->setChecked(f.enabled);
    c.negate->setChecked(f.notChecked);
    c.field->setCurrentIndex(f.field >= 0 && f.field < format::kFieldCount ? f.field : 0);
    ShowControlsFor(n);
    c.mustContain->setText(FromDb(f.mustContain));
    c.lower->setText(QString::fromStdString(f.lowerLimit));
    c.upper->setText(QString::fromStdString(f.upperLimit));
    c.lowerDate->setDate(ToQDate(f.lowerDay));
    c.upperDate->setDate(ToQDate(f.upperDay));
    auto t = [](const TimeOfDay& d) { return QTime(d.hours < 24 ? d.hours : 0, d.minutes % 60, d.seconds % 60); };
    c.lowerTime->setTime(t(f.lowerTime));
    c.upperTime->setTime(t(f.upperTime));
    const int at = c.popup->findData(f.popupChoice);
    c.popup->setCurrentIndex(at < 0 ? 0 : at);
    c.check->setChecked(f.checked);
  }
  (v.orBetween ? or_ : and_)->setChecked(true);
}

void EditFiltersDialog::accept() {
  const FilterDialogValues v = values();
  for (int n = 0; n < 2; ++n) {
    if (FilterControlsFor(db_.schema(), v.filter[n].field) == FilterControls::MustContain &&
        !ToDb(c_[n].mustContain->text())) {
      QMessageBox::warning(this, "Edit Filters",
                           "The text contains \"" + FirstUnstorableCharacter(c_[n].mustContain->text()) +
                               "\", which a database cannot hold.");
      return;
    }
    if (auto error = CheckFilterLimits(db_.schema(), v.filter[n])) {
      QMessageBox::warning(this, "Edit Filters", QString::fromStdString("Filter " + std::to_string(n + 1) + ": " + *error));
      return;
    }
  }
  AcceptFilterDialog(db_, v);
  QDialog::accept();
}

}  // namespace cx::gui
