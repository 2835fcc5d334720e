// Printing: the listing goes to a temporary file that a print handler (an
// outside command, `lp` unless configured otherwise) is run on; the
// temporary file is removed afterwards, whatever happened.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "engine/record_store.h"
#include "ops/listing.h"
#include "platform/process.h"
#include "platform/ui_port.h"

namespace cx {

struct PrintSettings {
  std::string command = "lp";
  std::vector<std::string> arguments;  // given before the file's path
  std::string tempPath;                // the temporary listing (see DefaultPrintTempPath)
};

// "cxprnttemp.txt" in the documents folder (the folder that holds the
// Cardovex data folder).
std::string DefaultPrintTempPath(const std::string& documentsDir = "");

// An exit code the print program reports when the user cancelled: no
// message follows.
constexpr int kPrintCancelledExit = 63;

enum class PrintOutcome {
  Printed,           // exit code 0
  Cancelled,         // exit code 63
  Failed,            // any other exit code
  NotStarted,        // the command could not be run
  NothingToPrint,    // the listing came out empty; nothing was run
  TempFileFailed,    // the temporary file could not be written
};

// The second message after a failed start, by the system's error code:
// 1 "Invalid Function.", 2 "File not found", 63 "Print Cancelled", 995
// "Op Aborted.", any other "Error #: <code>".
std::string PrintErrorText(int code);
// The error code a failed start is reported with: 2 for a program that
// does not exist, 5 for one that may not be run, else the errno value.
int LaunchErrorCode(const ProcessResult& result);

// PrintRecords: with `all` every record in view, else the record at
// `current`. Messages: "Data Printed OK" / "There was a problem printing
// to PrintPocketCE" ("Update") after the command ran (none after exit code
// 63); "Unable to call PrintPocketCE.  Please check to see if it is
// properly installed." and the error text ("ERROR") when it could not be
// run; "ERROR: Unable to open temp file for writing." ("Error").
PrintOutcome PrintRecords(const Database& db, bool all, size_t current, const ListingContext& ctx,
                          const PrintSettings& settings, ProcessRunner& runner, UiPort& ui,
                          const LinkRestriction* link = nullptr);

}  // namespace cx
