"""Every CSV export of the sample databases, read back by Python's csv
module, gives exactly the values that `records --json` shows.

usage: sample_csv_check.py CLI SAMPLE_DIR
"""
import csv
import io
import json
import os
import subprocess
import sys

GLOBAL = ["--date-format", "M/d/yyyy", "--time-format", "h:mm:ss tt", "--password", "secret"]
EXPORTS = [[], ["--quote-all"], ["--slot-order"], ["--header"], ["--filtered", "--quote-all"]]


def run(cli, args, binary=False):
    done = subprocess.run([cli] + GLOBAL + args, capture_output=True, timeout=60)
    if done.returncode != 0:
        raise SystemExit(f"{args} failed: {done.stderr.decode(errors='replace')}")
    return done.stdout


def main(cli, folder):
    failures = 0
    for name in sorted(f for f in os.listdir(folder) if f.endswith(".PDB")):
        path = os.path.join(folder, name)
        info = json.loads(run(cli, ["info", path, "--json"]))
        types = {f["slot"]: f["type"] for f in info["fields"]}
        records = json.loads(run(cli, ["records", path, "--json", "--all"]))
        for options in EXPORTS:
            out = os.path.join(folder, name + ".check.csv")
            run(cli, ["export-csv", path, out] + options)
            with open(out, newline="", encoding="utf-8") as f:
                rows = list(csv.reader(f))
            os.remove(out)
            if "--header" in options:
                expected_header = [fld["name"] for fld in records[0]["fields"]] if records else []
                if rows[0] != expected_header:
                    print(f"{name} {options}: header {rows[0]} != {expected_header}")
                    failures += 1
                rows = rows[1:]
            if len(rows) != len(records):
                print(f"{name} {options}: {len(rows)} rows, {len(records)} records")
                failures += 1
                continue
            for record, row in zip(records, rows):
                fields = record["fields"]
                if "--slot-order" in options:
                    fields = sorted(fields, key=lambda fld: fld["slot"])
                expected = []
                for fld in fields:
                    if types[fld["slot"]] == "Image":
                        expected.append("")
                    else:
                        expected.append(fld["text"] if fld["text"] != "" else "No Value")
                if row != expected:
                    print(f"{name} {options} record {record['index']}:\n  csv     {row}\n  records {expected}")
                    failures += 1
    print(f"{0 if failures else 1} passed, {failures} failed")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1], sys.argv[2]))
