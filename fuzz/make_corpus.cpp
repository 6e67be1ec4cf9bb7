// Writes the corpora's seeds anew: make_corpus <directory of the corpora>. Inputs that once broke
// something lie beside them under names of their own and are left alone.

#include <cstdio>
#include <fstream>
#include <functional>
#include <string>

#include <flatbuffers/flexbuffers.h>

#include "platform/linux/blackbox/record_frame.h"
#include "platform/linux/wire/message_builder.h"
#include "session/entry_codec.h"

namespace {

using flexbuffers::Builder;

std::string directory;

void keep(const std::string& name, const std::string& bytes) {
  std::ofstream(directory + "/" + name, std::ios::binary) << bytes;
}

void keepMessage(const std::string& name, const std::function<void(Builder&)>& fill,
                 flexbuffers::BuilderFlag flags = flexbuffers::BUILDER_FLAG_SHARE_KEYS) {
  Builder builder(256, flags);
  builder.Map([&] { fill(builder); });
  builder.Finish();
  keep("message_fuzzer/" + name, {builder.GetBuffer().begin(), builder.GetBuffer().end()});
}

std::string frame(zal::FrameKind kind, std::uint64_t cookie, std::string_view payload) {
  std::string bytes;
  zal::FrameHeader header;
  header.kind = kind;
  header.cookie = cookie;
  zal::appendFrame(bytes, header, payload);
  return bytes;
}

/// The chunk sizes less one, then the stream.
std::string cut(std::string sizes, const std::string& stream) {
  return std::string(1, static_cast<char>(sizes.size())) + sizes + stream;
}

void makeFrames() {
  using zal::FrameKind;
  const std::string one = frame(FrameKind::message, 0, "payload");
  const std::string barrier = frame(FrameKind::barrier, 0x1122334455667788U, "");
  keep("frame_fuzzer/whole", cut("\xFF", one + barrier + one));
  keep("frame_fuzzer/single_bytes",
       cut(std::string(1, '\0'), one + frame(FrameKind::messageExpectingReply, 9, "eightchr")));
  keep("frame_fuzzer/torn", cut("\x06\x11", (one + one + one).substr(0, 60)));
  keep("frame_fuzzer/answers",
       cut("\x0F", frame(FrameKind::reply, 1, "r") + frame(FrameKind::barrierPassed, 2, "")));
  std::string bad = one;
  bad[4] = 2;
  keep("frame_fuzzer/unknown_version", cut("\x07", one + bad + one));
  bad = one;
  bad[6] = 5;
  keep("frame_fuzzer/unknown_kind", cut("\x07", bad));
  bad = one;
  bad[3] = '\x7F';
  keep("frame_fuzzer/huge_length", cut("\x07", bad));
  bad = barrier;
  bad[0] = 8;
  keep("frame_fuzzer/barrier_with_payload", cut("\x03", bad));
  keep("frame_fuzzer/largest", cut("\xFF\x10", frame(FrameKind::message, 0, std::string(4096, 'L')) + one));
}

void makeMessages() {
  zal::MessageBuilder builder;
  builder.setInt64("__ipc__event_code__", 6);
  builder.setString("description", "rtt");
  builder.setCodedNumber("number", 12.5);
  builder.setString("session", "Vistel");
  builder.setString("sender", "callservice");
  std::string bytes;
  builder.finish(bytes, zal::FrameKind::message, 0);
  keep("message_fuzzer/metric", bytes.substr(zal::kFrameHeaderSize));
  keepMessage("empty", [](Builder&) {});
  keepMessage("every_type", [](Builder& b) {
    b.Null("null");
    b.Bool("bool", true);
    b.Int("int", -1);
    b.UInt("uint", 1U << 31U);
    b.Double("real", 0.1);
    b.Float("short", 0.5F);
    b.IndirectInt("indirectInt", -5000);
    b.IndirectUInt("indirectUInt", 5000);
    b.IndirectDouble("indirectReal", 0.2);
    b.String("text", "t\xC3\xBC\xFF");
    b.Key("blob");
    b.Blob("\x05\x04\x01", 3);
  });
  keepMessage("user_info", [](Builder& b) {
    b.Map("userInfo", [&] {
      b.Vector("list", [&] {
        b.String("x");
        b.Map([&] { b.Int("deep", 1); });
      });
      b.TypedVector("ints", [&] {
        b.Int(1);
        b.Int(300);
      });
      const double pair[] = {0.5, 0.25};
      b.Key("pair");
      b.FixedTypedVector(pair, 2);
    });
  });
  keepMessage(
      "shared",
      [](Builder& b) {
        b.Vector("userInfo", [&] {
          for (int i = 0; i < 5; ++i) b.Map([&] { b.String("same", "same"); });
        });
      },
      flexbuffers::BUILDER_FLAG_SHARE_ALL);
  keepMessage("control_characters", [](Builder& b) { b.String("k\n", "a\nb\x1b[0m\xE2\x80\xAE"); });
}

std::string piece(const zal::SessionEntry& entry) {
  std::string bytes;
  zal::encodeEntry(entry, bytes);
  return bytes;
}

void makeRecords() {
  using zal::SessionEntryKind;
  const std::string begin = piece({.kind = SessionEntryKind::begin, .sender = "caller"});
  const std::string description = piece({.kind = SessionEntryKind::description,
                                         .text = "Offer",
                                         .log = "v=0",
                                         .sender = "caller",
                                         .time = 0.1});
  const std::string metric =
      piece({.kind = SessionEntryKind::metric, .text = "rtt", .sender = "caller", .value = 20.5});
  const std::string role = piece({.kind = SessionEntryKind::role, .value = true});
  const auto keepPiece = [](const std::string& name, const std::string& bytes) {
    keep("black_box_fuzzer/" + name, std::string(1, '\0') + bytes);
  };
  keepPiece("begin", begin);
  keepPiece("description", description);
  keepPiece("metric", metric);
  keepPiece("role", role);
  std::string file;
  for (const std::string& each : {begin, role, description, metric}) zal::appendRecordFrame(file, 1, each);
  const auto keepFile = [](const std::string& name, const std::string& bytes) {
    keep("black_box_fuzzer/" + name, "\x01" + bytes);
  };
  keepFile("whole", file);
  keepFile("torn", file.substr(0, file.size() - 3));
  keepFile("never_written_room", file + std::string(64, '\0'));
  std::string damaged = file;
  damaged[40] ^= 1;
  keepFile("damaged_middle", damaged);
  damaged[file.size() / 2] ^= 1;
  keepFile("damaged_twice", damaged);
  keepFile("another_files", file.substr(0, 20) + file);
}

/// The first byte says how the text is read.
void keepText(const std::string& name, char selector, const std::string& text) {
  keep(name, std::string(1, selector) + text);
}

void makeConfigurations() {
  keepText("configuration_fuzzer/empty", 0, "");
  keepText("configuration_fuzzer/usual", 0,
           "[roots]\nUserLogRoot = \"~/logs\"\n[log]\ncategories = [\"IPC\"]\nrotationSize = 8388608\n"
           "[commands]\nprofile = \"literal\"\n\"console.top\" = \"top -b\"\n");
  keepText("configuration_fuzzer/wrong_values", 0,
           "[roots]\nStateRoot = \"there\"\nnone = 1\n[ipc]\nmaximumPayload = 12\n[log]\nrotationSize = 1e9\n"
           "[commands]\nsystemLogReader = \"a/b\"\n[\"sec\\ntion\"]\n\"k\\u001b\" = 1\n");
  keepText("configuration_fuzzer/broken", 0, "[log]\nrotationSize = \n[[[");
  keepText("configuration_fuzzer/deep", 0, "a = " + std::string(300, '[') + std::string(300, ']'));
  keepText("configuration_fuzzer/no_text", 0, "[log]\njournalSocket = \"/\xFF\xFE\"\n");
  keepText("configuration_fuzzer/switches", 1, "# mine\nCallLogging = false # why\na=true\n[more]\nx = 1\n");
  keepText("configuration_fuzzer/value_of_lines", 1, "a = [\n 1,\n 2 ]\nCallLogging.x = 1\n");
  keepText("configuration_fuzzer/section_in_place", 1, "[CallLogging]\nx = 1\n[a.b]\n");
  keepText("configuration_fuzzer/no_line_end", 1, "a = 1 # \xC3\xBC\r\n\"CallLogging\" = true");
}

void makePropertyLists() {
  const std::string begin = "<?xml version=\"1.0\"?><plist version=\"1.0\"><dict>";
  const std::string end = "</dict></plist>";
  keep("property_list_fuzzer/version",
       begin + "<key>ProductName</key><string>Phone</string><key>Build</key><string>1A2</string>" + end);
  keep("property_list_fuzzer/other_values",
       begin + "<key>n</key><integer>1</integer><key>t</key><true/><key>d</key><dict/><key>s</key><string/>" +
           end);
  keep("property_list_fuzzer/twice",
       begin + "<key>k</key><string>1</string><key>k</key><string>2</string>" + end);
  keep("property_list_fuzzer/references",
       begin + "<key>&lt;&#13;&#x1;</key><string>&amp;&#xFFFE;<![CDATA[a]]>b</string>" + end);
  keep("property_list_fuzzer/entities", "<!DOCTYPE p [<!ENTITY a \"aa\"><!ENTITY b \"&a;&a;\">]>" + begin +
                                            "<key>k</key><string>&b;</string>" + end);
  keep("property_list_fuzzer/torn", begin + "<key>k</key><str");
  keep("property_list_fuzzer/no_list", "<dict><key>k</key><string>v</string></dict>");
}

void makeNames() {
  keep("name_fuzzer/dashed", "log-baseband-2024-05-02-14-03-16-end.tar");
  keep("name_fuzzer/compact", "system-2024-05-02-140316.logarchive");
  keep("name_fuzzer/no_date", "log-2024-02-30-25-61-61-x");
  keep("name_fuzzer/leap", "2024-02-29-235960 2023-02-29-000000");
  keep("name_fuzzer/ends_early", "log-2024-05-02-14-03-1");
  keep("name_fuzzer/first_and_last", "0001-01-01-00-00-00 9999-12-31-23-59-59 0000-00-00-000000");
}

void makeAlerts() {
  const std::string record =
      "title = \"T\"\nmessage = \"M\"\ndefaultButton = \"Yes\"\nalternateButton = \"No\"\nposted = "
      "1714651396255\n"
      "agentProcess = 77\nagentStart = 123456\n";
  keepText("alert_fuzzer/waiting", 0, record + "state = \"waiting\"\n");
  keepText(
      "alert_fuzzer/answered", 0,
      record +
          "state = \"answered\"\ntimeout = 1e3\nlevel = 2\n[response]\nbutton = \"other\"\ntext = \"t\"\n"
          "[textField]\ntitle = \"\"\n[information]\nk = \"v\"\n");
  keepText("alert_fuzzer/out_of_range", 0,
           "posted = 9223372036854775807\nagentProcess = -1\nagentStart = -1\nstate = \"waiting\"\n");
  keepText("alert_fuzzer/answer", 1, "button = \"default\"\ntext = \"broken again\"\n");
  keepText("alert_fuzzer/no_such_button", 1, "button = \"\\u001b[0m\"\n");
  keepText("alert_fuzzer/text_is_none", 1, "button = \"cancel\"\ntext = 5\n");
  keepText("alert_fuzzer/broken", 1, "button = \"cancel\n");
  keepText("alert_fuzzer/dialog_ok", 2, "typed\n");
  keepText("alert_fuzzer/dialog_label", 2 + 21, "Later\n");
  keepText("alert_fuzzer/dialog_no_display", 2 + 1, std::string("\0cannot open Display :0\n", 24));
  keepText("alert_fuzzer/dialog_killed", static_cast<char>(2 - 9), "");
}

}  // namespace

int main(int count, char** arguments) {
  if (count != 2) {
    std::fprintf(stderr, "usage: make_corpus DIRECTORY\n");
    return 2;
  }
  directory = arguments[1];
  makeFrames();
  makeMessages();
  makeRecords();
  makeConfigurations();
  makePropertyLists();
  makeNames();
  makeAlerts();
}
