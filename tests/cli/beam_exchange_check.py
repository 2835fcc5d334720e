"""Two Cardovex processes on loopback exchange a database, a record and the
records in view.

usage: beam_exchange_check.py CLI SAMPLE_DIR
"""
import json
import os
import shutil
import socket
import subprocess
import sys
import tempfile
import time

GLOBAL = ["--date-format", "M/d/yyyy", "--time-format", "h:mm:ss tt"]


def free_port():
    with socket.socket() as s:
        s.bind(("127.0.0.1", 0))
        return s.getsockname()[1]


def records(cli, path):
    out = subprocess.run([cli] + GLOBAL + ["records", path, "--json", "--all"],
                         capture_output=True, timeout=60, check=True).stdout
    return [[f["text"] for f in r["fields"]] for r in json.loads(out)]


def main(cli, samples):
    failures = []
    with tempfile.TemporaryDirectory() as work:
        sender = os.path.join(work, "send")
        inbox = os.path.join(work, "inbox")
        os.makedirs(sender)
        os.makedirs(inbox)
        source = os.path.join(sender, "Contacts.PDB")
        shutil.copy(os.path.join(samples, "Contacts.PDB"), source)
        env = dict(os.environ, CARDOVEX_DATA_DIR=inbox)
        port = free_port()
        receiver = subprocess.Popen(
            [cli, "--yes", "receive", "--listen", f"127.0.0.1:{port}", "--count", "3"],
            env=env, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True)
        try:
            deadline = time.time() + 20
            while time.time() < deadline:
                try:
                    socket.create_connection(("127.0.0.1", port), timeout=1).close()
                    break
                except OSError:
                    time.sleep(0.1)
            for extra in ([], ["--record", "1"], ["--records"]):
                done = subprocess.run([cli, "beam", source, "--to", f"127.0.0.1:{port}", "--wait", "10"]
                                      + extra, capture_output=True, text=True, timeout=60)
                if done.returncode != 0:
                    failures.append(f"beam {extra}: exit {done.returncode}: {done.stderr}")
            out, _ = receiver.communicate(timeout=60)
        finally:
            if receiver.poll() is None:
                receiver.kill()
                receiver.wait()
        received = os.path.join(inbox, "Contacts.PDB")
        if not os.path.exists(received):
            failures.append("no database received:\n" + out)
        else:
            sent = records(cli, source)
            got = records(cli, received)
            expected = sent + [sent[1]] + sent
            if got != expected:
                failures.append(f"received records differ:\n  {got}\n  expected {expected}\n{out}")
    for f in failures:
        print(f)
    print(f"{0 if failures else 1} passed, {len(failures)} failed")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1], sys.argv[2]))
