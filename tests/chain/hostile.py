"""Hostile messages through the real syslog-ng with the shipped configuration: each becomes one row that holds what was
sent, quorlogd counts it and records what a rule matches, quorlog finds it, and the tables stay what they were.
Usage: hostile.py SOURCE_FOLDER BUILD_FOLDER"""
import os
import random
import re
import shutil
import socket
import sqlite3
import subprocess
import sys
import tempfile
import time

source, build = sys.argv[1:]
port = int(os.environ.get("QUOR_HOSTILE_PORT", "15714"))
folder = tempfile.mkdtemp(prefix="quor-hostile-")
db = folder + "/syslog.db"
accounting = build + "/root/var/log/quorlog/.QUORACCOUNTDB"
events = build + "/root/usr/quor/etc/quorsyslog.db"
rules = build + "/root/etc/quorsyslog/notify.conf"
PIECES = """' '' " ; -- /* */ [ ] ( ) ),( \\ \\' % _ ` * ? : ÿ Ã é OR 1=1 DROP_TABLE $(id) ${HOST} %s%n <13> <b>""".encode(
    "latin-1").split() + ["é".encode(), b"\x1b[", b"\x01", b"\x7f", b"\t", b"\r", b"\n", b"\0"]
NOTICES = 60  # a minute
random.seed(2024)


def value():
    return b"".join(random.choices(PIECES, k=random.randrange(8))) or b"-"


def start():
    with open(source + "/etc/syslog-ng/quorsyslog.conf") as file:
        conf = "@version: 3.38\n" + file.read()
    for name, text in {"address": "127.0.0.1", "port": port, "port_framed": port + 1, "database": db,
                       "receiver": build + "/tools/quorlogd/quorlogd"}.items():
        conf = re.sub(f'(@define quor_{name}) ".*"', f'\\1 "{text}"', conf)
    with open(folder + "/conf", "w") as file:
        file.write(conf)
    return subprocess.Popen(["/usr/sbin/syslog-ng", "-F", "--no-caps", "-f", folder + "/conf", "-R", folder + "/persist",
                             "-c", folder + "/ctl", "-p", folder + "/pid"], stderr=subprocess.DEVNULL)


def eventually(action):
    """The first true result of an action within twenty seconds."""
    for _ in range(200):
        try:
            result = action()
            if result:
                return result
        except (OSError, sqlite3.Error):
            pass
        time.sleep(0.1)
    sys.exit("hostile.py: something did not happen within twenty seconds; see " + folder)


def query(sql, path=db):
    connection = sqlite3.connect(f"file:{path}?mode=ro", uri=True)
    connection.text_factory = bytes
    return connection.execute(sql).fetchall()


def check(sent, host, program, text):
    """The row holds a message: its header as words, its text as one line."""
    number = int(re.search(rb"(?:00\.|<)(\d{5})[>+]", text).group(1))
    frame, *fields = sent.pop(number)
    if program == b"syslog-ng":  # its header cannot be read: all of it is there, up to a zero byte
        text = text.replace(b"Error processing log message: ", b"").replace(b">@<", b"")
        assert text == re.sub(b"[\r\n]", b" ", frame.rstrip(b"\n\0").partition(b"\0")[0]), frame
        return
    words = [re.sub(rb"[\x00-\x20\x7f]+", b"_", field) for field in fields[:2]]
    unnamed = fields[0] == b"-" or fields[0][:1] == b"\0"
    assert host == (b"127.0.0.1" if unnamed else words[0]) and program == words[1] * (words[1] != b"-"), frame
    assert text == re.sub(rb"[\r\n\0]", b" ", fields[2].rstrip(b"\n\0")), frame


def event(text):
    text = re.sub(rb"[\x00-\x1f\x7f]", b" ", text)
    return (b"Event detection: Received log which contains [<00]. Log content: [%s]" % text).replace(b"<", "\u2039".encode())


def counted(daemon, hosts):
    subprocess.call(["pkill", "-USR2", "-P", str(daemon.pid), "quorlogd"])
    return all(query(f"SELECT device, {counts} ORDER BY device", accounting) == hosts
               for counts in ("count FROM histogram", "sum(eps) FROM eps GROUP BY device"))


def quorlog(*arguments):
    return subprocess.run([build + "/tools/quorlog/quorlog", *arguments], stdout=subprocess.PIPE).stdout


for path in (accounting, events, rules):
    shutil.rmtree(os.path.dirname(path), ignore_errors=True)
    os.makedirs(os.path.dirname(path))
with open(rules, "w") as file:
    file.write('[r]\nnotify_type="2"\nnotify_eps="0"\nnotify_pri="0"\nnotify_pat="<00"\nnotify_enable="1"\n')
definitions = "SELECT name || ifnull(sql, '') FROM sqlite_schema UNION ALL SELECT idx || stat FROM sqlite_stat1"
daemon = start()
try:
    framed, plain = (eventually(lambda: socket.create_connection(("127.0.0.1", each))) for each in (port + 1, port))
    messages = {}
    for number in range(5000):
        fields = value(), value(), b"<%05d>" % number + value()
        frame = b"<13>1 2026-11-21T10:00:00.%05d+00:00 %s %s - - - %s" % (number, *fields)
        if number % 2 and not set(frame) & set(b"\n\0\r"):  # each may end a message here
            plain.sendall(frame + b"\n")
        else:
            framed.sendall(b"%d %s" % (len(frame), frame))
        messages[number] = frame, *fields
        if number == 0:
            before = eventually(lambda: query("SELECT 1 FROM logs") and query(definitions))
    eventually(lambda: query("SELECT count(*) FROM logs") == [(len(messages),)])
    hosts = query("SELECT host, count(*) FROM logs GROUP BY host")
    eventually(lambda: counted(daemon, hosts))
finally:
    daemon.terminate()
    daemon.wait()
rows = query("SELECT host, prog, msg FROM logs ORDER BY id")
for row in rows:
    check(messages, *row)
assert not messages and query(definitions) == before and query("PRAGMA integrity_check") == [(b"ok",)]
recorded = query(f"SELECT event FROM log ORDER BY id LIMIT 1, {NOTICES}", events)
assert len(recorded) == NOTICES and set(recorded) <= {(event(text),) for _, _, text in rows if b"<00" in text}
for host, program, text in random.sample(rows, 60):
    names = {b"--host=": host, b"--program=": program}  # a comma would separate two of them
    filters = [option + name for option, name in names.items() if name and b"," not in name]
    assert quorlog("count", "--db=" + db, b"--keyword=" + text, *filters) == b"1\n", (filters, text)
    assert quorlog("stats", "device", "--format=csv", "--", host).endswith(b",%d\r\n" % dict(hosts)[host]), host
shutil.rmtree(folder)
