// FIELD=VALUE on the command line, typed into a record as the record
// editor would take it: texts in the database's code page and room, numbers
// as the number boxes accept them, dates and times in the conventions of
// the global options, pop-ups by entry.
#pragma once

#include <string>
#include <vector>

#include "app/record_form.h"
#include "cli/command.h"

namespace cx::cli {

struct FieldAssignment {
  int field = -1;
  std::string value;  // UTF-8, as given
};

// Splits each FIELD=VALUE (a field name may hold "=": each "=" is tried
// until the text before it names a field). False with `error` set at the
// first that names no field or names one twice.
bool ReadAssignments(const Database& db, const std::vector<std::string>& texts,
                     std::vector<FieldAssignment>& out, std::string& error);

// Types `value` into `field` of the form. False, with `error` saying why
// and the form's field left as it was, when the value does not convert or
// the field takes no typed value (Unique, Link, Linked, Image, Calculated,
// Heading, Not-Used).
bool TypeValue(RecordForm& form, const LocaleInfo& locale, int field, const std::string& value,
               std::string& error);

}  // namespace cx::cli
