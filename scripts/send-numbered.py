"""Sends numbered lines over TCP and prints how many were sent. A connection that was closed is made again; what was handed
to it is not repeated.
Usage: send-numbered.py PORT NAME LINES [CONNECTIONS [LINES_A_SECOND]]   (0: as fast as they are taken)"""
import socket
import sys
import threading
import time

port, name, lines = int(sys.argv[1]), sys.argv[2], int(sys.argv[3])
connections = int(sys.argv[4]) if len(sys.argv) > 4 else 1
rate = int(sys.argv[5]) if len(sys.argv) > 5 else 0
PIECE = 100
PADDING = "x" * 120


def text(first, end):
    return "".join(f"<13>Nov 21 10:00:00 host-{i % 50} {name}: number {i:09} {PADDING}\n" for i in range(first, end)).encode()


def connect():
    while True:
        try:
            return socket.create_connection(("127.0.0.1", port))
        except OSError:
            time.sleep(0.02)


def is_closed(connection):
    try:
        return connection.recv(1, socket.MSG_DONTWAIT) == b""
    except BlockingIOError:
        return False
    except OSError:
        return True


def send(first, end):
    pieces = [text(i, min(i + PIECE, end)) for i in range(first, end, PIECE)]
    connection = connect()
    begin = time.monotonic()
    for number, piece in enumerate(pieces):
        if rate:
            time.sleep(max(0, begin + number * PIECE * connections / rate - time.monotonic()))
        if is_closed(connection):
            connection.close()
            connection = connect()
        try:
            connection.sendall(piece)
        except OSError:
            pass  # noticed before the next piece
    connection.close()


threads = [threading.Thread(target=send, args=(lines * i // connections, lines * (i + 1) // connections)) for i in range(connections)]
for thread in threads:
    thread.start()
for thread in threads:
    thread.join()
print(lines)
