// Field definitions written on the command line:
//   NAME:TYPE[:option=value,option,...]
// TYPE is a type label (Text, Integer, Float, Pop-Up, Check-Box, Unique,
// Image, Date, Time, Link, Linked, Note, Heading, DB Popup, Calculated;
// case and punctuation are ignored).
#pragma once

#include <string>
#include <vector>

#include "engine/popups.h"
#include "engine/schema.h"

namespace cx::cli {

struct FieldSpec {
  FieldDef def;
  std::vector<std::string> popupItems;
  // Calculated operands given by field name, resolved once every field of
  // the database is known.
  std::string operand1Field, operand2Field;
};

// Parses one field description; on failure `error` says why.
bool ParseFieldSpec(const std::string& text, FieldSpec& plan, std::string& error);

// Resolves calculated operands named by field against `schema`.
bool ResolveOperands(FieldSpec& plan, const Schema& schema, std::string& error);

// The option list, for --help.
extern const char* const kFieldSpecHelp;

}  // namespace cx::cli
