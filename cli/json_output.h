// What --json promises scripts beyond the result itself: a command with no
// result refuses the option instead of ignoring it, and a failure arrives
// on stderr as one object {"error": "...", "exitCode": N}.
#pragma once

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <utility>
#include <iosfwd>
#include <string>
#include <string_view>
#include <vector>

#include "cli/command.h"

namespace cx::cli {

// For a command that prints no result: with --json a usage error (2),
// without it 0. Call before anything is changed.
int RefuseJson(Context& ctx, const Command& command);

// A result made of counts, as one object of numbers.
void PrintCounts(Context& ctx, std::initializer_list<std::pair<const char*, int64_t>> counts);

// "DB Properties" -> "dbProperties", "max-chars" -> "maxChars": labels
// made into the keys scripts expect.
std::string CamelCaseKey(std::string_view label);

// Runs `run` with everything written to `err` (the same stream the user
// interface writes to) held back while --json is among `args`. On failure
// what was held becomes the "error" of one JSON object; on success it is
// passed on as it is. What the command flushes on purpose (a question
// waiting for its answer on a terminal) is passed on at once.
int WithJsonErrors(const std::vector<std::string>& args, std::ostream& err,
                   const std::function<int()>& run);

}  // namespace cx::cli
