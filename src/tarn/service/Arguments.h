#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "tarn/Ipc.h"

namespace tarn::service {

// A command that the service will not carry out: the status and message its client receives.
struct Refusal {
  std::int32_t status;
  std::string message;
};

// The arguments of one command, read by key. Reads throw a Refusal that names the key when an
// argument is missing or has the wrong type; a null value counts as missing.
class Arguments {
 public:
  // Throws a Refusal when `input` is no dictionary.
  explicit Arguments(const ipc::Object& input);

  std::int64_t integer(std::string_view key) const;
  std::int64_t integer(std::string_view key, std::int64_t whenAbsent) const;
  const platform::Bytes& bytes(std::string_view key) const;

 private:
  const ipc::Object* find(std::string_view key) const;
  const ipc::Object& require(std::string_view key) const;

  const ipc::Object& input_;
};

}  // namespace tarn::service
