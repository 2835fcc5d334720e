"""Reads and writes CSV with Python's csv module for the CSV tests.

read CSV OUT:  each row of CSV (Windows-1252) becomes one line of OUT:
               the values' Windows-1252 bytes in hex, separated by blanks,
               "-" standing for an empty value.
write IN CSV:  each line of IN in that form becomes one row of CSV, written
               with csv.writer (excel dialect) in Windows-1252.
"""
import csv
import sys


def encode(value):
    return value.encode("cp1252").hex() if value else "-"


def decode(token):
    return "" if token == "-" else bytes.fromhex(token).decode("cp1252")


def main(argv):
    mode, source, target = argv[1], argv[2], argv[3]
    if mode == "read":
        with open(source, newline="", encoding="cp1252") as f, open(target, "w") as out:
            for row in csv.reader(f):
                out.write(" ".join(encode(v) for v in row) + "\n")
    elif mode == "write":
        with open(source) as f, open(target, "w", newline="", encoding="cp1252") as out:
            writer = csv.writer(out)
            for line in f:
                line = line.rstrip("\n")
                writer.writerow([decode(t) for t in line.split(" ")] if line else [])
    else:
        return 2
    return 0


if __name__ == "__main__":
    sys.exit(main(sys.argv))
