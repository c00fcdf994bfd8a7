"""syslog-ng's control socket: control.py SOCKET ANSWER answers every connection with what the file ANSWER holds."""
import socket, sys

server = socket.socket(socket.AF_UNIX)
server.bind(sys.argv[1])
server.listen()
while True:
    connection = server.accept()[0]
    if connection.recv(100) == b"STATS\n":
        with open(sys.argv[2], "rb") as answer:
            connection.sendall(answer.read())
    connection.close()
