#include "oracle/RandomMessage.h"

#include <algorithm>
#include <array>
#include <limits>
#include <random>
#include <stdexcept>
#include <string>

#include "messages/KBBMetricUtility.h"
#include "options.pb.h"

namespace oracle {
namespace {

using google::protobuf::Descriptor;
using google::protobuf::FieldDescriptor;
using google::protobuf::Message;

constexpr std::string_view kPackage = "norvo.metrics.";
constexpr double kSparsePresence = 0.6;

bool isMetricId(int fieldNumber) {
  const auto& table = messages::KBBMetricUtility::metricIdTable();
  return std::any_of(table.begin(), table.end(),
                     [&](const auto& entry) { return entry.metricId == fieldNumber; });
}

bool appliesMetricIdTagRule(const Descriptor& type) {
  return !type.options().GetExtension(norvo::raw_field_numbers);
}

class RandomMessageMaker {
 public:
  RandomMessageMaker(std::uint64_t seed, Fill fill) : engine_(seed), fill_(fill) {}

  void fill(Message& message) {
    const Descriptor& type = *message.GetDescriptor();
    const bool tagRule = appliesMetricIdTagRule(type);
    for (int index = 0; index < type.field_count(); ++index) {
      const FieldDescriptor& field = *type.field(index);
      if (tagRule && isMetricId(field.number())) continue;
      if (field.is_repeated()) {
        fillRepeated(message, field);
      } else if (fill_ != Fill::Sparse || chance(kSparsePresence)) {
        fillSingle(message, field);
      }
    }
  }

 private:
  void fillSingle(Message& message, const FieldDescriptor& field) {
    const auto& reflection = *message.GetReflection();
    switch (field.type()) {
      case FieldDescriptor::TYPE_UINT64:
        return reflection.SetUInt64(&message, &field, uint64Value());
      case FieldDescriptor::TYPE_UINT32:
        return reflection.SetUInt32(&message, &field, uint32Value());
      case FieldDescriptor::TYPE_SINT32:
        return reflection.SetInt32(&message, &field, sint32Value());
      case FieldDescriptor::TYPE_BOOL:
        return reflection.SetBool(&message, &field, chance(0.5));
      case FieldDescriptor::TYPE_ENUM: {
        const auto& values = *field.enum_type();
        return reflection.SetEnum(&message, &field,
                                  values.value(between(0, values.value_count() - 1)));
      }
      case FieldDescriptor::TYPE_STRING:
        return reflection.SetString(&message, &field, text());
      case FieldDescriptor::TYPE_BYTES:
        return reflection.SetString(&message, &field, bytes());
      case FieldDescriptor::TYPE_MESSAGE:
        return fill(*reflection.MutableMessage(&message, &field));
      default:
        throw std::logic_error("no record field has the kind of " + field.full_name());
    }
  }

  void fillRepeated(Message& message, const FieldDescriptor& field) {
    const auto& reflection = *message.GetReflection();
    const int count = fill_ == Fill::Realistic ? between(2, 8)
                      : field.type() == FieldDescriptor::TYPE_MESSAGE
                          ? between(fill_ == Fill::Full ? 1 : 0, 4)
                          : between(fill_ == Fill::Full ? 1 : 0, 6);
    for (int element = 0; element < count; ++element) {
      switch (field.type()) {
        case FieldDescriptor::TYPE_MESSAGE:
          fill(*reflection.AddMessage(&message, &field));
          break;
        case FieldDescriptor::TYPE_UINT32:
          reflection.AddUInt32(&message, &field, uint32Value());
          break;
        case FieldDescriptor::TYPE_SINT32:
          reflection.AddInt32(&message, &field, sint32Value());
          break;
        default:
          throw std::logic_error("no record list has the kind of " + field.full_name());
      }
    }
  }

