#include <iterator>

#include "client/lirra_handle.h"

namespace {

template <class Type, class Out>
lirra_result read(const lirra_dictionary* dictionary, const char* key, Out* out) {
  if (dictionary == nullptr || key == nullptr || out == nullptr) return LIRRA_INVALID;
  const auto found = dictionary->values.find(std::string_view(key));
  const Type* const value = found == dictionary->values.end() ? nullptr : found->second.as<Type>();
  if (value == nullptr) return LIRRA_ABSENT;
  *out = static_cast<Out>(*value);
  return LIRRA_OK;
}

template <class Type>
lirra_result store(lirra_dictionary* dictionary, const char* key, Type value) {
  if (dictionary == nullptr || key == nullptr) return LIRRA_INVALID;
  return lirra::guarded([&] {
    dictionary->inner.clear();
    dictionary->values.insert_or_assign(key, zal::Value(std::move(value)));
    return LIRRA_OK;
  });
}

}  // namespace

extern "C" {

lirra_dictionary* lirra_dictionary_create(void) {
  try {
    return new lirra_dictionary();
  } catch (...) {
    return nullptr;
  }
}

void lirra_dictionary_free(lirra_dictionary* dictionary) { delete dictionary; }

size_t lirra_dictionary_count(const lirra_dictionary* dictionary) {
  return dictionary == nullptr ? 0 : dictionary->values.size();
}

const char* lirra_dictionary_key(const lirra_dictionary* dictionary, size_t index) {
  if (index >= lirra_dictionary_count(dictionary)) return nullptr;
  return std::next(dictionary->values.begin(), static_cast<std::ptrdiff_t>(index))->first.c_str();
}

lirra_result lirra_dictionary_set_string(lirra_dictionary* dictionary, const char* key, const char* value) {
  if (value == nullptr) return LIRRA_INVALID;
  return lirra::guarded([&] { return store(dictionary, key, std::string(value)); });
}

lirra_result lirra_dictionary_set_int64(lirra_dictionary* dictionary, const char* key, int64_t value) {
  return store(dictionary, key, std::int64_t{value});
}

lirra_result lirra_dictionary_set_uint64(lirra_dictionary* dictionary, const char* key, uint64_t value) {
  return store(dictionary, key, std::uint64_t{value});
}

lirra_result lirra_dictionary_set_double(lirra_dictionary* dictionary, const char* key, double value) {
  return store(dictionary, key, value);
}

lirra_result lirra_dictionary_set_bool(lirra_dictionary* dictionary, const char* key, int value) {
  return store(dictionary, key, value != 0);
}

lirra_result lirra_dictionary_string(const lirra_dictionary* dictionary, const char* key,
                                     const char** value) {
  if (dictionary == nullptr || key == nullptr || value == nullptr) return LIRRA_INVALID;
  const auto found = dictionary->values.find(std::string_view(key));
  if (found == dictionary->values.end()) return LIRRA_ABSENT;
  const auto* const text = found->second.as<std::string>();
  if (text == nullptr) return LIRRA_ABSENT;
  *value = text->c_str();
  return LIRRA_OK;
}

lirra_result lirra_dictionary_int64(const lirra_dictionary* dictionary, const char* key, int64_t* value) {
  return read<std::int64_t>(dictionary, key, value);
}

lirra_result lirra_dictionary_uint64(const lirra_dictionary* dictionary, const char* key, uint64_t* value) {
  return read<std::uint64_t>(dictionary, key, value);
}

lirra_result lirra_dictionary_double(const lirra_dictionary* dictionary, const char* key, double* value) {
  return read<double>(dictionary, key, value);
}

lirra_result lirra_dictionary_bool(const lirra_dictionary* dictionary, const char* key, int* value) {
  return read<bool>(dictionary, key, value);
}

lirra_result lirra_dictionary_dictionary(const lirra_dictionary* dictionary, const char* key,
                                         const lirra_dictionary** value) {
  if (dictionary == nullptr || key == nullptr || value == nullptr) return LIRRA_INVALID;
  const auto found = dictionary->values.find(std::string_view(key));
  const auto* const map = found == dictionary->values.end() ? nullptr : found->second.as<zal::ValueMap>();
  if (map == nullptr) return LIRRA_ABSENT;
  return lirra::guarded([&] {
    std::unique_ptr<lirra_dictionary>& inner = dictionary->inner[key];
    if (!inner) inner = std::make_unique<lirra_dictionary>(lirra_dictionary{*map, {}});
    *value = inner.get();
    return LIRRA_OK;
  });
}

}  // extern "C"
