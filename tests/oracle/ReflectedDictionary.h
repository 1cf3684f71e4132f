#pragma once

#include <google/protobuf/message.h>

#include "platform/Value.h"

namespace oracle {

// The dictionary a record should give for `message`, worked out from libprotobuf's reflection
// alone: field names as keys; numbers of the field's own kind; enums by name; bytes and text
// as they are; a nested message as its dictionary when set; a list of messages only when it
// has elements; a packed run always, empty or not.
platform::Dictionary reflectedDictionary(const google::protobuf::Message& message);

}  // namespace oracle
