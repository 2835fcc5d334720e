#!/usr/bin/env bash
# The desktop integration files as the desktop reads them: the desktop entry
# passes the freedesktop validator, and with the file type installed a
# database is recognised as ours while another program's .pdb file is not.
#
#   desktop_files_test.sh SOURCE_DIR SAMPLE_DIR
set -u
src=$1
samples=$2
id=io.github.cardovex.Cardovex

for tool in desktop-file-validate update-mime-database gio txt2pdbdoc; do
  command -v "$tool" >/dev/null 2>&1 || { echo "SKIP: $tool is not installed"; exit 77; }
done

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
fail=0

if ! desktop-file-validate "$src/gui/desktop/$id.desktop"; then
  echo "FAIL: the desktop entry does not validate"
  fail=1
fi

mkdir -p "$work/share/mime/packages"
cp "$src/gui/desktop/$id.xml" "$work/share/mime/packages/"
update-mime-database "$work/share/mime" >/dev/null 2>&1 || { echo "FAIL: update-mime-database refused the file type"; exit 1; }

cp "$samples/Contacts.PDB" "$work/CONTACTS.PDB"
cp "$samples/Orders.PDB" "$work/orders.pdb"
echo "Not a database of ours." > "$work/note.txt"
txt2pdbdoc "Note" "$work/note.txt" "$work/note.pdb" >/dev/null 2>&1

type_of() {
  XDG_DATA_HOME="$work/share" XDG_DATA_DIRS=/usr/share gio info -a standard::content-type "$1" 2>/dev/null |
    sed -n 's/.*standard::content-type: //p'
}
for f in CONTACTS.PDB orders.pdb; do
  t=$(type_of "$work/$f")
  [ "$t" = "application/x-cardovex-database" ] || { echo "FAIL: $f is '$t'"; fail=1; }
done
t=$(type_of "$work/note.pdb")
[ "$t" != "application/x-cardovex-database" ] || { echo "FAIL: another program's .pdb file was claimed"; fail=1; }

[ "$fail" -eq 0 ] && echo "PASS"
exit "$fail"
