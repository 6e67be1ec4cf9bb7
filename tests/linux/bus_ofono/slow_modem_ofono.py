"""An oFono whose modem never answers what RadioSettings asks it; the rest is answered at once."""

import dbus
import dbus.lowlevel
import dbus.mainloop.glib
from gi.repository import GLib

ON = {"Powered": True, "Online": True}
MESSAGES = {"ServiceCenterAddress": "+15550001"}


def answer(connection, message):
    if message.get_type() != 1:  # a method call
        return dbus.lowlevel.HANDLER_RESULT_NOT_YET_HANDLED
    interface = message.get_interface()
    if interface == "org.freedesktop.DBus.Peer":
        return dbus.lowlevel.HANDLER_RESULT_NOT_YET_HANDLED
    if interface == "org.ofono.RadioSettings":
        return dbus.lowlevel.HANDLER_RESULT_HANDLED
    reply = dbus.lowlevel.MethodReturnMessage(message)
    if interface == "org.ofono.Manager":
        reply.append([("/slow_0", ON)], signature="a(oa{sv})")
    elif interface == "org.ofono.MessageManager":
        reply.append(MESSAGES, signature="a{sv}")
    else:
        reply = dbus.lowlevel.ErrorMessage(message, "org.freedesktop.DBus.Error.UnknownMethod", "no such one")
    connection.send_message(reply)
    return dbus.lowlevel.HANDLER_RESULT_HANDLED


dbus.mainloop.glib.DBusGMainLoop(set_as_default=True)
bus = dbus.SystemBus()
bus.add_message_filter(answer)
bus.request_name("org.ofono")
GLib.MainLoop().run()
