// Bringing calculated fields up to date after a design change.
#pragma once

#include "engine/schema.h"
#include "ops/session.h"

namespace cx {

// True when a Calculated field takes an operand from field `slot`.
bool CalculationsUse(const Schema& schema, int slot);

// Recomputes the calculated fields of every record (in view) from the
// first record on, as after any change that may alter their operands.
void RecalculateAfterDesignChange(DataSession& session);

}  // namespace cx
