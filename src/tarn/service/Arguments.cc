#include "tarn/service/Arguments.h"

#include "tarn/CommandResult.h"

namespace tarn::service {

namespace {

[[noreturn]] void refuseType(std::string_view key, std::string_view expected) {
  throw Refusal{status::kInvalidArgument,
                "argument " + std::string(key) + " is not " + std::string(expected)};
}

}  // namespace

Arguments::Arguments(const ipc::Object& input) : input_(input) {
  if (!input.isDictionary()) {
    throw Refusal{status::kInvalidArgument, "the command's arguments are not a dictionary"};
  }
}

const ipc::Object* Arguments::find(std::string_view key) const {
  const ipc::Object* value = input_.find(key);
  return value != nullptr && !value->isNull() ? value : nullptr;
}

const ipc::Object& Arguments::require(std::string_view key) const {
  const ipc::Object* value = find(key);
  if (value == nullptr) {
    throw Refusal{status::kMissingArgument, "missing argument " + std::string(key)};
  }
  return *value;
}

std::int64_t Arguments::integer(std::string_view key) const {
  const std::int64_t* value = require(key).asInteger();
  if (value == nullptr) refuseType(key, "an integer");
  return *value;
}

std::int64_t Arguments::integer(std::string_view key, std::int64_t whenAbsent) const {
  return find(key) != nullptr ? integer(key) : whenAbsent;
}

const platform::Bytes& Arguments::bytes(std::string_view key) const {
  const platform::Bytes* value = require(key).asBytes();
  if (value == nullptr) refuseType(key, "a byte buffer");
  return *value;
}

}  // namespace tarn::service
