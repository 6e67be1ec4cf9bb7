#include "platform/linux/wire/message_builder.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <vector>

#include <flatbuffers/flexbuffers.h>

#include "platform/linux/wire/little_endian.h"
#include "platform/linux/wire/scalar_blob.h"

namespace zal {
namespace {

using flexbuffers::BitWidth;

constexpr std::size_t alignedTo(std::size_t position, std::size_t width) {
  return (position + width - 1) & ~(width - 1);
}

BitWidth widthOf(std::uint64_t value) { return flexbuffers::WidthU(value); }

/// One entry of the root map. Values that do not fit into the map itself lie in the data before it.
struct Field {
  std::string_view key;
  std::uint64_t bits = 0;   // the value, or its position in the data
  std::uint8_t packed = 0;  // type and width, as in the map's table of types
  bool inlined = false;
  BitWidth width = flexbuffers::BIT_WIDTH_8;  // least width of an inlined value
};

}  // namespace

/// The payload is laid out as: data of the values, keys, table of keys, map, root. With the keys next
/// to their table its offsets stay one byte wide however long the texts are.
struct MessageBuilder::State {
  std::string data;
  std::vector<Field> fields;
  flexbuffers::Builder nested{256, flexbuffers::BUILDER_FLAG_SHARE_KEYS};

  void add(const Field& field) {
    auto place = fields.end();
    while (place != fields.begin() && field.key < std::prev(place)->key) --place;
    fields.insert(place, field);
  }

  void addInlined(std::string_view key, flexbuffers::Type type, std::uint64_t bits, BitWidth width) {
    add({key, bits, static_cast<std::uint8_t>(type << 2), true, width});
  }

  /// A length, the bytes, and a zero after a string.
  void addBytes(std::string_view key, flexbuffers::Type type, std::string_view bytes) {
    const BitWidth width = widthOf(bytes.size());
    const std::size_t byteWidth = std::size_t{1} << width;
    const std::size_t length = alignedTo(data.size(), byteWidth);
    const std::size_t start = length + byteWidth;
    data.resize(start);
    storeLittle(data.data() + length, bytes.size(), byteWidth);
    data.append(bytes);
    if (type == flexbuffers::FBT_STRING) data.push_back('\0');
    add({key, start, flexbuffers::PackedType(width, type)});
  }

