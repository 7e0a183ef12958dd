// Connections that are cut anywhere on the way: nothing half is ever seen, and the same command
// done again ends whole.
#include <filesystem>
#include <random>

#include <gmock/gmock.h>

#include "support/cutting_relay.h"
#include "transfer_account.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;

constexpr std::size_t size = 400'000;
constexpr std::uint32_t seed = 20260301;

class CutConnection : public transfer_account {
protected:
    CutConnection() : secure_(port_in("https_url")), plain_(port_in("http_url"))
    {
        const std::string text =
            R"({"https_url": "https://127.0.0.1:)" + std::to_string(secure_.port()) +
            R"(", "http_url": "http://127.0.0.1:)" + std::to_string(plain_.port()) +
            R"(", "ca_file": ")" + data + R"(/ca.pem"})";
        home.environment["QUILLMERE_EMULATOR"] = home.folder().write("relayed.json", text);
        sign_in();
    }

    std::uint16_t port_in(const char *key) const
    {
        const std::string url = nlohmann::json::parse(content_of(ready_file)).at(key);
        return static_cast<std::uint16_t>(std::stoi(url.substr(url.rfind(':') + 1)));
    }

    outcome run_once(std::vector<std::string> arguments) const
    {
        arguments.insert(arguments.begin(), {"--retries", "0"});
        return home.run(arguments);
    }

    cutting_relay secure_;
    cutting_relay plain_;
};

} // namespace

TEST_F(CutConnection, OfAnUploadLeavesNothingAndIsMendedByAnother)
{
    std::mt19937 chance(seed);
    // The header takes some hundred bytes.
    std::uniform_int_distribution<std::uint64_t> anywhere(0, size + 200);
    for (int round = 0; round < 8; ++round) {
        const std::string bytes = some_bytes(size, seed + static_cast<std::uint32_t>(round));
        const std::string name = "/file" + std::to_string(round);
        const std::string file = local("file", bytes);
        const std::uint64_t place = anywhere(chance);
        plain_.cut_after(way::to_server, place);
        const std::size_t stored = stored_contents().size();

        const outcome cut = run_once({"put", file, name});

        EXPECT_EQ(cut.exit_status, 5) << place << cut.err;
        EXPECT_EQ(home.run({"stat", name}).exit_status, 3) << place;
        plain_.cut_nothing();
        done({"put", file, name});
        EXPECT_EQ(remote_sha256(name), sha256_of(bytes)) << place;
        EXPECT_EQ(stored_contents().size(), stored + 1) << place;
    }
    EXPECT_EQ(plain_.cuts(), 8u);
}

TEST_F(CutConnection, OfARevisionLeavesTheOldOne)
{
    done({"put", local("file", "old"), "/file"});
    const std::string bytes = some_bytes(size);
    plain_.cut_after(way::to_server, size / 2);

    EXPECT_EQ(run_once({"put", local("file", bytes), "/file"}).exit_status, 5);

    EXPECT_EQ(remote_sha256("/file"), sha256_of("old"));
    plain_.cut_nothing();
    done({"put", local("file", bytes), "/file"});
    EXPECT_EQ(remote_sha256("/file"), sha256_of(bytes));
}

TEST_F(CutConnection, BehindAnUploadIsMendedByAnother)
{
    const std::string file = local("file", some_bytes(size));
    plain_.cut_after(way::to_client, 60); // the invitation, and a part of the reply

    EXPECT_EQ(run_once({"put", file, "/file"}).exit_status, 5);

    plain_.cut_nothing();
    EXPECT_THAT(done({"put", file, "/file"}).out, "/file is up to date\n")
        << "all had arrived but the reply";
}

TEST_F(CutConnection, OfADownloadIsMendedByAnother)
{
    std::mt19937 chance(seed);
    // Shorter ones would cut the requests ahead of the download, too.
    std::uniform_int_distribution<std::uint64_t> anywhere(20'000, size);
    for (int round = 0; round < 8; ++round) {
        const std::string bytes = some_bytes(size, seed + static_cast<std::uint32_t>(round));
        const std::string name = "file" + std::to_string(round);
        put_content("/" + name, bytes);
        const std::uint64_t place = anywhere(chance);
        secure_.cut_after(way::to_client, place);
        const std::size_t before = secure_.cuts();

        const outcome cut = run_once({"get", "/" + name, download_path()});

        EXPECT_EQ(cut.exit_status, 5) << place << cut.err;
        EXPECT_EQ(secure_.cuts(), before + 1);
        EXPECT_FALSE(fs::exists(download_path(name))) << place;
        const auto partial = download_path(".quillmere-" + sha256_of(bytes) + ".part");
        ASSERT_TRUE(fs::exists(partial)) << place;
        EXPECT_GT(fs::file_size(partial), 0u) << place;
        secure_.cut_nothing();
        done({"get", "/" + name, download_path()});
        EXPECT_EQ(sha256_of_file(download_path(name)), sha256_of(bytes)) << place;
        EXPECT_FALSE(fs::exists(partial));
    }
}

TEST_F(CutConnection, OfADownloadIsMendedByTheSameCommand)
{
    const std::string bytes = some_bytes(size);
    put_content("/file", bytes);
    secure_.cut_after(way::to_client, size / 3);

    const outcome ended = home.run({"get", "/file", download_path()});

    EXPECT_EQ(ended.exit_status, 0) << ended.err;
    EXPECT_GE(secure_.cuts(), 3u) << "each connection brought a third";
    EXPECT_EQ(sha256_of_file(download_path("file")), sha256_of(bytes));
}

TEST_F(CutConnection, EarlyOnEndsTheCommandCleanly)
{
    put_content("/file", "x");
    for (const unsigned place : {0u, 100u, 1000u}) {
        secure_.cut_after(way::to_client, place);

        const outcome ended = run_once({"get", "/file", download_path()});

        EXPECT_EQ(ended.exit_status, 5) << place << ended.err;
        EXPECT_THAT(downloaded(), ElementsAre()) << place;
    }
}

} // namespace quillmere_test
