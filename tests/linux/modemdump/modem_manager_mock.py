"""ModemManager as lirra-modemdump sees it, for python3-dbusmock: one modem; every level that it is told
to log at is a line of the file that the parameter "levels" names. "refuses" makes it refuse them."""

import dbus

BUS_NAME = "org.freedesktop.ModemManager1"
MAIN_OBJ = "/org/freedesktop/ModemManager1"
MAIN_IFACE = "org.freedesktop.ModemManager1"
SYSTEM_BUS = True
IS_OBJECT_MANAGER = True

NOTE = """
with open(%r, 'a') as levels:
    levels.write(args[0] + chr(10))
"""
REFUSE = "raise dbus.exceptions.DBusException('not allowed', name='org.freedesktop.ModemManager1.Error.Core.Failed')"
CELLS = "ret = dbus.Array([dbus.Dictionary({'serving': True, 'tac': '2A'}, signature='sv')], signature='a{sv}')"


def load(mock, parameters):
    note = NOTE % parameters["levels"]
    mock.AddMethod(MAIN_IFACE, "SetLogging", "s", "", note + (REFUSE if parameters.get("refuses") else ""))
    mock.AddObject(
        MAIN_OBJ + "/Modem/0",
        MAIN_IFACE + ".Modem",
        {
            "Model": "a \"model\"\twith\x07",
            "SignalQuality": dbus.Struct((dbus.UInt32(80), dbus.Boolean(True)), signature="ub"),
            "CurrentBands": dbus.Array([5, 31], signature="u"),
            "State": dbus.Int32(-1),
            "Rate": dbus.Double(0.5),
            "Largest": dbus.UInt64(18446744073709551615),
            "Ports": dbus.Array([], signature="(su)"),
        },
        [("GetCellInfo", "", "aa{sv}", CELLS)],
    )