  /// A whole buffer's content: its offsets count back from where they stand, so it may move.
  void addNestedMap(std::string_view key, const std::vector<std::uint8_t>& buffer) {
    data.resize(alignedTo(data.size(), 8));
    const std::size_t rootWidth = buffer.back();
    const std::uint8_t packed = buffer[buffer.size() - 2];
    const std::size_t root = buffer.size() - 2 - rootWidth;
    const std::size_t map = root - flexbuffers::ReadUInt64(buffer.data() + root, buffer.back());
    const std::size_t start = data.size() + map;
    data.append(reinterpret_cast<const char*>(buffer.data()), root);
    add({key, start, packed});
  }
};

namespace {

void addValue(flexbuffers::Builder& to, const Value& value);

void addMap(flexbuffers::Builder& to, const ValueMap& map) {
  const std::size_t start = to.StartMap();
  const std::string* previous = nullptr;
  for (const auto& [key, value] : map) {
    // A key ends at its first zero byte; of keys that become the same one the first counts.
    if (previous != nullptr && std::strcmp(previous->c_str(), key.c_str()) == 0) continue;
    previous = &key;
    to.Key(key.c_str());
    addValue(to, value);
  }
  to.EndMap(start);
}

struct ValueAdder {
  flexbuffers::Builder& to;
  void operator()(std::nullptr_t) const { to.Null(); }
  void operator()(bool value) const { to.Bool(value); }
  void operator()(std::int64_t value) const { to.Int(value); }
  void operator()(std::uint64_t value) const { to.UInt(value); }
  void operator()(double value) const { to.Double(value); }
  void operator()(const std::string& value) const { to.String(value); }
  void operator()(const ValueMap& value) const { addMap(to, value); }
  void operator()(const ValueList& list) const {
    const std::size_t start = to.StartVector();
    for (const Value& element : list) addValue(to, element);
    to.EndVector(start, false, false);
  }
};

void addValue(flexbuffers::Builder& to, const Value& value) { std::visit(ValueAdder{to}, value.storage); }

}  // namespace

MessageBuilder::MessageBuilder() : _state(std::make_unique<State>()) {}
MessageBuilder::~MessageBuilder() = default;

void MessageBuilder::setString(std::string_view key, std::string_view value) {
  _state->addBytes(key, flexbuffers::FBT_STRING, value);
}

void MessageBuilder::setInt64(std::string_view key, std::int64_t value) {
  _state->addInlined(key, flexbuffers::FBT_INT, static_cast<std::uint64_t>(value),
                     flexbuffers::WidthI(value));
}

void MessageBuilder::setUInt64(std::string_view key, std::uint64_t value) {
  _state->addInlined(key, flexbuffers::FBT_UINT, value, widthOf(value));
}

void MessageBuilder::setReal(std::string_view key, double value) {
  // Always eight bytes, so that no other value of the map can narrow it and lose digits.
  _state->addInlined(key, flexbuffers::FBT_FLOAT, std::bit_cast<std::uint64_t>(value),
                     flexbuffers::BIT_WIDTH_64);
}

void MessageBuilder::setDictionary(std::string_view key, const ValueMap& value) {
  auto& nested = _state->nested;
  nested.Clear();
  addMap(nested, value);
  nested.Finish();
  _state->addNestedMap(key, nested.GetBuffer());
}

void MessageBuilder::setCodedNumber(std::string_view key, const Number& value) {
  const ScalarBlob blob(value);
  _state->addBytes(key, flexbuffers::FBT_BLOB, blob.bytes());
}

std::size_t MessageBuilder::finish(std::string& out, FrameKind kind, std::uint64_t cookie) {
  const State& state = *_state;
  const std::size_t count = state.fields.size();

  const std::size_t keysStart = state.data.size();
  std::size_t keysEnd = keysStart;
  for (const Field& field : state.fields) keysEnd += field.key.size() + 1;

  const BitWidth tableWidth = widthOf(keysEnd - keysStart + 9 * (count + 2));
  const std::size_t tableBytes = std::size_t{1} << tableWidth;
  const std::size_t table = alignedTo(keysEnd, tableBytes) + tableBytes;  // its length stands before it
  const std::size_t tableEnd = table + count * tableBytes;

  // No offset in the map can be longer than all that lies before its end.
  BitWidth mapWidth = widthOf(tableEnd + 8 * (count + 4));
  for (const Field& field : state.fields) {
    if (field.inlined) mapWidth = std::max(mapWidth, field.width);
  }
  const std::size_t mapBytes = std::size_t{1} << mapWidth;
  const std::size_t map = alignedTo(tableEnd, mapBytes) + 3 * mapBytes;
  const std::size_t types = map + count * mapBytes;
  const std::size_t root = types + count;
  const BitWidth rootWidth = widthOf(root + 8 - map);
  const std::size_t rootBytes = std::size_t{1} << rootWidth;
  const std::size_t rootStart = alignedTo(root, rootBytes);
  const std::size_t length = rootStart + rootBytes + 2;

  const std::size_t start = out.size();
  out.resize(start + frameSize(length));
  storeFrameHeader(out.data() + start, {static_cast<std::uint32_t>(length), kProtocolVersion, kind, cookie});
  char* const payload = out.data() + start + kFrameHeaderSize;

  if (keysStart != 0) std::memcpy(payload, state.data.data(), keysStart);
  storeLittle(payload + table - tableBytes, count, tableBytes);
  storeLittle(payload + map - 3 * mapBytes, map - 3 * mapBytes - table, mapBytes);
  storeLittle(payload + map - 2 * mapBytes, tableBytes, mapBytes);
  storeLittle(payload + map - mapBytes, count, mapBytes);
  std::size_t keyAt = keysStart;
  std::size_t tableAt = table;
  std::size_t mapAt = map;
  char* type = payload + types;
  for (const Field& field : state.fields) {
    std::memcpy(payload + keyAt, field.key.data(), field.key.size());
    storeLittle(payload + tableAt, tableAt - keyAt, tableBytes);
    storeLittle(payload + mapAt, field.inlined ? field.bits : mapAt - field.bits, mapBytes);
    *type++ = static_cast<char>(field.inlined ? field.packed | mapWidth : field.packed);
    keyAt += field.key.size() + 1;
    tableAt += tableBytes;
    mapAt += mapBytes;
  }
  storeLittle(payload + rootStart, rootStart - map, rootBytes);
  payload[rootStart + rootBytes] = static_cast<char>(flexbuffers::PackedType(mapWidth, flexbuffers::FBT_MAP));
  payload[rootStart + rootBytes + 1] = static_cast<char>(rootBytes);

  reset();
  return frameSize(length);
}

void MessageBuilder::reset() {
  _state->data.clear();
  _state->fields.clear();
}

std::string encodeDictionary(const ValueMap& value) {
  flexbuffers::Builder builder(256, flexbuffers::BUILDER_FLAG_SHARE_KEYS);
  addMap(builder, value);
  builder.Finish();
  const auto& buffer = builder.GetBuffer();
  return {reinterpret_cast<const char*>(buffer.data()), buffer.size()};
}

}  // namespace zal
