#include "ops/print.h"

#include <cerrno>

#include "platform/data_folder.h"
#include "platform/file_io.h"

namespace cx {

std::string DefaultPrintTempPath(const std::string& documentsDir) {
  return FolderPart(DataFolder(documentsDir)) + "cxprnttemp.txt";
}

std::string PrintErrorText(int code) {
  switch (code) {
    case 1: return "Invalid Function.";
    case 2: return "File not found";
    case 63: return "Print Cancelled";
    case 995: return "Op Aborted.";
    default: return "Error #: " + std::to_string(code);
  }
}

int LaunchErrorCode(const ProcessResult& result) {
  if (result.outcome == ProcessResult::Outcome::NotFound) return 2;
  if (result.systemError == EACCES || result.systemError == EPERM) return 5;
  return result.systemError;
}

PrintOutcome PrintRecords(const Database& db, bool all, size_t current, const ListingContext& ctx,
                          const PrintSettings& settings, ProcessRunner& runner, UiPort& ui,
                          const LinkRestriction* link) {
  const std::string temp = settings.tempPath.empty() ? DefaultPrintTempPath() : settings.tempPath;
  ui.SetBusy(true);
  Status written = WriteListingFile(db, all, current, temp, ctx, link);
  ui.SetBusy(false);
  if (!written) {
    ui.ShowMessage("ERROR: Unable to open temp file for writing.", "Error", MessageIcon::Error);
    return PrintOutcome::TempFileFailed;
  }

  PrintOutcome outcome = PrintOutcome::NothingToPrint;
  if (FileSize(temp) > 0) {
    std::vector<std::string> args = settings.arguments;
    args.push_back(temp);
    ProcessResult run = runner.Run(settings.command, args);
    if (run.started()) {
      if (run.exitCode == 0) {
        outcome = PrintOutcome::Printed;
        ui.ShowMessage("Data Printed OK", "Update", MessageIcon::Information);
      } else if (run.exitCode == kPrintCancelledExit) {
        outcome = PrintOutcome::Cancelled;
      } else {
        outcome = PrintOutcome::Failed;
        ui.ShowMessage("There was a problem printing to PrintPocketCE", "Update",
                       MessageIcon::Information);
      }
    } else {
      outcome = PrintOutcome::NotStarted;
      ui.ShowMessage("Unable to call PrintPocketCE.  Please check to see if it is properly installed.",
                     "ERROR", MessageIcon::Error);
      ui.ShowMessage(PrintErrorText(LaunchErrorCode(run)), "ERROR", MessageIcon::Error);
    }
  }
  RemoveFile(temp);
  return outcome;
}

}  // namespace cx
