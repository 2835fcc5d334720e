// The ".cxm" layout, the names received objects may be stored under, and
// how a received object is recognised.
#include <gtest/gtest.h>

#include "infrared/receive_store.h"
#include "infrared/received_name.h"
#include "infrared/record_set.h"

namespace cx::obex {
namespace {

using Bytes = std::vector<uint8_t>;

TEST(RecordSet, PacksInOrderAndReadsBack) {
  Bytes a = {0, 2, 0, 'x', 0, 0xFF, 0xFF}, b = {1}, c(300, 7);
  std::vector<Bytes> bodies;
  ASSERT_TRUE(PackRecordSets({a, b, c}, bodies));
  ASSERT_EQ(bodies.size(), 1u);
  Bytes expected = {'C', 'X', 'M', '1', 0, 3, 0, 7, 0, 2, 0, 'x', 0, 0xFF, 0xFF, 0, 1, 1, 0x01, 0x2C};
  expected.resize(expected.size() + c.size(), 7);  // c's bytes
  EXPECT_EQ(bodies[0], expected);
  std::vector<Bytes> back;
  ASSERT_TRUE(UnpackRecordSet(bodies[0], back));
  EXPECT_EQ(back, (std::vector<Bytes>{a, b, c}));
}

TEST(RecordSet, SplitsBelowTheObjectLimit) {
  std::vector<Bytes> records(9, Bytes(20000, 1));
  std::vector<std::span<const uint8_t>> views(records.begin(), records.end());
  std::vector<Bytes> bodies;
  ASSERT_TRUE(PackRecordSets(views, bodies));
  ASSERT_EQ(bodies.size(), 3u);  // three records of 20002 bytes fit in each
  size_t total = 0;
  for (const Bytes& body : bodies) {
    EXPECT_LE(body.size(), 65535u);
    std::vector<Bytes> back;
    ASSERT_TRUE(UnpackRecordSet(body, back));
    total += back.size();
  }
  EXPECT_EQ(total, 9u);
  Bytes largest(65527, 2), tooLarge(65528, 2);
  EXPECT_TRUE(PackRecordSets({largest}, bodies));
  EXPECT_EQ(bodies[0].size(), 65535u);
  EXPECT_FALSE(PackRecordSets({tooLarge}, bodies));
}

TEST(RecordSet, RefusesDamagedSets) {
  std::vector<Bytes> back;
  for (Bytes bad : {Bytes{}, Bytes{'C', 'X', 'M', '1', 0}, Bytes{'C', 'X', 'M', '2', 0, 1, 0, 1, 9},
                    Bytes{'C', 'X', 'M', '1', 0, 0}, Bytes{'C', 'X', 'M', '1', 0, 1, 0, 5, 1, 2},
                    Bytes{'C', 'X', 'M', '1', 0, 2, 0, 1, 9}, Bytes{'C', 'X', 'M', '1', 0, 1, 0, 1, 9, 9},
                    Bytes{'C', 'X', 'M', '1', 0, 1, 0}}) {
    EXPECT_FALSE(UnpackRecordSet(bad, back));
    EXPECT_TRUE(back.empty());
  }
}

TEST(ReceivedNames, NeverLeaveTheFolder) {
  EXPECT_EQ(SafeFileName("Parts.PDB"), "Parts.PDB");
  EXPECT_EQ(SafeFileName("../../etc/Parts.PDB"), "Parts.PDB");
  EXPECT_EQ(SafeFileName("C:\\My Documents\\Parts.PDB"), "Parts.PDB");
  EXPECT_EQ(SafeFileName("dir/"), "");
  EXPECT_EQ(SafeFileName(".."), "");
  EXPECT_EQ(SafeFileName("a/.."), "");
  EXPECT_EQ(SafeFileName(".PDB"), "");
  EXPECT_EQ(SafeFileName("a\nb.PDB"), "");
  EXPECT_EQ(SafeFileName(std::string(256, 'a')), "");
  EXPECT_EQ(SafeFileName("K\xC3\xBCnden.PDB"), "K\xC3\xBCnden.PDB");
}

TEST(ReceivedNames, KindAndTarget) {
  ReceivedObject o;
  o.name = "Parts.cxr";
  EXPECT_EQ(KindOf(o), PayloadKind::kRecord);
  EXPECT_EQ(TargetDatabase(o), "Parts.PDB");
  o.description = "parts.pdb";  // the sender's own spelling wins
  EXPECT_EQ(TargetDatabase(o), "parts.pdb");
  o.description = "../x/Other.PDB";
  EXPECT_EQ(TargetDatabase(o), "Other.PDB");
  o.description = "a note";
  EXPECT_EQ(TargetDatabase(o), "Parts.PDB");
  o.name = "dir/Set.CXM";
  EXPECT_EQ(KindOf(o), PayloadKind::kRecordSet);
  o.name = "x.pdb";
  EXPECT_EQ(KindOf(o), PayloadKind::kDatabase);
  o.name = "x";
  EXPECT_EQ(KindOf(o), PayloadKind::kOther);
  o.creator = "lnch";
  EXPECT_EQ(KindOf(o), PayloadKind::kDatabase);
  o.name = ".cxr";
  o.description.clear();
  EXPECT_EQ(TargetDatabase(o), "");
}

}  // namespace
}  // namespace cx::obex
