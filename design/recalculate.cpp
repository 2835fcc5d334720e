#include "design/recalculate.h"

#include "ops/calc.h"

namespace cx {

bool CalculationsUse(const Schema& schema, int slot) {
  for (const FieldDef& f : schema.field) {
    if (f.type() != FieldType::Calculated) continue;
    if (f.param1 == slot || f.param2 == slot) return true;
  }
  return false;
}

void RecalculateAfterDesignChange(DataSession& session) {
  if (!HasCalculatedField(session.db.schema())) return;
  RecalculateFrom(session, 0);
}

}  // namespace cx