  std::uint64_t uint64Value() {
    // Milliseconds since 1970, some time from late 2023 on.
    if (fill_ == Fill::Realistic)
      return 1'700'000'000'000 + between<std::uint64_t>(0, 100'000'000'000);
    if (chance(1.0 / 16)) {
      constexpr std::array<std::uint64_t, 3> edges{0, std::uint64_t{1} << 63,
                                                   std::numeric_limits<std::uint64_t>::max()};
      return edges[between<std::size_t>(0, edges.size() - 1)];
    }
    return bitsWide(between(0u, 64u));
  }

  std::uint32_t uint32Value() {
    if (fill_ == Fill::Realistic) {
      // Mostly small counters and indices, some channel numbers, now and then a cell ID.
      const double kind = unit();
      if (kind < 0.5) return between<std::uint32_t>(0, 127);
      if (kind < 0.9) return between<std::uint32_t>(128, 65535);
      return between<std::uint32_t>(65536, 1u << 28);
    }
    if (chance(1.0 / 16)) return chance(0.5) ? 0 : std::numeric_limits<std::uint32_t>::max();
    return static_cast<std::uint32_t>(bitsWide(between(0u, 32u)));
  }

  std::int32_t sint32Value() {
    // Signal levels and offsets in dB or dBm.
    if (fill_ == Fill::Realistic) return between(-140, 30);
    if (chance(1.0 / 16)) {
      constexpr std::array<std::int32_t, 4> edges{0, -1, std::numeric_limits<std::int32_t>::min(),
                                                  std::numeric_limits<std::int32_t>::max()};
      return edges[between<std::size_t>(0, edges.size() - 1)];
    }
    const auto magnitude = static_cast<std::int32_t>(bitsWide(between(0u, 31u)));
    return chance(0.5) ? -magnitude : magnitude;
  }

  // UTF-8 text drawn from all four encoded lengths; realistic text is a short name.
  std::string text() {
    std::string result;
    if (fill_ == Fill::Realistic) {
      constexpr std::string_view kAlphabet = "abcdefghijklmnopqrstuvwxyz0123456789.-";
      const int length = between(4, 24);
      for (int i = 0; i < length; ++i)
        result += kAlphabet[between<std::size_t>(0, kAlphabet.size() - 1)];
      return result;
    }
    const int length = between(0, 40);
    for (int i = 0; i < length; ++i)
      appendUtf8(result, codePoint());
    return result;
  }

  std::string bytes() {
    const int length = fill_ == Fill::Realistic ? between(3, 16) : between(0, 40);
    std::string result;
    for (int i = 0; i < length; ++i)
      result += static_cast<char>(between(0, 255));
    return result;
  }

  std::uint32_t codePoint() {
    switch (between(0, 3)) {
      case 0:
        return between<std::uint32_t>(0, 0x7F);
      case 1:
        return between<std::uint32_t>(0x80, 0x7FF);
      case 2: {
        // Surrogates are not characters.
        const std::uint32_t point = between<std::uint32_t>(0x800, 0xFFFF - 0x800);
        return point < 0xD800 ? point : point + 0x800;
      }
      default:
        return between<std::uint32_t>(0x10000, 0x10FFFF);
    }
  }

  static void appendUtf8(std::string& text, std::uint32_t point) {
    const auto byte = [&](std::uint32_t bits) { text += static_cast<char>(bits); };
    if (point < 0x80) {
      byte(point);
    } else if (point < 0x800) {
      byte(0xC0 | point >> 6);
      byte(0x80 | (point & 0x3F));
    } else if (point < 0x10000) {
      byte(0xE0 | point >> 12);
      byte(0x80 | (point >> 6 & 0x3F));
      byte(0x80 | (point & 0x3F));
    } else {
      byte(0xF0 | point >> 18);
      byte(0x80 | (point >> 12 & 0x3F));
      byte(0x80 | (point >> 6 & 0x3F));
      byte(0x80 | (point & 0x3F));
    }
  }

  // A value of exactly `bits` significant bits at most, so every varint length turns up.
  std::uint64_t bitsWide(unsigned bits) { return bits == 0 ? 0 : engine_() >> (64 - bits); }

  template <class T>
  T between(T low, T high) {
    return std::uniform_int_distribution<T>(low, high)(engine_);
  }
  double unit() { return std::uniform_real_distribution<double>(0, 1)(engine_); }
  bool chance(double probability) { return unit() < probability; }

  std::mt19937_64 engine_;
  Fill fill_;
};

}  // namespace

std::unique_ptr<Message> newMessageNamed(std::string_view name) {
  const Descriptor* type =
      google::protobuf::DescriptorPool::generated_pool()->FindMessageTypeByName(
          std::string(kPackage) + std::string(name));
  if (type == nullptr) return nullptr;
  return std::unique_ptr<Message>(
      google::protobuf::MessageFactory::generated_factory()->GetPrototype(type)->New());
}

void fillRandomly(Message& message, std::uint64_t seed, Fill fill) {
  RandomMessageMaker(seed, fill).fill(message);
}

}  // namespace oracle
