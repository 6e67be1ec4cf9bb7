"""oFono as lirra-modemdump sees it, for python3-dbusmock: one modem that has a SIM and nothing else."""

import dbus

BUS_NAME = "org.ofono"
MAIN_OBJ = "/"
MAIN_IFACE = "org.ofono.Manager"
SYSTEM_BUS = True

MODEMS = "ret = [(dbus.ObjectPath('/ril_0'), dbus.Dictionary({'Powered': True}, signature='sv'))]"
SIM = "ret = dbus.Dictionary({'Present': True, 'MobileCountryCode': '001'}, signature='sv')"


def load(mock, _parameters):
    mock.AddMethod(MAIN_IFACE, "GetModems", "", "a(oa{sv})", MODEMS)
    mock.AddObject("/ril_0", "org.ofono.SimManager", {}, [("GetProperties", "", "a{sv}", SIM)])
