// The objects the beaming commands send: a whole database, one record
// (".cxr") and the records in view (".cxm"). docs/file-format.md describes them.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "engine/record_store.h"
#include "infrared/obex_headers.h"
#include "platform/status.h"

namespace cx::obex {

// A beamed object: its header items in the order the sender writes them.
using BeamObject = std::vector<HeaderItem>;

// The database file at `path`, sent under its file name with the creator
// code that has the receiving side install it. Refused when the file is no
// database of ours or too large for one object.
Status DatabaseObject(const std::string& path, BeamObject& object);

// Record `index` of `db`, its stored bytes complete, named after the
// database's file ("Parts.PDB" -> "Parts.cxr").
Status RecordObject(const Database& db, size_t index, BeamObject& object);

// The records of `db` listed in `view`, in that order, as ".cxm" objects:
// one, or as many as the 16-bit object size makes necessary.
Status RecordSetObjects(const Database& db, const std::vector<uint32_t>& view,
                        std::vector<BeamObject>& objects);

}  // namespace cx::obex
