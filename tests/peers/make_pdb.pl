#!/usr/bin/perl
# Writes a Cardovex database with Palm::PDB, an independent writer of the
# container, encoding the popup lists and data records by hand.
# Usage: make_pdb.pl SCHEMA_HEX_FILE OUT_FILE
# The schema record comes from the test (as hex); slots: 0 Text, 1 Integer,
# 2 Pop-Up, 3 Date, 4 Time, 5 Check-Box, 6 Float, 7 Note, 8 Unique.
use strict;
use warnings;
use Palm::PDB;
use Palm::Raw;

my ($schemaFile, $out) = @ARGV;
die "usage: make_pdb.pl SCHEMA_HEX_FILE OUT_FILE\n" unless defined $out;
open(my $in, '<', $schemaFile) or die "cannot read $schemaFile\n";
my $hex = do { local $/; <$in> };
close $in;
$hex =~ s/\s+//g;
my $epoch = 2082844800;

my $pdb = Palm::Raw->new;
$pdb->{name} = "Perl Made";
$pdb->{type} = "QrTa";
$pdb->{creator} = "QrTa";
$pdb->{attributes}{Backup} = 1;
$pdb->{version} = 1;
$pdb->{ctime} = 893970430 - $epoch;
$pdb->{mtime} = 893970435 - $epoch;
$pdb->{baktime} = 0 - $epoch;
$pdb->{modnum} = 86;
$pdb->{uniqueIDseed} = 0x00305000;
$pdb->{appinfo} = "\0" x 40;

sub Add {
    my ($data, $id, %attributes) = @_;
    my $category = delete $attributes{category} || 0;
    push @{$pdb->{records}}, { data => $data, id => $id, category => $category,
                               attributes => { %attributes } };
}

Add(pack("H*", $hex), 0x000001);
for my $slot (0 .. 29) {
    my $list = "\0\0\0";
    $list = "Red\0Green\0Blue\0\0\0\0" if $slot == 2;
    $list = "unused\0\0\0\0" if $slot == 9;
    Add($list, 0x000100 + $slot, category => $slot % 16);
}

# Values inside records are little-endian, lengths included.
sub Text { my $t = shift; return pack("v", length($t) + 1) . $t . "\0"; }
sub Long { return pack("v l<", 4, shift); }
sub Byte { return pack("v C", 1, shift); }
sub Time { my ($h, $m, $s) = @_; return pack("v C4", 4, $s, $m, $h, 0); }
my $end = pack("v", 0xFFFF);

Add("\0" . Text("Alice") . Long(42) . Byte(1) . Long(406) . Time(13, 7, 5) . Byte(1)
        . Text("3.14") . Text("line1\r\nline2") . Long(1) . $end, 0x100001);
Add("\0" . Text("Bob") . Long(-5) . Byte(255) . Long(0) . Time(255, 0, 0) . Byte(0)
        . Text("0.5") . Text("") . Long(2) . $end, 0x100002, private => 1);
Add("\0" . Text("Zo\xEB") . Long(2147483647) . Byte(0) . Long(43889) . Time(23, 59, 59)
        . Byte(1) . Text("-1.25") . Text("n") . Long(3) . $end, 0x100003,
    category => 3, dirty => 1);
Add("\0" . Text("Dee") . $end, 0x100004, deleted => 1, archive => 1);

$pdb->Write($out) or die "cannot write $out\n";
