#include "collectors/command_rows.h"

namespace zal::command_rows {
namespace {

constexpr CommandRow kHandoverRows[] = {
    {"launchpath.hoverd-status", "/usr/local/bin/hovertool status", {}, "hoverd-status.txt"},
};

constexpr CommandRow kSharingRows[] = {
    {"sharing.acctauth-status", "/usr/local/bin/acctauth status", {}, "acctauth-status.txt"},
};

constexpr CommandRow kRegistrationRows[] = {
    {"registration.zaltool-list", "/usr/local/bin/zaltool list", {}, "zaltool.txt"},
    {"registration.nexatool-list", "/usr/local/bin/nexatool list", {}, "nexatool.txt"},
    {"registration.zaltool-info", "/usr/local/bin/zaltool info", {}, "zaltool-info.txt"},
    {"registration.nexad-info", "/usr/bin/killall -INFO nexad", {}, "nexad-info.txt"},
    {"registration.nexatool-skypairing-devices",
     "/usr/local/bin/nexatool devices -s com.vendel.private.braid.skypairing",
     {},
     "nexa-skypairing-devices.txt"},
    {"registration.nexatool-quillet-devices",
     "/usr/local/bin/nexatool devices -s com.vendel.torvik",
     {},
     "nexa-quillet-devices.txt"},
    {"registration.nexad-info-again", "/usr/bin/killall -INFO nexad", {}, "nexad-info.txt"},
    {"registration.le-devices", "/usr/bin/prefread read com.vendel.PocketBluetooth.ledevices PairedDevices",
     "timeout 5 bluetoothctl devices Paired", "le-devices.txt"},
};

constexpr CommandRow kSystemLogsRows[] = {
    {"system.vaultq-inet", "/usr/local/bin/vaultq item class=inet", "timeout 20 {tools}/secretlist inet",
     "vaultq-dump-inet.txt"},
    {"system.vaultq-keys", "/usr/local/bin/vaultq item class=keys",
     "{ timeout 20 {tools}/secretlist keys; timeout 10 keyctl show; }", "vaultq-dump-keys.txt"},
    {"system.vaultq-cert", "/usr/local/bin/vaultq item class=cert",
     "timeout 20 trust list --filter=certificates", "vaultq-dump-cert.txt"},
    {"system.syslog", "/usr/bin/tessel -k Time ge -10m", "{tools}/{reader} -k Time ge -10m", "syslog.log"},
};

constexpr CommandRow kBluetoothRows[] = {
    {"bluetooth.kill-corvell", "/usr/bin/killall -USR2 Corvell", "/usr/bin/killall -USR2 bluetoothd",
     "kill_corvell_usr2_command.txt"},
};

constexpr CommandRow kPushServiceRows[] = {
    {"push.pushprobe-state", "/usr/local/bin/pushprobe -dumpState", {}, "pushprobe_state.txt"},
};

}  // namespace

const std::span<const CommandRow> kHandover = kHandoverRows;
const std::span<const CommandRow> kSharing = kSharingRows;
const std::span<const CommandRow> kRegistration = kRegistrationRows;
const std::span<const CommandRow> kSystemLogs = kSystemLogsRows;
const std::span<const CommandRow> kBluetooth = kBluetoothRows;
const std::span<const CommandRow> kPushService = kPushServiceRows;

}  // namespace zal::command_rows
