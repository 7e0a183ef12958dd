// Which links are followed, and where to.
#include "transfers/download.h"

#include <fcntl.h>

#include <quillmere.h>

#include <gtest/gtest.h>

#include "heap.h"
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "transfers/local_folder.h"

namespace quillmere_test {
namespace {

using namespace quillmere::tools;

const expected_content abc = {3,
                              "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad"};

class Downloader : public library_test {
protected:
    Downloader()
    {
        plain_server.answer(http_reply(200, "abc"));
        server.answer_with([this](const request &asked) {
            return asked.path() == "/away"
                       ? http_reply(302, "", {"Location: " + plain_server.base_url() + "/"})
                       : http_reply(200, "abc");
        });
    }

    bool brings(const std::string &url, link_security security)
    {
        partial_file into(folder.number(), abc);
        progress shown(progress_style::none, "name", abc.size, 0);
        char *message = nullptr;
        const std::int32_t status = downloader(security, 10).fetch(url, into, shown, &message);
        const heap_text owned(message);
        const bool right = status == QM_OK && into.is_right();
        into.restart();
        return right;
    }

    temporary_folder outside;
    const local_folder folder{outside.path()};
};

} // namespace

TEST_F(Downloader, FollowsUnencryptedLinksWhereTheyAreAllowed)
{
    const std::string plain = plain_server.base_url() + "/";

    EXPECT_TRUE(brings(plain, link_security::plain_too));
    EXPECT_FALSE(brings(plain, link_security::tls_alone));
    EXPECT_EQ(plain_server.connections(), 1u);
}

TEST_F(Downloader, LetsNothingThatBeganEncryptedGoOnUnencrypted)
{
    EXPECT_TRUE(brings(server.base_url() + "/", link_security::plain_too));
    EXPECT_FALSE(brings(server.base_url() + "/away", link_security::plain_too));
    EXPECT_FALSE(brings(server.base_url() + "/away", link_security::tls_alone));
    EXPECT_EQ(plain_server.connections(), 0u);
}

TEST_F(Downloader, FollowsNoOtherScheme)
{
    outside.write("secret", "abc");

    for (const auto security : {link_security::plain_too, link_security::tls_alone})
        EXPECT_FALSE(brings("file://" + outside.path_of("secret"), security));
}

TEST_F(Downloader, DistrustsWhomTheLibraryDistrusts)
{
    scripted_server stranger(tls_with(certificate_of_unknown_root()));
    stranger.answer(http_reply(200, "abc"));

    EXPECT_FALSE(brings(stranger.base_url() + "/", link_security::tls_alone));
    ssl_disabled = 1;
    EXPECT_TRUE(brings(stranger.base_url() + "/", link_security::tls_alone));
}

} // namespace quillmere_test
