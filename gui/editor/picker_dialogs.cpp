#include "gui/editor/picker_dialogs.h"

#include <QAction>
#include <QCalendarWidget>
#include <QDialogButtonBox>
#include <QLabel>
#include <QMenu>
#include <QPushButton>
#include <QTimeEdit>
#include <QVBoxLayout>
#include <memory>

#include "gui/common/help.h"
#include "gui/common/text.h"

namespace cx::gui {

QMenu* CreateDateMenu(QWidget* parent, bool offerChooseDate) {
  auto* menu = new QMenu(parent);
  menu->setObjectName(QStringLiteral("dateMenu"));
  const std::vector<std::string> entries = DateMenuEntries(offerChooseDate);
  for (size_t i = 0; i < entries.size(); ++i) {
    menu->addAction(QString::fromLatin1(entries[i].c_str()))->setData(static_cast<int>(i));
  }
  return menu;
}

QMenu* CreatePopupMenu(QWidget* parent, const std::vector<PopupMenuEntry>& entries) {
  auto* menu = new QMenu(parent);
  menu->setObjectName(QStringLiteral("popupValueMenu"));
  for (const PopupMenuEntry& e : entries) {
    if (e.id == picker_ids::kNoValue || e.id == picker_ids::kEditPopupList) menu->addSeparator();
    menu->addAction(EscapeMnemonic(FromDb(e.text)))->setData(e.id);
  }
  return menu;
}

int ExecDateMenu(QWidget* parent, const QPoint& at, bool offerChooseDate) {
  std::unique_ptr<QMenu> menu(CreateDateMenu(parent, offerChooseDate));
  QAction* chosen = menu->exec(at);
  return chosen ? chosen->data().toInt() : kDateDismissed;
}

int ExecPopupMenu(QWidget* parent, const QPoint& at, const Database& db, int field, bool offerNoValue,
                  bool offerEditList) {
  const std::vector<PopupMenuEntry> entries = PopupMenuEntries(db, field, offerNoValue, offerEditList);
  std::unique_ptr<QMenu> menu(CreatePopupMenu(parent, entries));
  QAction* chosen = menu->exec(at);
  return PopupResultForEntry(db, field, entries, chosen ? chosen->data().toInt() : 0);
}

CalendarDialog::CalendarDialog(const CalendarDate& initial, const Clock& clock, QWidget* parent)
    : QDialog(parent), result_(initial) {
  setWindowTitle(QStringLiteral("Choose Date"));
  setObjectName(QStringLiteral("chooseDateDialog"));
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(new QLabel(QStringLiteral("Choose Date"), this));
  calendar_ = new QCalendarWidget(this);
  calendar_->setObjectName(QStringLiteral("calendar"));
  calendar_->setMinimumDate(QDate(1904, 1, 1));
  calendar_->setGridVisible(true);
  // "No date" opens on today's month: a page of 1904 helps nobody, and
  // Cancel still gives the no-date value back.
  const CalendarDate shown = initial == CalendarDate{} ? DayNumberToDate(TodayDayNumber(clock)) : initial;
  calendar_->setSelectedDate(QDate(shown.year, shown.month, shown.day));
  layout->addWidget(calendar_);

  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  QPushButton* noDate = buttons->addButton(QStringLiteral("No Date"), QDialogButtonBox::ActionRole);
  noDate->setObjectName(QStringLiteral("noDateButton"));
  layout->addWidget(buttons);
  connect(noDate, &QPushButton::clicked, this, [this] {
    result_ = CalendarDate{};
    accept();
  });
  auto take = [this] {
    const QDate d = calendar_->selectedDate();
    // Only the year, month and day cross over; the day number is the
    // engine's to count.
    result_ = CalendarDate{d.year(), d.month(), d.day()};
    accept();
  };
  connect(buttons, &QDialogButtonBox::accepted, this, take);
  connect(calendar_, &QCalendarWidget::activated, this, take);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  InstallHelpShortcut(this, QStringLiteral("Choose_Date"));
}

TimeDialog::TimeDialog(const TimeBytes& initial, const Clock& clock, QWidget* parent)
    : QDialog(parent), result_(initial) {
  setWindowTitle(QStringLiteral("Choose Time"));
  setObjectName(QStringLiteral("chooseTimeDialog"));
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(new QLabel(QStringLiteral("Choose Time"), this));
  time_ = new QTimeEdit(this);
  time_->setObjectName(QStringLiteral("timeEdit"));
  time_->setDisplayFormat(QStringLiteral("HH:mm:ss"));
  const TimeBytes start = initial.none() || initial.hours > 23 ? CurrentTime(clock) : initial;
  time_->setTime(QTime(start.hours % 24, start.minutes % 60, start.seconds % 60));
  layout->addWidget(time_);

  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  QPushButton* now = buttons->addButton(QStringLiteral("Current Time"), QDialogButtonBox::ActionRole);
  now->setObjectName(QStringLiteral("currentTimeButton"));
  QPushButton* none = buttons->addButton(QStringLiteral("No Time"), QDialogButtonBox::ActionRole);
  none->setObjectName(QStringLiteral("noTimeButton"));
  layout->addWidget(buttons);
  connect(now, &QPushButton::clicked, this, [this, &clock] {
    const TimeBytes t = CurrentTime(clock);
    time_->setTime(QTime(t.hours, t.minutes, t.seconds));
  });
  connect(none, &QPushButton::clicked, this, [this, initial] {
    result_ = TimeBytes{0, 0, format::kNoTimeHours, initial.reserved};
    accept();
  });
  connect(buttons, &QDialogButtonBox::accepted, this, [this, initial] {
    const QTime t = time_->time();
    result_ = TimeBytes{static_cast<uint8_t>(t.second()), static_cast<uint8_t>(t.minute()),
                        static_cast<uint8_t>(t.hour()), initial.reserved};
    accept();
  });
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  InstallHelpShortcut(this, QStringLiteral("Choose_Time"));
}

CalendarChooser CalendarFor(QWidget* parent, const Clock& clock) {
  return [parent, &clock](const CalendarDate& initial) -> std::optional<CalendarDate> {
    CalendarDialog dialog(initial, clock, parent);
    dialog.exec();
    return dialog.result();
  };
}

TimeChooser TimeChooserFor(QWidget* parent, const Clock& clock) {
  return [parent, &clock](const TimeBytes& initial) -> std::optional<TimeBytes> {
    TimeDialog dialog(initial, clock, parent);
    dialog.exec();
    return dialog.result();
  };
}

}  // namespace cx::gui
