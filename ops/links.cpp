#include "ops/links.h"

#include <algorithm>
#include <cctype>
#include <filesystem>

#include "engine/database_folder.h"
#include "engine/record.h"
#include "ops/calc.h"
#include "ops/open_database.h"
#include "ops/sort.h"

namespace cx {
namespace {

bool Allowed(const LinkServices& s, const Database& db, LinkAccess kind) {
  return !s.checkAccess || s.checkAccess(db, kind);
}

// Loads a database for linked work, with the work its file still owes.
std::unique_ptr<Database> Load(const std::string& path, const LinkServices& services) {
  auto db = std::make_unique<Database>();
  if (!db->Open(path, services.ui)) return nullptr;
  if (services.locale) {
    DataSession session(*db, *services.locale, services.ui);
    RunPendingWork(session);
  }
  return db;
}

// The marks a database gets when records were added while it was not the
// one on screen: recalculate and re-sort at its next opening.
void MarkAddedRecords(Database& db) {
  Schema& s = db.schema();
  if (NeedsPrevRecord(db)) s.recalcFrom = 1;
  if (s.sortKey[0].Field() >= 0 || s.sortKey[1].Field() >= 0) s.resortPending = 1;
  db.MarkChanged();
}

// A chain of databases being worked on by one recursive deletion, so that
// a link leading back to one of them is not followed again.
using Chain = std::vector<std::string>;

bool InChain(const Chain& chain, const std::string& path) {
  for (const std::string& p : chain) {
    if (SameDatabasePath(p, path)) return true;
  }
  return false;
}

size_t DeleteLinkedIn(size_t recordIndex, const Database& db, const LinkServices& services,
                      Chain& chain) {
  size_t deleted = 0;
  for (uint8_t slot : db.schema().fieldOrder) {
    if (db.schema().field[slot].type() != FieldType::Link) continue;
    std::string path = db.schema().field[slot].text.str();
    if (!FindDatabaseBeside(path, db.path())) {
      services.ui.ShowMessage(link_messages::kNotPresent, "ERROR", MessageIcon::Error);
      continue;
    }
    if (InChain(chain, path)) continue;
    LinkedDatabase linked = OpenLinkedDatabase(slot, db, recordIndex, LinkAccess::Delete, services);
    if (!linked) continue;
    Database& other = linked.db();
    chain.push_back(other.path());
    const bool nested = HasLinkFields(other);
    std::vector<size_t> doomed = LinkedRecordIndexes(other, linked.restriction());
    // Backwards, so the indexes still to come stay valid.
    for (auto it = doomed.rbegin(); it != doomed.rend(); ++it) {
      if (nested) deleted += DeleteLinkedIn(*it, other, services, chain);
      other.DeleteRecord(*it);
      ++deleted;
    }
    chain.pop_back();
    linked.Close(services);
  }
  return deleted;
}

bool SameFieldTypes(const Schema& a, const Schema& b) {
  for (int slot = 0; slot < format::kFieldCount; ++slot) {
    if (a.field[slot].type() != b.field[slot].type()) return false;
  }
  return true;
}

}  // namespace

// Both paths are made absolute first so that "./a.PDB" and "a.PDB" agree.
bool SameDatabasePath(const std::string& a, const std::string& b) {
  std::error_code ec;
  std::string ca = std::filesystem::weakly_canonical(a, ec).string();
  if (ec) ca = a;
  std::string cb = std::filesystem::weakly_canonical(b, ec).string();
  if (ec) cb = b;
  return std::equal(ca.begin(), ca.end(), cb.begin(), cb.end(), [](char x, char y) {
    return std::tolower(static_cast<unsigned char>(x)) == std::tolower(static_cast<unsigned char>(y));
  });
}

LinkedDatabase::LinkedDatabase(Database* shared, LinkContext context)
    : db_(shared), context_(std::move(context)) {}

LinkedDatabase::LinkedDatabase(std::unique_ptr<Database> owned, LinkContext context)
    : db_(owned.get()), owned_(std::move(owned)), context_(std::move(context)) {}

bool LinkedDatabase::Close(const LinkServices& services) {
  bool ok = true;
  if (owned_ && owned_->changed()) {
    Status s = owned_->Save(services.SaveClock());
    if (!s) {
      services.ui.ShowMessage(s.message(), "ERROR", MessageIcon::Error);
      ok = false;
    }
  }
  owned_.reset();
  db_ = nullptr;
  return ok;
}

LinkContext MakeLinkContext(int fieldSlot, const Database& db, size_t recordIndex) {
  LinkContext c;
  c.parentIndex = recordIndex;
  const FieldDef& f = db.schema().field[fieldSlot];
  c.restriction.field = f.otherField < format::kFieldCount ? f.otherField : 0;
  if (recordIndex < db.recordCount()) {
    ByteView record = db.record(recordIndex);
    if (auto v = FieldValue(record, fieldSlot)) c.restriction.value = ValueNumber(*v);
    if (!record.empty() && record[0] != 0 && record.size() >= 1 + format::kExtensionSize) {
      c.parentHeaderText.assign(reinterpret_cast<const char*>(record.data() + 1),
                                format::kExtensionSize);
    }
  }
  return c;
}

LinkedDatabase OpenLinkedDatabase(int fieldSlot, const Database& db, size_t recordIndex,
                                  LinkAccess kind, const LinkServices& services) {
  if (fieldSlot < 0 || fieldSlot >= format::kFieldCount || recordIndex >= db.recordCount()) {
    return {};
  }
  UiPort& ui = services.ui;
  std::string path = db.schema().field[fieldSlot].text.str();
  if (!FindDatabaseBeside(path, db.path())) {
    ui.ShowMessage(link_messages::kNotPresent, "ERROR", MessageIcon::Error);
    return {};
  }
  LinkContext context = MakeLinkContext(fieldSlot, db, recordIndex);
  if (services.findOpen) {
    if (Database* open = services.findOpen(path)) {
      if (!Allowed(services, *open, kind)) return {};
      return LinkedDatabase(open, std::move(context));
    }
  }
  std::unique_ptr<Database> loaded = Load(path, services);
  if (!loaded) {
    ui.ShowMessage(link_messages::kCannotOpen, "ERROR", MessageIcon::Error);
    return {};
  }
  if (services.checkOpen && !services.checkOpen(*loaded)) return {};
  if (kind != LinkAccess::Open && !Allowed(services, *loaded, kind)) return {};
  return LinkedDatabase(std::move(loaded), std::move(context));
}

std::vector<size_t> LinkedRecordIndexes(const Database& linked, const LinkRestriction& restriction) {
  // The view test with both filters off reduces to the link restriction.
  std::vector<size_t> out;
  for (size_t i = 0; i < linked.recordCount(); ++i) {
    if (restriction.field < 0) {
      out.push_back(i);
      continue;
    }
    auto v = FieldValue(linked.record(i), restriction.field);
    if (v && v->size() >= 4 && ValueNumber(*v) == restriction.value) out.push_back(i);
  }
  return out;
}

bool HasLinkFields(const Database& db) {
  for (const FieldDef& f : db.schema().field) {
    if (f.type() == FieldType::Link) return true;
  }
  return false;
}

size_t DeleteLinkedRecords(size_t recordIndex, const Database& db, const LinkServices& services) {
  Chain chain{db.path()};
  return DeleteLinkedIn(recordIndex, db, services, chain);
}

bool ForEachLinkedRecord(size_t recordIndex, const Database& db, int fieldSlot,
                         const LinkServices& services,
                         const std::function<void(const Database& linked, size_t index)>& visit) {
  Chain& chain = services.visiting;
  const bool outermost = chain.empty();
  if (outermost) chain.push_back(db.path());
  std::string path = db.schema().field[fieldSlot].text.str();
  bool visited = false;
  if (!FindDatabaseBeside(path, db.path()) || !InChain(chain, path)) {
    LinkedDatabase linked = OpenLinkedDatabase(fieldSlot, db, recordIndex, LinkAccess::Open, services);
    if (linked) {
      chain.push_back(linked.db().path());
      for (size_t i : LinkedRecordIndexes(linked.db(), linked.restriction())) visit(linked.db(), i);
      chain.pop_back();
      visited = true;
    }
  }
  if (outermost) chain.clear();
  return visited;
}

TransferResult TransferRecords(bool move, const TransferWhich& which, DataSession& source,
                               const LinkServices& services) {
  auto chosen = services.ui.AskOpenFile("Cardovex", link_messages::kFileFilter);
  if (!chosen) return {};
  return TransferRecordsTo(move, which, source, *chosen, services);
}

TransferResult TransferRecordsTo(bool move, const TransferWhich& which, DataSession& source,
                                 const std::string& targetPath, const LinkServices& services) {
  UiPort& ui = services.ui;
  Database& db = source.db;
  TransferResult result;
  const bool toSelf = SameDatabasePath(targetPath, db.path());
  if (toSelf && move) {
    ui.ShowMessage(link_messages::kSameDatabase, "ERROR", MessageIcon::Error);
    return result;
  }
  if (!which.allInView && which.index >= db.recordCount()) return result;

  Database* target = toSelf ? &db : nullptr;
  std::unique_ptr<Database> loaded;
  if (!target && services.findOpen) target = services.findOpen(targetPath);
  if (!target) {
    loaded = Load(targetPath, services);
    if (!loaded) return result;
    if (services.checkOpen && !services.checkOpen(*loaded)) return result;
    target = loaded.get();
  }
  if (!SameFieldTypes(db.schema(), target->schema())) {
    ui.ShowMessage(FormatMessage(link_messages::kTypesDiffer, target->path()), "ERROR",
                   MessageIcon::Warning);
    return result;
  }
  if (!Allowed(services, *target, LinkAccess::Add)) return result;

  ui.SetBusy(true);
  result.code = toSelf ? 1 : 0;
  const size_t firstAdded = db.recordCount();
  // Source indexes in the order their copies are added: highest first, so
  // that removing them one by one later leaves the others' indexes valid.
  std::vector<size_t> chosen;
  if (which.allInView) {
    const ViewTester tester(db, source.Link());
    for (size_t i = db.recordCount(); i-- > 0;) {
      if (tester.InView(i)) chosen.push_back(i);
    }
  } else {
    chosen.push_back(which.index);
  }
  std::vector<size_t> copied;
  for (size_t index : chosen) {
    Bytes copy(db.record(index).begin(), db.record(index).end());
    if (target->AppendRecord(std::move(copy))) copied.push_back(index);
  }
  if (!toSelf && !copied.empty()) MarkAddedRecords(*target);

  // A target loaded here is stored before a single record leaves the
  // source: should the save fail, the records are still where they were.
  if (loaded && loaded->changed()) {
    Status s = loaded->Save(services.SaveClock());
    if (!s) {
      ui.SetBusy(false);
      ui.ShowMessage(s.message(), "ERROR", MessageIcon::Error);
      result.failed = true;
      return result;
    }
  }
  result.done = true;
  result.copied = copied.size();
  if (move) {
    for (size_t index : copied) {
      if (!Allowed(services, db, LinkAccess::Delete)) continue;
      db.DeleteRecord(index);
      ++result.deleted;
    }
  }

  if (toSelf && result.copied) {
    // Added to the database on screen: placed and calculated at once.
    if (NeedsPrevRecord(db)) {
      RecalculateFrom(source, firstAdded);
    } else if (db.schema().sortKey[0].Field() >= 0) {
      SortAll(source, false);
    }
  }
  if (result.deleted) {
    if (which.allInView) {
      RecalculateAfterMove(source, 0, 1);
    } else {
      RecalculateAfterMove(source, which.index == 0 ? 1 : which.index - 1, which.index);
    }
  }
  source.view = RebuildView(db, source.Link());
  ui.SetBusy(false);
  return result;
}

int ShowNotice(int kind, const std::string& text1, const std::string& text2,
               const std::string& text3, UiPort& ui) {
  const std::string text = text1 + text2 + text3;
  if (kind == 1) return ui.AskYesNo(text, "QUESTION") ? 0 : 1;
  ui.ShowMessage(text, "UPDATE", MessageIcon::Information);
  return 0;
}

}  // namespace cx
