"""With --json every command either prints one JSON document and exits 0,
or exits with a code and one JSON error object on stderr; keys are
camelCase; typed record values do not depend on the regional settings.

usage: json_contract_check.py CLI SAMPLE_DIR
"""
import json
import os
import re
import shutil
import subprocess
import sys
import tempfile

US = ["--date-format", "M/d/yyyy", "--time-format", "h:mm:ss tt", "--decimal", "."]
EUROPE = ["--date-format", "dd.MM.yyyy", "--time-format", "HH:mm:ss", "--decimal", ","]

# What each command is given, and whether it has a result to print.
CASES = {
    "author": (["{C}"], "json"),
    "beam": (["{C}", "--to", "127.0.0.1:9"], "refused"),
    "copy-records": (["{O}", "{O2}"], "json"),
    "delete": (["{O2}", "--all", "--yes"], "json"),
    "export-csv": (["{C}", "-"], "refused"),
    "filter": (["{C}"], "json"),
    "find": (["{C}", "a"], "json"),
    "import-csv": (["{C}", "{CSV}"], "json"),
    "info": (["{C}"], "json"),
    "linked": (["{C}", "0", "Orders"], "json"),
    "listing": (["{C}"], "refused"),
    "move-records": (["{O3}", "{O2}"], "json"),
    "new": (["{DIR}/New.PDB", "--name", "New", "--field", "A:Text"], "refused"),
    "order": (["{C}"], "json"),
    "popups": (["{C}", "Category"], "json"),
    "print": (["{C}", "--command", "true"], "refused"),
    "recalc": (["{O}"], "refused"),
    "receive": (["--listen", "127.0.0.1:0", "--count", "1"], "refused"),
    "records": (["{C}", "--all"], "json"),
    "rename": (["{C}", "Renamed"], "refused"),
    "report": (["{O}", "Quantity"], "json"),
    "resave": (["{C}"], "refused"),
    "security": (["{C}"], "json"),
    "set-field": (["{C}", "Birthday"], "json"),
    "sort": (["{C}", "Name"], "json"),
}
# Kept as they were before keys became camelCase: scripts read them.
LABEL_KEYED = {"levels"}
CAMEL = re.compile(r"^[a-z][A-Za-z0-9]*$")


def run(cli, args):
    done = subprocess.run([cli] + args, capture_output=True, timeout=60, stdin=subprocess.DEVNULL)
    return done.returncode, done.stdout.decode(), done.stderr.decode()


def bad_keys(value, parent=""):
    if isinstance(value, dict):
        for key, inner in value.items():
            if parent not in LABEL_KEYED and not CAMEL.match(key):
                yield key
            yield from bad_keys(inner, key)
    elif isinstance(value, list):
        for inner in value:
            yield from bad_keys(inner, parent)


def check_error(name, code, out, err):
    problems = []
    if out:
        problems.append(f"{name}: output beside the error: {out[:80]!r}")
    try:
        obj = json.loads(err)
    except ValueError:
        return problems + [f"{name}: stderr is not one JSON object: {err[:200]!r}"]
    if not isinstance(obj, dict) or set(obj) != {"error", "exitCode"} or obj["exitCode"] != code:
        problems.append(f"{name}: error object {obj!r} for exit code {code}")
    elif not obj["error"]:
        problems.append(f"{name}: empty error message")
    return problems


def main(cli, samples):
    problems = []
    with tempfile.TemporaryDirectory() as work:
        paths = {"DIR": work}
        for key, sample in (("C", "Contacts"), ("O", "Orders"), ("O2", "Orders"), ("O3", "Orders")):
            # Linked databases are found by name, so the first copies keep theirs.
            paths[key] = os.path.join(work, sample + ".PDB" if key in ("C", "O") else key + ".PDB")
            shutil.copy(os.path.join(samples, sample + ".PDB"), paths[key])
        paths["CSV"] = os.path.join(work, "more.csv")
        with open(paths["CSV"], "w", encoding="utf-8") as f:
            f.write("Zoë,555\n")

        code, out, _ = run(cli, ["--help"])
        listed = re.findall(r"^  ([a-z][a-z-]+)  ", out.split("Global options")[0], re.M)
        if len(listed) < len(CASES):
            problems.append(f"only {len(listed)} commands listed by --help")
        for name in listed:
            args, expected = CASES.get(name, (["{C}"], None))
            args = [a.format(**paths) for a in args]
            code, out, err = run(cli, US + ["--json", name] + args)
            if code == 0:
                try:
                    document = json.loads(out)
                except ValueError:
                    problems.append(f"{name}: not JSON: {out[:200]!r}")
                    continue
                problems += [f"{name}: key {k!r} is not camelCase" for k in bad_keys(document)]
            else:
                problems += check_error(name, code, out, err)
            outcome = "json" if code == 0 else "refused" if code == 2 else "failed"
            if expected and outcome != expected:
                problems.append(f"{name}: {outcome} (exit {code}), expected {expected}: {err[:200]}")

        # A failure keeps the same shape.
        code, out, err = run(cli, ["--json", "info", os.path.join(work, "missing.PDB")])
        problems += check_error("info of a missing file", code, out, err)
        if code != 1:
            problems.append(f"info of a missing file exits {code}")

        # Typed values are the same under any regional settings; texts are not.
        shutil.copy(os.path.join(samples, "Orders.PDB"), paths["O"])
        values = {}
        for conventions in (US, EUROPE):
            code, out, err = run(cli, conventions + ["--json", "records", paths["O"], "--all"])
            if code != 0:
                problems.append(f"records: {err}")
                continue
            rows = json.loads(out)
            values[conventions[1]] = [[f["value"] for f in r["fields"]] for r in rows]
            texts = [f["text"] for f in rows[0]["fields"]]
            values["text " + conventions[1]] = texts
        if values.get("M/d/yyyy") != values.get("dd.MM.yyyy"):
            problems.append("typed values change with the regional settings")
        if values.get("text M/d/yyyy") == values.get("text dd.MM.yyyy"):
            problems.append("texts should follow the regional settings")
        # So are the limits of a filter, however they were typed.
        code, _, err = run(cli, EUROPE + ["filter", paths["O"], "--filter1", "Ordered=01.01.2024..31.01.2024",
                                          "--filter2", "Price=1.5..20"])
        if code != 0:
            problems.append(f"filter: {err}")
        limits = []
        for conventions in (US, EUROPE):
            shown = json.loads(run(cli, conventions + ["--json", "filter", paths["O"]])[1])
            limits.append([(f.get("low"), f.get("high")) for f in shown["filters"]])
        if limits[0] != limits[1] or limits[0] != [("2024-01-01", "2024-01-31"), (1.5, 20)]:
            problems.append(f"filter limits {limits}")
        run(cli, ["filter", paths["O"], "--off"])

        first = dict(zip((f["name"] for f in json.loads(run(cli, US + ["--json", "records", paths["O"], "--all"])[1])[0]["fields"]),
                         values.get("M/d/yyyy", [[]])[0]))
        expected = {"Order#": 1, "Item": "Espresso beans 1 kg", "Quantity": 2, "Price": 18.5,
                    "Total": 37.0, "Ordered": "2024-01-05", "Paid": True, "Ship to": "Ana Müller",
                    "Due": "2024-02-04", "Packed in": "00:03:00"}
        for key, value in expected.items():
            if first.get(key) != value:
                problems.append(f"records value of {key}: {first.get(key)!r}, expected {value!r}")

    print(f"{len(listed)} commands checked")
    for p in problems:
        print(p)
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1], sys.argv[2]))
