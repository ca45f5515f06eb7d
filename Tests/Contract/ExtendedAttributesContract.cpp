// SPDX-License-Identifier: MIT
#include <Tests/Contract/FilesWorlds.h>

#include <Varnel/Platform/Testing/FakeExtendedAttributes.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_literals;

TEST_P(ExtendedAttributesContract, GivesAllBytesAndTellsAbsentFromFailed) {
  ExtendedAttributes& attributes = world->attributes();
  for (const std::string& value : {""s, "a\0b;\xFF"s, std::string(3000, 'x')}) {
    world->set("note", value);
    EXPECT_EQ(*attributes.value(world->path(), "note"), value);
  }
  EXPECT_EQ(*attributes.value(world->path(), "other"), std::nullopt);
  EXPECT_EQ(*attributes.value(world->path(), "not"), std::nullopt);
  for (const auto& [path, name] :
       {std::pair(world->path(), ""s), {world->path(), "note\0"s}, {world->path() + '\0', "note"s}})
    EXPECT_EQ(attributes.value(path, name).error(), std::errc::invalid_argument);

  const std::string bare = world->pathWithoutAttributes();
  EXPECT_EQ(attributes.value(bare, "note").error(), std::errc::not_supported);
  const std::string missing = world->missingPath();
  EXPECT_EQ(attributes.value(missing, "note").error(), std::errc::no_such_file_or_directory);
}

class FakeWorld final : public ExtendedAttributesWorld {
 public:
  ExtendedAttributes& attributes() override { return attributes_; }
  std::string path() override { return "/file"; }
  void set(const std::string& name, const std::string& value) override {
    attributes_.values[{path(), name}] = value;
  }
  std::string missingPath() override { return failing(std::errc::no_such_file_or_directory); }
  std::string pathWithoutAttributes() override { return failing(std::errc::not_supported); }

 private:
  std::string failing(std::errc error) {
    attributes_.error = std::make_error_code(error);
    return "/other";
  }

  Testing::FakeExtendedAttributes attributes_;
};
INSTANTIATE_TEST_SUITE_P(Fake, ExtendedAttributesContract,
                         ExtendedAttributesContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
