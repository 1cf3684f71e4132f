#include <google/protobuf/compiler/plugin.h>

#include "RecordGenerator.h"

int main(int argc, char* argv[]) {
  recordgen::RecordGenerator generator;
  return google::protobuf::compiler::PluginMain(argc, argv, &generator);
}
