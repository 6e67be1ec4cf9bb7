#include "platform/linux/wire/scalar_blob.h"

#include <bit>

#include <flatbuffers/flexbuffers.h>

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

struct Scalar {
  flexbuffers::Type type;
  flexbuffers::BitWidth width;
  std::uint64_t bits;
};

struct ScalarOf {
  Scalar operator()(std::int64_t value) const {
    return {flexbuffers::FBT_INT, flexbuffers::WidthI(value), static_cast<std::uint64_t>(value)};
  }
  Scalar operator()(std::uint64_t value) const {
    return {flexbuffers::FBT_UINT, flexbuffers::WidthU(value), value};
  }
  Scalar operator()(double value) const {
    return {flexbuffers::FBT_FLOAT, flexbuffers::BIT_WIDTH_64, std::bit_cast<std::uint64_t>(value)};
  }
  Scalar operator()(bool value) const {
    return {flexbuffers::FBT_BOOL, flexbuffers::BIT_WIDTH_8, value ? 1U : 0U};
  }
};

}  // namespace

ScalarBlob::ScalarBlob(const Number& number) {
  const Scalar scalar = std::visit(ScalarOf{}, number);
  const std::size_t width = std::size_t{1} << scalar.width;
  storeLittle(_bytes.data(), scalar.bits, width);
  _bytes[width] = static_cast<char>(flexbuffers::PackedType(scalar.width, scalar.type));
  _bytes[width + 1] = static_cast<char>(width);
  _size = width + 2;
}

}  // namespace zal
