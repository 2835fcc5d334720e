// Toolkit-free rules behind the desktop's data dialogs: what a typed filter
// limit must look like, which peers a beam offers and remembers, where the
// receiver listens, and how a database with unsaved changes is beamed.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "engine/record_store.h"
#include "ops/filter_dialog.h"
#include "platform/status.h"

namespace cx {

// The limits of a filter whose controls are two text boxes must be numbers
// of the kind the field holds (whole numbers for Integer and Unique, any
// decimal for Float and numeric Calculated fields): nothing when they are,
// else the message to show. Other kinds of controls always pass.
std::optional<std::string> CheckFilterLimits(const Schema& schema, const FilterDialogFilter& filter);

// Peers typed into the beam dialog, kept as one comma-separated setting,
// the newest first, no duplicates (case ignored), at most kRememberedPeers.
inline constexpr char kRecentBeamPeersSetting[] = "RecentBeamPeers";
inline constexpr size_t kRememberedPeers = 8;
std::vector<std::string> RememberedPeers(const std::string& stored);
std::string RememberPeer(const std::string& stored, const std::string& peer);

// Where "Receive..." listens: the ReceiveAddress setting, or `fallback`
// (the receiver's own default) when it is unset or unusable.
std::string ReceiveAddressOrDefault(const std::optional<std::string>& setting, const std::string& fallback);
// "HOST:PORT" with a port of 0..65535 (0: any free one): nothing, else the
// message to show.
std::optional<std::string> CheckReceiveAddress(const std::string& address);

// The file a database beam sends. A database without unsaved changes is
// sent from its file; otherwise it is written as it stands in memory into
// `scratchFolder`, under its own file name (the receiver stores it under
// that name), leaving `db` and its file untouched.
Status BeamableDatabaseFile(const Database& db, const std::string& scratchFolder, std::string& path);

}  // namespace cx
