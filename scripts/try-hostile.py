"""Hostile messages through the real syslog-ng with the shipped configuration: each becomes one row that holds what was
sent, quorlogd counts it and records what a rule matches, quorlog finds it, and the tables stay what they were.
Usage: try-hostile.py SOURCE_FOLDER BUILD_FOLDER"""
import os
import random
import re
import shutil
import signal
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
DEVICES = 256  # that one address may name a day
random.seed(2024)


def value():
    return b"".join(random.choices(PIECES, k=random.randrange(8))) or b"-"


def start():
    """syslog-ng and quorlogd, by the functions that the scripts use; their process numbers."""
    command = f". scripts/receive.sh; start_syslog_ng {folder} {port} {db}; start_quorlogd {build} {db}; echo $syslog_ng $quorlogd"
    return [int(pid) for pid in subprocess.run(["bash", "-c", command], cwd=source, stdout=subprocess.PIPE, check=True).stdout.split()]


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
    sys.exit("try-hostile.py: something did not happen within twenty seconds; see " + folder)


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
    assert host == (b"127.0.0.1" if fields[0] == b"-" else words[0]) and program == words[1] * (words[1] != b"-"), frame
    assert text == re.sub(rb"[\r\n\0]", b" ", fields[2].rstrip(b"\n\0")), frame


def event(text):
    text = re.sub(rb"[\x00-\x1f\x7f]", b" ", text)
    return (b"Event detection: Received log which contains [<00]. Log content: [%s]" % text).replace(b"<", "\u2039".encode())


def counted(hosts):
    os.kill(quorlogd, signal.SIGUSR2)
    return all(query(f"SELECT device, {counts} ORDER BY device", accounting) == hosts
               for counts in ("count FROM histogram", "sum(eps) FROM eps GROUP BY device"))


def quorlog(*arguments):
    return subprocess.run([build + "/tools/quorlog/quorlog", *arguments], stdout=subprocess.PIPE).stdout


# What arrives in shapes of its own, on the plain and the framed port: level, host, program, process, message id, the
# start and the end of the text.
HEAD, OLD, ONE = b"<11>1 2026-11-21T10:00:00Z h app 7 ID9 ", b"<11>Nov 21 10:00:00 h ", b"<11>1 - h app 7 - - one"
SHAPES = [
    (0, HEAD + b'[a@1 b="c"] text\n', b"err", b"h", b"app", b"7", b"ID9", b"text", b"text"),
    (0, HEAD + b'[a@1 b="c"]\n', b"err", b"h", b"app", b"7", b"ID9", b"[a@1 b=", b'"c"]'),
    (0, OLD + b"app[7]: old\n", b"err", b"h", b"app", b"7", b"", b"old", b"old"),
    (0, b"Nov 21 10:00:00 forged app: bare\n", b"notice", b"127.0.0.1", b"", b"", b"", b"Nov 21 ", b"bare"),
    (0, b"<11>1 - h %s 7 - - long\n" % (b"p" * 48), b"err", b"h", b"p" * 48, b"7", b"", b"long", b"long"),
    (0, OLD + b"%s: old\n" % (b"p" * 999), b"err", b"h", b"p" * 252 + b"...", b"", b"", b"old", b"old"),
    (0, b"%d %s\n" % (len(ONE) + 1, ONE), b"err", b"h", b"app", b"7", b"", b"one", b"one"),
    (0, b"%d %s%d %s" % (2 * (len(ONE), ONE)), b"err", b"127.0.0.1", b"syslog-ng", b"", b"", b"Octet-counted", b"- one"),
    (1, b"30 " + OLD + b"app: old", b"err", b"h", b"app", b"", b"", b"old", b"old"),
    (1, b"%d %s" % (400000 + len(HEAD), HEAD + b"- " + 399998 * b"x"), b"err", b"h", b"app", b"7", b"ID9", b"xxx", b"xx [cut at 262144 bytes]"),
]


def send_shapes():
    for framed, data, *_ in SHAPES:
        with socket.create_connection(("127.0.0.1", port + framed)) as connection:
            connection.sendall(data)


def check_shapes(rows):
    for (_, data, *fields, first, last) in SHAPES:
        assert any(list(row[:5]) == fields and row[5].startswith(first) and row[5].endswith(last) for row in rows), data[:99]


for path in (accounting, events, rules):
    shutil.rmtree(os.path.dirname(path), ignore_errors=True)
    os.makedirs(os.path.dirname(path))
with open(rules, "w") as file:
    file.write('[r]\nnotify_type="2"\nnotify_eps="0"\nnotify_pri="0"\nnotify_pat="<00"\nnotify_enable="1"\n')
definitions = "SELECT name || ifnull(sql, '') FROM sqlite_schema UNION ALL SELECT idx || stat FROM sqlite_stat1"
syslog_ng, quorlogd = start()
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
    send_shapes()
    eventually(lambda: query("SELECT count(*) FROM logs") == [(len(messages) + len(SHAPES),)])
    names = query("SELECT host, count(*) FROM logs GROUP BY host ORDER BY min(id)")
    others = sum(count for _, count in names[DEVICES:])
    hosts = sorted(names[:DEVICES] + [(b"(other devices)", others)])
    eventually(lambda: counted(hosts))
finally:
    for process in (syslog_ng, quorlogd):
        os.kill(process, signal.SIGTERM)
        eventually(lambda: not os.path.exists(f"/proc/{process}"))
rows = query("""SELECT host, prog, msg, ldate || ' ' || ltime || ' ' || prog || iif(pid = '', '', '[' || pid || ']')
    FROM logs ORDER BY id LIMIT 5000""")
for row in rows:
    check(messages, *row[:3])
check_shapes(query("SELECT prio, host, prog, pid, msgid, msg FROM logs WHERE id > 5000"))
assert not messages and query(definitions) == before and query("PRAGMA integrity_check") == [(b"ok",)]
recorded = query(f"SELECT event FROM log ORDER BY id LIMIT 1, {NOTICES}", events)
expected = {(event(b"%s: %s: %s" % (host, head, text)),) for host, _, text, head in rows if b"<00" in text}
assert len(recorded) == NOTICES and set(recorded) <= expected, set(recorded) - expected
for host, program, text, _ in random.sample(rows, 60):
    names = {b"--host=": host, b"--program=": program}  # a comma would separate two of them
    filters = [option + name for option, name in names.items() if name and b"," not in name]
    assert quorlog("count", "--db=" + db, b"--keyword=" + text, *filters) == b"1\n", (filters, text)
    count = dict(hosts).get(host)
    assert count is None or quorlog("stats", "device", "--format=csv", "--", host).endswith(b",%d\r\n" % count), host
shutil.rmtree(folder)
