#include "cli/query.h"

#include <algorithm>

#include "cli/argument_text.h"
#include "cli/database_access.h"
#include "ops/sort.h"
#include "ops/sort_keys.h"
#include "ops/view.h"
#include "platform/text_codec.h"

namespace cx::cli {

bool ReadFilterCondition(const Context& ctx, const Database& db, const std::string& cond,
                         FilterDialogFilter& f, std::string& error) {
  for (size_t eq = cond.find('='); eq != std::string::npos; eq = cond.find('=', eq + 1)) {
    const int field = ResolveField(db, cond.substr(0, eq));
    if (field < 0) continue;
    std::string value;
    if (!ToStoredText(cond.substr(eq + 1), "the value of " + cond.substr(0, eq), value, error)) {
      return false;
    }
    if (ReadFilterValueText(db, field, value, ctx.locale, f, error)) return true;
    error = Cp1252ToUtf8(error);
    return false;
  }
  error = cond.find('=') == std::string::npos ? "COND is FIELD=VALUE"
                                              : "no field " + cond.substr(0, cond.find('='));
  return false;
}

bool QueryRows(Context& ctx, Database& db, const std::vector<std::string>& conditions,
               const std::vector<std::string>& keys, std::vector<size_t>& rows, std::string& usage) {
  std::vector<char> keep(db.recordCount(), 1);
  // One condition at a time through the first filter, so that any number of
  // them can be given and every one must hold.
  for (const std::string& cond : conditions) {
    FilterDialogValues values = OpenFilterDialog(db);
    values.filter[0].enabled = true;
    values.filter[0].notChecked = false;
    values.filter[1].enabled = false;
    values.orBetween = false;
    if (!ReadFilterCondition(ctx, db, cond, values.filter[0], usage)) {
      usage = "--where " + cond + ": " + usage;
      return false;
    }
    AcceptFilterDialog(db, values);
    std::vector<char> pass(db.recordCount(), 0);
    for (uint32_t index : RebuildView(db)) pass[index] = 1;
    for (size_t i = 0; i < keep.size(); ++i) keep[i] = keep[i] && pass[i];
  }
  if (keys.size() > 3) {
    usage = "at most three sort keys";
    return false;
  }
  if (!keys.empty()) {
    SortingChoice choice = OpenSortingDialog(db.schema());
    for (size_t k = 0; k < 3; ++k) choice.entry[k] = 0;
    for (size_t k = 0; k < keys.size(); ++k) {
      int field = -1;
      bool forward = true;
      const std::optional<std::string> key = StoredTextOrNothing(keys[k]);
      if (!key) {
        usage = "no field " + keys[k];
        return false;
      }
      if (!ParseSortKeyText(db.schema(), *key, field, forward, usage)) {
        usage = Cp1252ToUtf8(usage);
        return false;
      }
      choice.entry[k] = field + 1;
      choice.forward[k] = forward;
    }
    if (!AcceptSortingDialog(db, choice, ctx.ui)) return false;
  }

  rows.clear();
  if (keys.empty()) {
    for (size_t i = 0; i < keep.size(); ++i) {
      if (keep[i]) rows.push_back(i);
    }
    return true;
  }
  // The rows are ordered, not the records: the indexes printed stay those
  // that edit and delete take.
  SortKeyTable table(db);
  std::vector<SortKeyTable::Row> chosen;
  for (const SortKeyTable::Row& row : table.rows()) {
    if (keep[row.record]) chosen.push_back(row);
  }
  std::stable_sort(chosen.begin(), chosen.end(),
                   [&table](const auto& a, const auto& b) { return table.Compare(a, b) < 0; });
  for (const auto& row : chosen) rows.push_back(row.record);
  return true;
}

}  // namespace cx::cli
