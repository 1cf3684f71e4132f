// Decoding metric payloads with our records against libprotobuf on the same schemas: a mixed
// corpus of realistic payloads of every record class, all classes interleaved, decoded into
// fresh records (and, for the display path, turned into dictionaries or JSON).
#include <benchmark/benchmark.h>
#include <google/protobuf/util/json_util.h>

#include <set>
#include <string>
#include <vector>

#include "messages/Records.h"
#include "oracle/RandomMessage.h"

namespace {

using google::protobuf::Message;

constexpr std::uint64_t kPayloadsPerClass = 20;

struct Payload {
  const messages::RecordClass* recordClass;
  std::unique_ptr<Message> prototype;  // an empty libprotobuf message of the class
  std::string bytes;
};

struct Corpus {
  std::vector<Payload> payloads;
  std::size_t byteCount = 0;
};

// Which payloads a corpus holds: realistic payloads of every class or of the top-level classes
// only, or payloads of every class with every field present and values over their whole range.
enum class Mix { AllClasses, TopLevelClasses, AllClassesFullRange };

// The classes no other record embeds: the metric records a baseband sends on their own.
std::set<std::string> topLevelClassNames() {
  std::set<std::string> all;
  std::set<std::string> embedded;
  for (const auto& recordClass : messages::recordClasses()) {
    all.emplace(recordClass.name);
    const auto& type = *oracle::newMessageNamed(recordClass.name)->GetDescriptor();
    for (int index = 0; index < type.field_count(); ++index) {
      if (const auto* fieldType = type.field(index)->message_type())
        embedded.insert(fieldType->name());
    }
  }
  for (const auto& name : embedded)
    all.erase(name);
  return all;
}

Corpus makeCorpus(Mix mix) {
  const auto topLevel = topLevelClassNames();
  const auto fill = mix == Mix::AllClassesFullRange ? oracle::Fill::Full : oracle::Fill::Realistic;
  Corpus corpus;
  for (std::uint64_t seed = 0; seed < kPayloadsPerClass; ++seed) {
    for (const auto& recordClass : messages::recordClasses()) {
      if (mix == Mix::TopLevelClasses && !topLevel.contains(std::string(recordClass.name)))
        continue;
      auto message = oracle::newMessageNamed(recordClass.name);
      oracle::fillRandomly(*message, seed, fill);
      Payload payload{&recordClass, oracle::newMessageNamed(recordClass.name),
                      message->SerializeAsString()};
      corpus.byteCount += payload.bytes.size();
      corpus.payloads.push_back(std::move(payload));
    }
  }
  return corpus;
}

const Corpus& corpusOf(Mix mix) {
  static const Corpus allClasses = makeCorpus(Mix::AllClasses);
  static const Corpus topLevelClasses = makeCorpus(Mix::TopLevelClasses);
  static const Corpus allClassesFullRange = makeCorpus(Mix::AllClassesFullRange);
  switch (mix) {
    case Mix::AllClasses:
      return allClasses;
    case Mix::TopLevelClasses:
      return topLevelClasses;
    case Mix::AllClassesFullRange:
      return allClassesFullRange;
  }
  return allClasses;
}

const std::uint8_t* bytesOf(const Payload& payload) {
  return reinterpret_cast<const std::uint8_t*>(payload.bytes.data());
}

// Runs `decodeOne` over the whole corpus per iteration and reports payloads and bytes per second.
template <class DecodeOne>
void overCorpus(benchmark::State& state, const Corpus& corpus, DecodeOne decodeOne) {
  state.SetLabel(std::to_string(corpus.payloads.size()) + " payloads");
  for (auto _ : state) {
    for (const Payload& payload : corpus.payloads)
      decodeOne(payload);
  }
  const auto iterations = static_cast<std::int64_t>(state.iterations());
  state.SetItemsProcessed(iterations * static_cast<std::int64_t>(corpus.payloads.size()));
  state.SetBytesProcessed(iterations * static_cast<std::int64_t>(corpus.byteCount));
}

void ourReadFrom(benchmark::State& state, Mix mix) {
  overCorpus(state, corpusOf(mix), [&](const Payload& payload) {
    const auto record = payload.recordClass->create();
    codec::Reader reader(bytesOf(payload), payload.bytes.size());
    if (!record->readFrom(reader)) state.SkipWithError("readFrom failed");
    benchmark::DoNotOptimize(record.get());
  });
}

void libprotobufParse(benchmark::State& state, Mix mix) {
  overCorpus(state, corpusOf(mix), [&](const Payload& payload) {
    const std::unique_ptr<Message> message(payload.prototype->New());
    if (!message->ParseFromArray(payload.bytes.data(), static_cast<int>(payload.bytes.size())))
      state.SkipWithError("ParseFromArray failed");
    benchmark::DoNotOptimize(message.get());
  });
}

void ourReadFromAndDictionary(benchmark::State& state, Mix mix) {
  overCorpus(state, corpusOf(mix), [&](const Payload& payload) {
    const auto record = payload.recordClass->create();
    codec::Reader reader(bytesOf(payload), payload.bytes.size());
    if (!record->readFrom(reader)) state.SkipWithError("readFrom failed");
    const platform::Dictionary dictionary = record->dictionaryRepresentation();
    benchmark::DoNotOptimize(dictionary.size());
  });
}

void libprotobufParseAndJson(benchmark::State& state, Mix mix) {
  google::protobuf::util::JsonPrintOptions options;
  options.preserve_proto_field_names = true;
  overCorpus(state, corpusOf(mix), [&](const Payload& payload) {
    const std::unique_ptr<Message> message(payload.prototype->New());
    if (!message->ParseFromArray(payload.bytes.data(), static_cast<int>(payload.bytes.size())))
      state.SkipWithError("ParseFromArray failed");
    std::string json;
    if (!google::protobuf::util::MessageToJsonString(*message, &json, options).ok())
      state.SkipWithError("MessageToJsonString failed");
    benchmark::DoNotOptimize(json.data());
  });
}

BENCHMARK_CAPTURE(ourReadFrom, all_classes, Mix::AllClasses);
BENCHMARK_CAPTURE(libprotobufParse, all_classes, Mix::AllClasses);
BENCHMARK_CAPTURE(ourReadFrom, top_level, Mix::TopLevelClasses);
BENCHMARK_CAPTURE(libprotobufParse, top_level, Mix::TopLevelClasses);
BENCHMARK_CAPTURE(ourReadFrom, all_classes_full_range, Mix::AllClassesFullRange);
BENCHMARK_CAPTURE(libprotobufParse, all_classes_full_range, Mix::AllClassesFullRange);
BENCHMARK_CAPTURE(ourReadFromAndDictionary, all_classes, Mix::AllClasses);
BENCHMARK_CAPTURE(libprotobufParseAndJson, all_classes, Mix::AllClasses);
BENCHMARK_CAPTURE(ourReadFromAndDictionary, top_level, Mix::TopLevelClasses);
BENCHMARK_CAPTURE(libprotobufParseAndJson, top_level, Mix::TopLevelClasses);

}  // namespace

BENCHMARK_MAIN();
