"""A daemon on a message bus that answers what a file says, word by word.

    played_daemon.py NAME FILE

Each line of the file is a call, a tab, and its answer as a tuple in GVariant text:

    /path interface.Method<TAB>('answer', uint32 7)
    /path interface.Method("first argument", ...)<TAB>(<5>,)     only with those arguments
    /path interface.Method<TAB>!org.example.Error.Name           an error
    /path interface.Method<TAB>?                                 no answer at all

The file is read at each call, so that a test changes the answers by replacing it. Calls that it does not
know are refused. Every call is noted in FILE.calls, one line each.
"""
import json
import os
import sys

from gi.repository import Gio, GLib

NAME, FILE = sys.argv[1:]
BUS = Gio.DBusConnection.new_for_address_sync(
    os.environ["DBUS_SYSTEM_BUS_ADDRESS"],
    Gio.DBusConnectionFlags.AUTHENTICATION_CLIENT | Gio.DBusConnectionFlags.MESSAGE_BUS_CONNECTION, None, None)


def answer_to(message):
    body = message.get_body()
    arguments = ", ".join(json.dumps(part) for part in body.unpack()) if body is not None else ""
    call = f"{message.get_path()} {message.get_interface()}.{message.get_member()}"
    with open(FILE + ".calls", "a", encoding="utf-8") as notes:
        notes.write(f"{call}({arguments})\n")
    with open(FILE, encoding="utf-8") as lines:
        answers = dict(line.rstrip("\n").split("\t", 1) for line in lines if "\t" in line)
    return answers.get(f"{call}({arguments})", answers.get(call, "!org.freedesktop.DBus.Error.UnknownMethod"))


def reply(_connection, message, is_incoming):
    if not is_incoming or message.get_message_type() != Gio.DBusMessageType.METHOD_CALL:
        return message
    answer = answer_to(message)
    if answer.startswith("!"):
        BUS.send_message(Gio.DBusMessage.new_method_error_literal(message, answer[1:], "played"),
                         Gio.DBusSendMessageFlags.NONE)
    elif answer != "?":
        sent = Gio.DBusMessage.new_method_reply(message)
        sent.set_body(GLib.Variant.parse(None, answer))
        BUS.send_message(sent, Gio.DBusSendMessageFlags.NONE)
    return None


BUS.add_filter(reply)
BUS.call_sync("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "RequestName",
              GLib.Variant("(su)", (NAME, 0)), None, Gio.DBusCallFlags.NONE, -1, None)
GLib.MainLoop().run()
