// What becomes of a received object: a database is stored in the data
// folder once the user agrees (never replacing one without asking), and
// records are inserted into the database of the same name by the engine's
// receive rules. Anything else is refused.
#pragma once

#include <functional>
#include <string>

#include "engine/receive.h"
#include "infrared/obex_server.h"
#include "platform/ui_port.h"

namespace cx::obex {

// How a received object is treated, from its name (and creator code).
enum class PayloadKind { kDatabase, kRecord, kRecordSet, kOther };
PayloadKind KindOf(const ReceivedObject& object);

// The database file a record object is meant for: its Description when
// that names a ".PDB" file, else its Name with ".PDB" for its extension.
// Empty when neither gives a usable file name.
std::string TargetDatabase(const ReceivedObject& object);

class ReceiveStore : public ObjectSink {
 public:
  // The program's open databases (their data folder is where databases are
  // stored), its user-interface port and its receive hooks. Deliver must
  // run on the thread that owns them. `report` hears one line per object.
  ReceiveStore(OpenDatabases& dbs, UiPort& ui, ReceiveHooks& hooks,
               std::function<void(const std::string&)> report = nullptr);

  uint8_t Deliver(ReceivedObject& object) override;

 private:
  uint8_t StoreDatabase(const ReceivedObject& object);
  uint8_t InsertRecords(const ReceivedObject& object, PayloadKind kind);
  uint8_t Outcome(uint8_t code, const std::string& line);

  OpenDatabases& dbs_;
  UiPort& ui_;
  ReceiveHooks& hooks_;
  std::function<void(const std::string&)> report_;
};

}  // namespace cx::obex
