#!/usr/bin/perl
# Prints what Palm::PDB, an independent reader of the container, makes of a
# database file: one fact per line, for the tests to compare with what
# Cardovex wrote. Dates are printed as stored (Palm::PDB shifts them to its
# own epoch on reading; the shift is undone here).
use strict;
use warnings;
use Palm::PDB;
use Palm::Raw;

my $path = shift or die "usage: dump_pdb.pl FILE\n";
my $pdb = Palm::PDB->new;
$pdb->Load($path) or die "cannot load $path\n";
my $epoch = 2082844800;

# Palm::PDB keeps the header attributes as named flags.
my %headerBits = (ResDB => 0x0001, ReadOnly => 0x0002, AppInfoDirty => 0x0004, Backup => 0x0008,
    OKToInstallNewer => 0x0010, ResetAfterInstall => 0x0020, CopyPrevention => 0x0040,
    Stream => 0x0080, Hidden => 0x0100, LaunchableData => 0x0200, Recyclable => 0x0400,
    Bundle => 0x0800, Open => 0x8000);
my $attributes = 0;
for my $flag (keys %headerBits) {
    $attributes |= $headerBits{$flag} if $pdb->{attributes}{$flag};
}

# A record's attribute byte as Palm::PDB would write it back.
sub RecordAttributes {
    my $r = shift;
    my $a = $r->{attributes} || {};
    my $byte = 0;
    if ($a->{expunged} || $a->{deleted}) {
        $byte |= 0x08 if $a->{archive};
    } else {
        $byte = ($r->{category} || 0) & 0x0f;
    }
    $byte |= 0x80 if $a->{expunged};
    $byte |= 0x40 if $a->{dirty};
    $byte |= 0x20 if $a->{deleted};
    $byte |= 0x10 if $a->{private};
    return $byte;
}

print "name=$pdb->{name}\n";
print "attributes=$attributes\n";
print "version=$pdb->{version}\n";
print "ctime=", $pdb->{ctime} + $epoch, "\n";
print "mtime=", $pdb->{mtime} + $epoch, "\n";
print "baktime=", $pdb->{baktime} + $epoch, "\n";
print "modnum=$pdb->{modnum}\n";
print "type=$pdb->{type}\n";
print "creator=$pdb->{creator}\n";
print "seed=$pdb->{uniqueIDseed}\n";
print "appinfo=", unpack("H*", defined $pdb->{appinfo} ? $pdb->{appinfo} : ""), "\n";
my @records = @{$pdb->{records} || []};
print "records=", scalar(@records), "\n";
for my $i (0 .. $#records) {
    my $r = $records[$i];
    printf "record %d offset=%d attributes=%d id=%d data=%s\n", $i, $r->{offset},
        RecordAttributes($r), $r->{id}, unpack("H*", $r->{data});
}
