// SPDX-License-Identifier: Apache-2.0
#include "host/access/credentials.h"

#include <gtest/gtest.h>

#include "tests/support/temporary_folder.h"

namespace vexa::host {
namespace {

using vexa_test::TemporaryFolder;

std::string loaded(const CredentialSources& sources) {
  const auto result = load_credentials(sources);
  return result ? result->user + "|" + result->password : "refused: " + result.error().text;
}

TEST(CredentialSources, WithoutSourcesThereAreNoCredentials) { EXPECT_EQ(loaded({}), "|"); }

TEST(CredentialSources, OptionsWinOverTheEnvironment) {
  const TemporaryFolder folder;
  CredentialSources sources;
  sources.environment_user = "env-user";
  sources.environment_password = "env-password";
  EXPECT_EQ(loaded(sources), "env-user|env-password");
  sources.user = "option-user";
  EXPECT_EQ(loaded(sources), "option-user|env-password");
  sources.password_file = folder.make_file("password", "file-password\nsecond line\n");
  EXPECT_EQ(loaded(sources), "option-user|file-password");
  sources = {.credentials_file = folder.make_file("both", "file-user:file:pass\n"),
             .environment_user = "env-user",
             .environment_password = "env-password"};
  EXPECT_EQ(loaded(sources), "file-user|file:pass");
}

TEST(CredentialSources, AFirstLineEndsWithTheFileOrAnyLineEnd) {
  const TemporaryFolder folder;
  for (const char* text : {"secret", "secret\n", "secret\r\n", "secret\nmore"}) {
    SCOPED_TRACE(text);
    EXPECT_EQ(loaded({.password_file = folder.make_file("password", text)}), "|secret");
  }
  EXPECT_EQ(loaded({.password_file = folder.make_file("password", "")}), "|");
}

TEST(CredentialSources, AreRefusedWithoutRepeatingThem) {
  const TemporaryFolder folder;
  EXPECT_EQ(loaded({.password_file = folder / "none"}),
            "refused: cannot read " + (folder / "none") + ": No such file or directory");
  EXPECT_EQ(loaded({.password_file = folder.path()}), "refused: cannot read " + folder.path() + ": Is a directory");
  EXPECT_EQ(loaded({.credentials_file = folder.make_file("both", "hunter2\n")}),
            "refused: the first line of " + (folder / "both") + " is not USER:PASSWORD");
  EXPECT_EQ(loaded({.user = "admin:hunter2"}), "refused: a user name cannot hold a colon");
  EXPECT_EQ(loaded({.environment_password = std::string("hunter2\0", 8)}),
            "refused: user name and password cannot hold a NUL character");
}

TEST(CredentialSources, AreAtMostWhatTheDriverSends) {
  const CredentialSources longest{.environment_user = std::string(100, 'u'),
                                  .environment_password = std::string(154, 'p')};
  EXPECT_EQ(loaded(longest).size(), 255u);
  const CredentialSources longer{.environment_user = std::string(100, 'u'),
                                 .environment_password = std::string(155, 'p')};
  EXPECT_EQ(loaded(longer), "refused: user name and password are longer than 254 characters together");
}

TEST(CredentialEnvironment, HoldsExactlyTheTwoVariables) {
  const char* environment[] = {"VEXACTL_USERS=no", "VEXACTL_USER=operator", "VEXACTL_PASSWORD=a=b", "X", nullptr};
  CredentialSources sources;
  read_environment(sources, environment);
  EXPECT_EQ(loaded(sources), "operator|a=b");
}

}  // namespace
}  // namespace vexa::host
