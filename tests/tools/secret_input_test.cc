// Secrets from files: one line, and nothing of it left in memory.
#include "secret_input.h"

#include <string>

#include <gtest/gtest.h>

#include "failure.h"
#include "support/temporary_folder.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;

class SecretInput : public testing::Test {
protected:
    std::string secret_in(std::string_view content) const
    {
        return std::string(read_secret_file(folder.write("secret", content), "password").view());
    }

    temporary_folder folder;
};

TEST_F(SecretInput, IsALineWithoutItsEnd)
{
    EXPECT_EQ(secret_in("pass word\n"), "pass word");
    EXPECT_EQ(secret_in("password\r\n"), "password");
    EXPECT_EQ(secret_in(" password "), " password ");
    EXPECT_EQ(secret_in(std::string(secret_text::longest, 'x')),
              std::string(secret_text::longest, 'x'));
}

TEST_F(SecretInput, IsRefusedWhenItCannotBeMeant)
{
    EXPECT_THROW(secret_in(""), failure);
    EXPECT_THROW(secret_in("\n"), failure);
    EXPECT_THROW(secret_in("one\ntwo\n"), failure);
    EXPECT_THROW(secret_in("one\n\n"), failure);
    EXPECT_THROW(secret_in(std::string_view("a\0b", 3)), failure);
    EXPECT_THROW(secret_in(std::string(secret_text::longest + 1, 'x')), failure);
    EXPECT_THROW(read_secret_file(folder.path_of("absent"), "password"), failure);
    EXPECT_THROW(read_secret_file(folder.path(), "password"), failure);
}

TEST_F(SecretInput, ComesFromMemoryUnchanged)
{
    EXPECT_EQ(secret_of("a key", "key").view(), "a key");
    EXPECT_THROW(secret_of(std::string(secret_text::longest + 1, 'x'), "key"), failure);
}

} // namespace
} // namespace quillmere_test
