"""Shows the mails that the debugging handler of aiosmtpd wrote to a file, with their bodies decoded."""
import email
import email.policy
import sys

BEGIN = "---------- MESSAGE FOLLOWS ----------\n"
END = "------------ END MESSAGE ------------\n"

with open(sys.argv[1], encoding="utf-8", errors="replace") as file:
    parts = file.read().split(BEGIN)[1:]
for part in parts:
    mail = email.message_from_string(part.split(END)[0], policy=email.policy.default)
    for header in ("From", "To", "Subject"):
        print(f"{header}: {mail[header]}")
    body = mail.get_body() or mail
    text = body.get_content().rstrip()
    print("".join(c if c.isprintable() or c == "\n" else f"\\x{ord(c):02x}" for c in text), end="\n\n")
