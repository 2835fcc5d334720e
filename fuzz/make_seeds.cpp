// Writes the starting corpora of the fuzz targets, every input made by the
// program's own writers: databases saved by the record store, CSV written
// by the export, OBEX sessions built from the sender's packets.
//
//   make_seeds OUTDIR      writes OUTDIR/{open,ops,csv,obex}/seed-NNN
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "bench/generator.h"
#include "engine/record.h"
#include "engine/record_store.h"
#include "infrared/obex_format.h"
#include "infrared/obex_headers.h"
#include "infrared/obex_packets.h"
#include "infrared/record_set.h"
#include "ops/csv_export.h"
#include "ops/database_settings.h"
#include "ops/text_sink.h"
#include "platform/clock.h"
#include "platform/file_io.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace {

using cx::Bytes;
using cx::Database;
namespace bench = cx::bench;

class SeedFolder {
 public:
  explicit SeedFolder(std::string path) : path_(std::move(path)) {
    std::filesystem::create_directories(path_);
  }
  void Add(const std::vector<uint8_t>& bytes) {
    char name[32];
    std::snprintf(name, sizeof name, "/seed-%03d", count_++);
    std::ofstream(path_ + name, std::ios::binary)
        .write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
  }
  void Add(const std::string& text) { Add(std::vector<uint8_t>(text.begin(), text.end())); }
  int count() const { return count_; }

 private:
  std::string path_;
  int count_ = 0;
};

const cx::FixedClock kClock(1700000000);

Bytes Saved(Database& db, const std::string& scratch) {
  if (!db.SaveAs(scratch, kClock)) return {};
  Bytes bytes;
  cx::ReadWholeFile(scratch, bytes);
  return bytes;
}

Database Generated(size_t records, uint32_t seed, bool extension, size_t note = 60) {
  bench::GeneratorOptions options;
  options.records = records;
  options.seed = seed;
  options.extension = extension;
  options.maxNoteLength = note;
  options.pictureEvery = 7;
  return bench::GenerateDatabase("", options);
}

void DatabaseSeeds(SeedFolder& open, SeedFolder& ops, const std::string& scratch) {
  // Plain databases of a few sizes, with and without the prefix extension.
  for (size_t n : {0, 1, 3, 12}) {
    for (bool ext : {false, true}) {
      Database db = Generated(n, static_cast<uint32_t>(n + 1), ext);
      Bytes b = Saved(db, scratch);
      open.Add(b);
      ops.Add(b);
    }
  }
  // Sorted on three keys, both filters on, a find text and a password.
  for (int variant = 0; variant < 4; ++variant) {
    Database db = Generated(10, 40 + variant, variant % 2 == 1);
    cx::Schema& s = db.schema();
    const int keys[4][3] = {{bench::kName, bench::kQuantity, bench::kBorn},
                            {bench::kPrice, bench::kAt, bench::kColor},
                            {bench::kTotal, bench::kPaid, bench::kSupplier},
                            {bench::kOrder, bench::kNotes, bench::kRunning}};
    for (int k = 0; k < 3; ++k) {
      s.sortKey[k].field = static_cast<uint8_t>(keys[variant][k]);
      s.sortKey[k].direction = static_cast<uint8_t>((variant + k) % 2);
    }
    cx::FilterSettings filters = cx::LoadFilterSettings(s);
    filters.filter[0].enabled = true;
    filters.filter[1].enabled = variant >= 2;
    const int filterFields[4] = {bench::kName, bench::kQuantity, bench::kBorn, bench::kColor};
    filters.filter[0].field = filterFields[variant];
    filters.filter[0].SetLowerText(variant == 0 ? "an" : "10");
    filters.filter[0].SetUpperText("50000");
    filters.filter[0].lowerNumber = 10;
    filters.filter[0].upperNumber = 50000;
    filters.filter[1].field = bench::kPaid;
    filters.filter[1].upperNumber = 1;
    filters.combination = static_cast<uint8_t>(variant);
    cx::StoreFilterSettings(filters, s);
    cx::SearchSettings search;
    search.text = variant % 2 ? "Jr" : "order";
    search.field = variant == 3 ? bench::kNotes : -1;
    cx::StoreSearchSettings(search, s);
    if (variant == 2) s.password.set("secret");
    if (variant == 3) s.resortPending = 1;
    if (variant == 1) s.recalcFrom = 33;
    Bytes b = Saved(db, scratch);
    open.Add(b);
    ops.Add(b);
  }
  // Shapes other programs write: an older schema layout, a scrambled field
  // order, a last record without end mark, record counts below 31, full
  // popup lists.
  {
    Database db = Generated(4, 7, false);
    Bytes b = Saved(db, scratch);
    Bytes v1 = b;
    const size_t schemaAt = 78 + 8 * 35 + 2 + 40;
    v1[schemaAt + 1946] = 1;  // schemaVersion
    open.Add(v1);
    Bytes order = b;
    for (size_t i = 0; i < 30; ++i) order[schemaAt + 1948 + i] = static_cast<uint8_t>(i % 7);
    open.Add(order);
    Bytes shortList = b;
    shortList[76] = 0;
    shortList[77] = 5;  // numRecords 5
    open.Add(shortList);
    Bytes cut = b;
    cut.resize(cut.size() - 40);
    open.Add(cut);
  }
  {
    Database db = Generated(2, 9, false);
    for (auto& list : db.popups()) {
      list.items.clear();
      for (int i = 0; i < 60; ++i) list.items.push_back(std::string(79, static_cast<char>('A' + i % 26)));
    }
    cx::Schema& s = db.schema();
    for (int slot = bench::kSlotCount; slot < 30; ++slot) {
      s.field[slot].typeNumber = static_cast<int16_t>(cx::FieldType::Note);
      s.field[slot].name.set("Note " + std::to_string(slot));
    }
    for (size_t r = 0; r < db.recordCount(); ++r) {
      Bytes e = cx::Expand(db.record(r), s);
      for (int slot = bench::kSlotCount; slot < 30; ++slot) {
        cx::SetEditingText(e, slot, std::string(150, 'n'), s);
      }
      db.ReplaceRecord(r, cx::Compact(e, s));
    }
    Bytes b = Saved(db, scratch);
    open.Add(b);
    ops.Add(b);
  }
}

