"""A mail or web server on loopback: servers.py smtp|smtp-starttls|smtp-tls|http|https MOOD FOLDER [CERTIFICATE KEY]

MOOD is good, slow (1.5 s before an answer), stuck (never answers) or refuse. Prints its port, ends with its standard
input, and writes what real parsers made of each message to FOLDER/1, FOLDER/2 ... with the most sessions at a time, its
body to FOLDER/1.body ..."""
import asyncio, email, email.policy, json, os, ssl, sys
from aiosmtpd.smtp import SMTP, AuthResult

kind, mood, folder = sys.argv[1:4]
delay = {"slow": 1.5, "stuck": 600}.get(mood, 0)
received = sessions = most = 0


def keep(*lines, body=b""):
    global received
    received += 1
    for name, content in (f"{received}.body", body), (f"{received}", "\n".join(map(str, lines)).encode()):
        with open(f"{folder}/part", "wb") as file:
            file.write(content)
        os.rename(f"{folder}/part", f"{folder}/{name}")


async def session_begins():
    global sessions, most
    sessions += 1
    most = max(most, sessions)
    await asyncio.sleep(delay)


class Mails:
    async def handle_MAIL(self, server, session, envelope, address, options):
        await session_begins()
        envelope.mail_from = address
        return "250 OK"

    async def handle_RCPT(self, server, session, envelope, address, options):
        if mood == "refuse" or address.startswith("unknown@"):
            return "550 no such mailbox"
        envelope.rcpt_tos.append(address)
        return "250 OK"

    async def handle_DATA(self, server, session, envelope):
        global sessions
        mail = email.message_from_bytes(envelope.content, policy=email.policy.default)
        keep(most, envelope.mail_from, ",".join(envelope.rcpt_tos), getattr(session, "auth_data", None) or "-",
             ",".join(sorted(name.lower() for name in mail.keys())), len(mail.defects), mail["Subject"], mail["From"],
             mail["To"], int(mail["Date"].datetime.timestamp()), mail.get_content_charset(), mail["Message-ID"],
             body=mail.get_payload(decode=True))
        sessions -= 1
        return "250 OK"


def login(server, session, envelope, mechanism, data):
    good = (data.login, data.password) == (b"user", b'pass"word')
    return AuthResult(success=good, auth_data="user" if good else None)


async def answer_http(reader, writer):
    head = (await reader.readuntil(b"\r\n\r\n")).decode("latin-1").lower()
    fields = dict(line.split(": ", 1) for line in head.strip().split("\r\n")[1:])
    body = await reader.readexactly(int(fields["content-length"]))
    await session_begins()
    if mood != "refuse":
        json.loads(body.decode("utf-8"))
        keep(head.split(" ")[0], fields["content-type"], body=body)
    writer.write(b"HTTP/1.1 %s\r\nContent-Length: 0\r\n\r\n" % (b"500 No" if mood == "refuse" else b"204 OK"))
    writer.close()


async def main():
    loop = asyncio.get_running_loop()
    context, options = None, {}
    if len(sys.argv) > 4:
        context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
        context.load_cert_chain(*sys.argv[4:6])
    if kind.startswith("smtp-"):
        options = {"auth_required": True, "authenticator": login, "auth_require_tls": kind == "smtp-starttls"}
    if kind == "smtp-starttls":
        options.update(tls_context=context, require_starttls=True)
        context = None
    if kind.startswith("http"):
        server = await asyncio.start_server(answer_http, "127.0.0.1", 0, ssl=context)
    else:
        server = await loop.create_server(lambda: SMTP(Mails(), loop=loop, **options), "127.0.0.1", 0, ssl=context)
    print(server.sockets[0].getsockname()[1], end="", flush=True)
    await loop.run_in_executor(None, sys.stdin.read)
    os._exit(0)


asyncio.run(main())
