// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/TypeName.h>

#include <gtest/gtest.h>

// Types in the places that a host may declare them in.
namespace Host::Inner {
struct Failure {
  template <typename Type>
  struct Of {
    struct Deep {};
  };
};
auto localType() {
  return [](auto) {
    struct Local {};
    return Local();
  }(1);
}
bool operator<(Failure, int);
template <auto Value>
struct About {};
}  // namespace Host::Inner

namespace {
struct Unnamed {};
}  // namespace

namespace Varnel::Platform {
namespace {

TEST(TypeName, IsThatOfTheTypeInItsOutermostNamespace) {
  EXPECT_EQ(typeName(typeid(Host::Inner::Failure)), (TypeName{"Host", "Failure"}));
  EXPECT_EQ(typeName(typeid(Host::Inner::Failure::Of<int>)), (TypeName{"Host", "Of<int>"}));
  EXPECT_EQ(typeName(typeid(Host::Inner::Failure::Of<Unnamed>::Deep)), (TypeName{"Host", "Deep"}));
  EXPECT_EQ(typeName(typeid(Host::Inner::localType())), (TypeName{"Host", "Local"}));
  EXPECT_EQ(typeName(typeid(Host::Inner::About<'<'>)).name, "About<(char)60>");
  EXPECT_EQ(typeName(typeid(Unnamed)), (TypeName{"", "Unnamed"}));
  const auto local = [] {
    struct Local {};
    return Local();
  };
  EXPECT_EQ(typeName(typeid(local())), (TypeName{"Varnel", "Local"}));
}

TEST(TypeName, IsFoundInWhateverTheRuntimeWrites) {
  const struct {
    std::string_view fullName, space, name;
  } cases[] = {
      {"ImportFailure", "", "ImportFailure"},
      {"Ünicöde::Fehler", "Ünicöde", "Fehler"},
      {"std::ios_base::failure[abi:cxx11]", "std", "failure"},
      {"Host::Failure[abi:a][abi:b]", "Host", "Failure"},
      {"std::_Nested_exception<Host::Of<int> >", "Host", "Of<int>"},
      {"std::_Nested_exception<Host::Failure const>", "Host", "Failure"},
      {"std::__1::__nested<main::Local>", "", "Local"},
      {"Host::Failed<std::ios_base::failure[abi:cxx11]>", "Host",
       "Failed<std::ios_base::failure[abi:cxx11]>"},
      {"Host::run()::{lambda(auto:1)#1}::operator()<int>(int) const::Local", "Host", "Local"},
      {"Host::run()::$_0::operator()(std::string) const::Local", "Host", "Local"},
      {"Host::Op::operator std::vector<int, std::allocator<int> >()::Local", "Host", "Local"},
      {"Host::operator<(Host::A const&, int)::Local", "Host", "Local"},
      {"Host::Op::operator->()::Local", "Host", "Local"},
      {"Host::my_operator<int>::Local", "Host", "Local"},
      {"Host::operator_error", "Host", "operator_error"},
      {"Fn<&Host::operator<>", "", "Fn<&Host::operator<>"},
      {"Box<Host::A>::Error", "", "Error"},
      {"run(Host::A)::Local", "", "Local"},
      {"main::{lambda()#1}::operator()() const::Local", "", "Local"},
      {"(anonymous namespace)::Error", "", "Error"},
      {"Host::(anonymous namespace)::Error", "Host", "Error"},
      {"", "", ""},
      {"a::]", "a", "]"},
  };
  for (const auto& [fullName, space, name] : cases)
    EXPECT_EQ(typeName(fullName), (TypeName{std::string(space), std::string(name)})) << fullName;
}

}  // namespace
}  // namespace Varnel::Platform