void CsvSeeds(SeedFolder& csv) {
  cx::SilentUi ui;
  cx::LocaleInfo locale;
  for (int variant = 0; variant < 8; ++variant) {
    Database db = Generated(4, 100 + variant, variant % 3 == 0, 80);
    cx::CsvExportOptions options;
    options.quoteAll = variant & 1;
    options.withHeader = variant & 2;
    options.fieldNumberOrder = variant & 4;
    cx::CsvSettings settings;
    settings.separator = variant == 5 ? ';' : ',';
    cx::StringSink out;
    cx::ExportCsvTo(db, options, out, settings, locale, ui);
    const uint8_t flags = static_cast<uint8_t>((options.fieldNumberOrder ? 1 : 0) |
                                               (variant == 5 ? 2 : 0) | (variant % 3 == 0 ? 4 : 0) |
                                               (variant == 6 ? 8 : 0));
    csv.Add(std::string(1, static_cast<char>(flags)) + out.text);
  }
  // The reading rules' corner cases.
  const char* lines[] = {
      "a,,\"b,c\",\n",
      "a,\n",
      "\"two\r\nlines\",x\r\n",
      "\"say \"\"hi\"\"\",\"\"\r",
      "ab\"cd\"ef,\"g\"h,i\n\rnext\n",
      "Red,No Value,no value,12abc,  -7,3/7/24,11:59 PM\n",
  };
  for (const char* line : lines) csv.Add(std::string(1, '\0') + line);
}

void PutPacket(Bytes& stream, const uint8_t* p, size_t n) { stream.insert(stream.end(), p, p + n); }

// A whole session as the sender writes it for one object.
Bytes Session(const std::string& name, const std::string& creator, const Bytes& body) {
  std::vector<cx::obex::HeaderItem> items;
  cx::obex::ObjectItems("Cardovex", name, creator, body, items);
  Bytes stream;
  std::vector<uint8_t> packet(cx::obex::kPacketBufferAllocation + 16);
  PutPacket(stream, packet.data(), cx::obex::BuildConnect(packet.data()));
  Bytes headers = cx::obex::BuildHeaderPut(items);
  stream.insert(stream.end(), headers.begin(), headers.end());
  size_t at = 0;
  for (size_t part : cx::obex::BodyPartSizes(static_cast<uint16_t>(body.size()), 0)) {
    PutPacket(stream, packet.data(), cx::obex::BuildBodyPart(packet.data(), body.data() + at, part));
    at += part;
  }
  PutPacket(stream, packet.data(), cx::obex::BuildPutFinal(packet.data()));
  PutPacket(stream, packet.data(), cx::obex::BuildDisconnect(packet.data()));
  return stream;
}

void ObexSeeds(SeedFolder& obex, const std::string& scratch) {
  Database db = Generated(5, 200, false, 40);
  std::vector<Bytes> sessions;
  sessions.push_back(Session("Generated.PDB", cx::obex::kDatabaseCreator, Saved(db, scratch)));
  Bytes record(db.record(0).begin(), db.record(0).end());
  sessions.push_back(Session("Generated.cxr", cx::obex::kRecordCreator, record));
  std::vector<std::span<const uint8_t>> records;
  for (size_t r = 0; r < db.recordCount(); ++r) records.push_back(db.record(r));
  std::vector<Bytes> sets;
  cx::obex::PackRecordSets(records, sets);
  if (!sets.empty()) sessions.push_back(Session("Generated.cxm", cx::obex::kRecordCreator, sets[0]));
  sessions.push_back(Session("../../etc/passwd", "QrTa", Bytes(10, 'x')));
  sessions.push_back(Session("big.bin", "QrTa", Bytes(9000, 'b')));
  for (const Bytes& s : sessions) {
    // Cut into receives three ways; the target database open on screen; every
    // question answered No.
    for (uint8_t piece : {0x00, 0x01, 0x07, 0x40, 0x83}) {
      Bytes input(s.size() + 1);
      input[0] = piece;
      std::copy(s.begin(), s.end(), input.begin() + 1);
      obex.Add(input);
    }
  }
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "usage: make_seeds OUTDIR\n");
    return 2;
  }
  const std::string out = argv[1];
  const std::string scratch = out + "/scratch.PDB";
  SeedFolder open(out + "/open"), ops(out + "/ops"), csv(out + "/csv"), obex(out + "/obex");
  DatabaseSeeds(open, ops, scratch);
  CsvSeeds(csv);
  ObexSeeds(obex, scratch);
  cx::RemoveFile(scratch);
  std::printf("open %d, ops %d, csv %d, obex %d seeds in %s\n", open.count(), ops.count(),
              csv.count(), obex.count(), out.c_str());
  return 0;
}
