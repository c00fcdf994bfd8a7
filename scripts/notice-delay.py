"""Messages that match a rule, one a second from hosts of their own, and the time until the webhook hears of each.
Usage: notice-delay.py SYSLOG_PORT WEBHOOK_PORT KEYWORD COUNT"""
import http.server
import json
import re
import socket
import sys
import threading
import time

syslog_port, webhook_port, keyword, count = int(sys.argv[1]), int(sys.argv[2]), sys.argv[3], int(sys.argv[4])
sent, heard = {}, {}


class Webhook(http.server.BaseHTTPRequestHandler):
    def do_POST(self):
        now = time.monotonic()
        notice = json.loads(self.rfile.read(int(self.headers["Content-Length"])))
        for number in re.findall(keyword + r" (\d+)", notice["body"]):
            heard.setdefault(int(number), now)
        self.send_response(204)
        self.end_headers()

    def log_message(self, *_):
        pass


server = http.server.ThreadingHTTPServer(("127.0.0.1", webhook_port), Webhook)
threading.Thread(target=server.serve_forever, daemon=True).start()
connection = socket.create_connection(("127.0.0.1", syslog_port))
for number in range(count):
    sent[number] = time.monotonic()
    connection.sendall(f"<13>Nov 21 10:00:00 marked-{number} marked: {keyword} {number}\n".encode())
    time.sleep(1)
end = time.monotonic() + 20
while len(heard) < count and time.monotonic() < end:
    time.sleep(0.1)
delays = sorted((heard[number] - sent[number]) * 1000 for number in heard)
print(f"{len(heard)} of {count} notices; median {delays[len(delays) // 2]:.0f} ms, 99 in 100 within "
      f"{delays[min(len(delays) - 1, len(delays) * 99 // 100)]:.0f} ms" if heard else "no notice")
sys.exit(0 if len(heard) == count else 1)
