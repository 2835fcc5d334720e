// The access checks a receive makes on its target database, as the program
// makes them everywhere else: "Open Database" before a file is loaded,
// "Add Records" before anything is inserted. Answers to password prompts
// come from the user-interface port (the command line's --password).
#pragma once

#include <string>

#include "engine/receive.h"

namespace cx {

class AccessCheckedReceiveHooks : public ReceiveHooks {
 public:
  bool AllowAdd(Database& db, UiPort& ui) override;
  bool AllowOpen(const std::string& path, UiPort& ui) override;
};

}  // namespace cx
