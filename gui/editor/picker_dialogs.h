// The pickers as widgets: the date menu, the popup value menu, the
// "Choose Date" calendar and the "Choose Time" dialog. What their entries
// are and what a choice writes is app/pickers.h's business.
#pragma once

#include <QDialog>
#include <QPoint>
#include <optional>

#include "app/pickers.h"

class QCalendarWidget;
class QMenu;
class QTimeEdit;

namespace cx::gui {

// The two menus, each entry carrying its result (date menu) or entry id
// (popup value menu) as data.
QMenu* CreateDateMenu(QWidget* parent, bool offerChooseDate);
QMenu* CreatePopupMenu(QWidget* parent, const std::vector<PopupMenuEntry>& entries);

// The date menu at `at` (global position): a DateMenuResult.
int ExecDateMenu(QWidget* parent, const QPoint& at, bool offerChooseDate);

// The popup value menu of `field` at `at`: the chooser's result (an index
// into the popup list, kPopupNoValue, kPopupEditList or kPopupDismissed).
int ExecPopupMenu(QWidget* parent, const QPoint& at, const Database& db, int field, bool offerNoValue,
                  bool offerEditList);

// "Choose Date": a calendar, "No Date", OK and Cancel.
class CalendarDialog : public QDialog {
  Q_OBJECT

 public:
  CalendarDialog(const CalendarDate& initial, const Clock& clock, QWidget* parent = nullptr);
  // The date picked; the no-date value after "No Date"; the initial date
  // when the dialog was cancelled.
  CalendarDate result() const { return result_; }

 private:
  QCalendarWidget* calendar_ = nullptr;
  CalendarDate result_;
};

// "Choose Time": a time, "Current Time", "No Time", OK and Cancel.
class TimeDialog : public QDialog {
  Q_OBJECT

 public:
  TimeDialog(const TimeBytes& initial, const Clock& clock, QWidget* parent = nullptr);
  TimeBytes result() const { return result_; }

 private:
  QTimeEdit* time_ = nullptr;
  TimeBytes result_;
};

// The choosers app/pickers.h asks for, as these dialogs.
CalendarChooser CalendarFor(QWidget* parent, const Clock& clock);
TimeChooser TimeChooserFor(QWidget* parent, const Clock& clock);

}  // namespace cx::gui
