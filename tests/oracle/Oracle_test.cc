// Every record class held against libprotobuf over random messages of its schema: what
// libprotobuf writes, our records read to the same dictionary and write back byte for byte.
#include <gtest/gtest.h>

#include <string>

#include "messages/Records.h"
#include "options.pb.h"
#include "oracle/RandomMessage.h"
#include "oracle/ReflectedDictionary.h"

namespace {

using google::protobuf::Message;
using messages::RecordClass;
using testing::AssertionFailure;
using testing::AssertionResult;
using testing::AssertionSuccess;

constexpr std::uint64_t kSeedsPerClass = 200;
// Pairs cost two samples and a merge each; a hundred of each class still meet every field kind
// set, unset and repeated on either side.
constexpr std::uint64_t kPairsPerClass = 100;

oracle::Fill fillOfSeed(std::uint64_t seed) {
  return seed % 8 == 7 ? oracle::Fill::Full : oracle::Fill::Sparse;
}

// One random message of a record class, as libprotobuf builds and encodes it.
struct Sample {
  const RecordClass* recordClass;
  std::uint64_t seed;
  std::unique_ptr<Message> message;
  std::string encoding;
};

Sample makeSample(const RecordClass& recordClass, std::uint64_t seed) {
  Sample sample{&recordClass, seed, oracle::newMessageNamed(recordClass.name), {}};
  oracle::fillRandomly(*sample.message, seed, fillOfSeed(seed));
  sample.encoding = sample.message->SerializeAsString();
  return sample;
}

// What remakes the sample: fillRandomly(newMessageNamed(class), seed, fill).
std::string describe(const Sample& sample) {
  return std::string(sample.recordClass->name) + " from seed " + std::to_string(sample.seed) +
         (fillOfSeed(sample.seed) == oracle::Fill::Full ? " (full)" : " (sparse)");
}

platform::Bytes bytesOf(const std::string& text) {
  return platform::Bytes(text.begin(), text.end());
}

// Our record of the class decoded from `encoding`; nullptr when readFrom fails.
std::shared_ptr<codec::Codable> decode(const RecordClass& recordClass,
                                       const std::string& encoding) {
  auto record = recordClass.create();
  const platform::Bytes bytes = bytesOf(encoding);
  codec::Reader reader(bytes);
  return record->readFrom(reader) ? record : nullptr;
}

AssertionResult differentDictionaries(const platform::Dictionary& ours,
                                      const platform::Dictionary& libprotobufs) {
  return AssertionFailure() << "\n  ours:        " << ours.description()
                            << "\n  libprotobuf: " << libprotobufs.description();
}

// Runs `check` over samples of every record class. A class's first failure is reported and
// ends that class, so that one fault shows once per class rather than two hundred times.
template <class Check>
void checkEverySample(Check check, std::uint64_t seeds = kSeedsPerClass) {
  for (const auto& recordClass : messages::recordClasses()) {
    for (std::uint64_t seed = 0; seed < seeds; ++seed) {
      const Sample sample = makeSample(recordClass, seed);
      const auto record = decode(recordClass, sample.encoding);
      if (!record) {
        ADD_FAILURE() << describe(sample) << ": readFrom failed on libprotobuf's encoding";
        break;
      }
      if (const AssertionResult result = check(sample, *record); !result) {
        ADD_FAILURE() << describe(sample) << ":" << result.message();
        break;
      }
    }
  }
}

// Runs `check` over pairs of different samples of the same class.
template <class Check>
void checkEveryPairOfSamples(Check check) {
  checkEverySample(
      [&](const Sample& first, const codec::Codable& firstRecord) {
        const Sample second = makeSample(*first.recordClass, first.seed + kSeedsPerClass);
        const auto secondRecord = decode(*second.recordClass, second.encoding);
        if (!secondRecord) return AssertionFailure() << " readFrom failed on " << describe(second);
        AssertionResult result = check(first, firstRecord, second, *secondRecord);
        if (!result) result << "\n  and " << describe(second);
        return result;
      },
      kPairsPerClass);
}

TEST(TheOracle, KnowsEveryRecordClassWithItsTagRule) {
  for (const auto& recordClass : messages::recordClasses()) {
    const auto message = oracle::newMessageNamed(recordClass.name);
    ASSERT_NE(message, nullptr) << recordClass.name;
    EXPECT_EQ(recordClass.create()->className(), recordClass.name);
    EXPECT_EQ(recordClass.appliesMetricIdTagRule,
              !message->GetDescriptor()->options().GetExtension(norvo::raw_field_numbers))
        << recordClass.name;
  }
}

TEST(EveryRecord, ReadsWhatLibprotobufWritesToTheDictionaryItsReflectionGives) {
  checkEverySample([](const Sample& sample, const codec::Codable& record) {
    const auto ours = record.dictionaryRepresentation();
    const auto expected = oracle::reflectedDictionary(*sample.message);
    return ours == expected ? AssertionSuccess() : differentDictionaries(ours, expected);
  });
}

TEST(EveryRecord, WritesTheBytesLibprotobufWroteAndLibprotobufReadsThemBack) {
  checkEverySample([](const Sample& sample, const codec::Codable& record) {
    const platform::Bytes ours = record.data();
    const platform::Bytes original = bytesOf(sample.encoding);
    if (ours != original) {
      return AssertionFailure() << "\n  ours:        " << platform::Value(ours).description()
                                << "\n  libprotobuf: " << platform::Value(original).description();
    }
    const auto reparsed = oracle::newMessageNamed(sample.recordClass->name);
    if (!reparsed->ParseFromArray(ours.data(), static_cast<int>(ours.size())))
      return AssertionFailure() << " libprotobuf does not parse our encoding";
    if (bytesOf(reparsed->SerializeAsString()) != ours)
      return AssertionFailure() << " libprotobuf writes our encoding back differently";
    return AssertionSuccess();
  });
}

TEST(EveryRecord, CopiesDeeplyAndShallowlyToEqualRecordsWithEqualHashes) {
  checkEverySample([](const Sample& sample, const codec::Codable& record) {
    const auto& recordClass = *sample.recordClass;
    const auto copiedTo = recordClass.create();
    recordClass.copyTo(record, *copiedTo);
    for (const auto& [how, copy] : {std::pair{"copyWithZone", recordClass.copyWithZone(record)},
                                    std::pair{"copyTo", copiedTo}}) {
      if (!copy->isEqual(record) || !record.isEqual(*copy))
        return AssertionFailure() << " the " << how << " copy is not equal";
      if (copy->hash() != record.hash())
        return AssertionFailure() << " the " << how << " copy hashes differently";
      if (copy->data() != record.data())
        return AssertionFailure() << " the " << how << " copy encodes differently";
    }
    return AssertionSuccess();
  });
}

TEST(EveryRecord, EqualsAnotherExactlyWhenLibprotobufEncodesBothAlike) {
  checkEveryPairOfSamples([](const Sample& first, const codec::Codable& firstRecord,
                             const Sample& second, const codec::Codable& secondRecord) {
    const bool alike = first.encoding == second.encoding;
    if (firstRecord.isEqual(secondRecord) != alike || secondRecord.isEqual(firstRecord) != alike)
      return AssertionFailure() << " isEqual is not " << alike;
    if (alike && firstRecord.hash() != secondRecord.hash())
      return AssertionFailure() << " equal records hash differently";
    return AssertionSuccess();
  });
}

TEST(EveryRecord, MergesAnotherAsLibprotobufMergesIt) {
  checkEveryPairOfSamples([](const Sample& first, const codec::Codable& firstRecord,
                             const Sample& second, const codec::Codable& secondRecord) {
    const auto merged = first.recordClass->create();
    first.recordClass->mergeFrom(*merged, firstRecord);
    first.recordClass->mergeFrom(*merged, secondRecord);
    const std::unique_ptr<Message> expected(first.message->New());
    expected->CopyFrom(*first.message);
    expected->MergeFrom(*second.message);

    const auto ours = merged->dictionaryRepresentation();
    const auto libprotobufs = oracle::reflectedDictionary(*expected);
    return ours == libprotobufs ? AssertionSuccess() : differentDictionaries(ours, libprotobufs);
  });
}

// Two encodings back to back read as libprotobuf merges them, with one difference: a nested
// record that comes again replaces the earlier one instead of being merged into it.
TEST(EveryRecord, ReadsTwoPayloadsInARowAsMergedButWithNestedRecordsReplaced) {
  checkEveryPairOfSamples([](const Sample& first, const codec::Codable&, const Sample& second,
                             const codec::Codable&) {
    const auto record = decode(*first.recordClass, first.encoding + second.encoding);
    if (!record) return AssertionFailure() << " readFrom failed on both encodings in a row";

    const std::unique_ptr<Message> expected(first.message->New());
    expected->CopyFrom(*first.message);
    const auto& type = *expected->GetDescriptor();
    const auto& reflection = *expected->GetReflection();
    for (int index = 0; index < type.field_count(); ++index) {
      const auto* field = type.field(index);
      if (!field->is_repeated() && field->message_type() != nullptr &&
          reflection.HasField(*second.message, field))
        reflection.ClearField(expected.get(), field);
    }
    expected->MergeFrom(*second.message);

    const auto ours = record->dictionaryRepresentation();
    const auto libprotobufs = oracle::reflectedDictionary(*expected);
    return ours == libprotobufs ? AssertionSuccess() : differentDictionaries(ours, libprotobufs);
  });
}

}  // namespace
