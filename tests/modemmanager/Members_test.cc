// Every ModemManager member that the source calls or reads, and every one that the fake serves,
// exists with the same signature in ModemManager's own introspection XML (modemmanager-dev).
#include <gtest/gtest.h>

#include <boost/property_tree/ptree.hpp>
#include <boost/property_tree/xml_parser.hpp>
#include <filesystem>
#include <map>
#include <tuple>

#include "FakeModemManager.h"
#include "tarn/mm/Names.h"

namespace mmtest {
namespace {

using tarn::mm::Member;
using Key = std::tuple<std::string, Member::Kind, std::string>;
using Signature = std::pair<std::string, std::string>;  // in, out

// The members that ModemManager's XML files declare.
std::map<Key, Signature> declaredMembers() {
  namespace pt = boost::property_tree;
  std::map<Key, Signature> declared;
  for (const auto& entry : std::filesystem::directory_iterator(NORVO_MODEMMANAGER_INTERFACES)) {
    if (!entry.path().filename().string().starts_with("org.freedesktop.ModemManager1")) continue;
    pt::ptree tree;
    pt::read_xml(entry.path().string(), tree);
    for (const auto& [tag, interface] : tree.get_child("node")) {
      if (tag != "interface") continue;
      const std::string name = interface.get<std::string>("<xmlattr>.name");
      for (const auto& [kind, member] : interface) {
        const std::string memberName = member.get<std::string>("<xmlattr>.name", "");
        if (kind == "property") {
          declared[{name, Member::Kind::Property, memberName}] = {
              member.get<std::string>("<xmlattr>.type"), ""};
          continue;
        }
        if (kind != "method" && kind != "signal") continue;
        Signature signature;
        for (const auto& [argTag, argument] : member) {
          if (argTag != "arg") continue;
          const std::string type = argument.get<std::string>("<xmlattr>.type");
          (argument.get<std::string>("<xmlattr>.direction", "in") == "out" ? signature.second
                                                                           : signature.first) +=
              type;
        }
        declared[{name, kind == "method" ? Member::Kind::Method : Member::Kind::Signal,
                  memberName}] = signature;
      }
    }
  }
  return declared;
}

void expectDeclared(const std::map<Key, Signature>& declared, const Member& member,
                    std::string_view by) {
  const auto found =
      declared.find({std::string(member.interface), member.kind, std::string(member.name)});
  ASSERT_NE(found, declared.end())
      << by << ": " << member.interface << "." << member.name << " is not in ModemManager's XML";
  EXPECT_EQ(found->second, (Signature{std::string(member.in), std::string(member.out)}))
      << by << ": " << member.interface << "." << member.name;
}

TEST(ModemManagerMembers, ThatTheSourceUsesAndTheFakeServesAreDeclaredWithTheirSignatures) {
  const std::map<Key, Signature> declared = declaredMembers();
  ASSERT_GT(declared.size(), 100u);
  for (const Member& member : tarn::mm::kMembersUsed)
    expectDeclared(declared, member, "the source");
  for (const Member& member : FakeModemManager::served())
    expectDeclared(declared, member, "the fake");
}

}  // namespace
}  // namespace mmtest
