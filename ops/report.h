// Summary reports over one field of the records in view: count, extremes,
// sum, running-total extremes and average, as one text of "\r\n" lines.
#pragma once

#include <optional>
#include <string>

#include "engine/record_store.h"
#include "ops/view.h"
#include "platform/locale_info.h"
#include "platform/status.h"
#include "platform/ui_port.h"

namespace cx {

enum class ReportKind { Integer, Float, CheckBox, Time, Date };

inline constexpr const char* kReportTypesMessage =
    "Can only run reports on the following field types:\n"
    "Integer, Float, Checkbox, Time, Date, and Calculated.";

// How a field is reported: Calculated fields by their result format (the
// decimal formats as Float, "Integer", "Time", "Date" as those). Nothing
// for the types that have no report.
std::optional<ReportKind> ReportKindFor(const FieldDef& field);

// The report text of field `fieldSlot` over the records in view (table
// order), beginning "Report for <name>\r\n"; nothing when the field's type
// has no report.
std::optional<std::string> BuildReport(const Database& db, int fieldSlot, const LocaleInfo& locale,
                                       const LinkRestriction* link = nullptr);

// As the list's "Run Report" entry: a field whose type has no report shows
// kReportTypesMessage (caption "ERROR") and gives nothing.
std::optional<std::string> RunReport(const Database& db, int fieldSlot, const LocaleInfo& locale,
                                     UiPort& ui, const LinkRestriction* link = nullptr);

// The report dialog's "Export": the text and one "\n" into `path`, which
// is replaced only once the new file is complete.
Status ExportReportText(const std::string& report, const std::string& path);

}  // namespace cx
