"""syslog-ng's control socket: control.py SOCKET ANSWER answers every connection with what the file ANSWER holds."""
import socket, sys

server = socket.socket(socket.AF_UNIX)
server.bind(sys.argv[1])
server.listen()
while True:
    with server.accept()[0] as connection, open(sys.argv[2], "rb") as answer:
        try:
            if connection.recv(100) == b"STATS\n":
                connection.sendall(answer.read())
        except OSError:
            pass  # who asked was killed
