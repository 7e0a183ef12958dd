// Files there and back again, whole: sizes around every limit, names of every kind, many at once.
#include <filesystem>
#include <fstream>

#include <fcntl.h>
#include <unistd.h>

#include <gmock/gmock.h>

#include "transfer_account.h"

namespace quillmere_test {
namespace {

namespace fs = std::filesystem;

class RoundTrip : public transfer_account {
protected:
    /** Sends a file and brings it back; gives the digest of what came back. */
    std::string there_and_back(const std::string &file) const
    {
        done({"put", file, "/there"});
        done({"get", "/there", download_path("back")});
        return sha256_of_file(download_path("back"));
    }
};

class RoundTripOfSize : public RoundTrip, public testing::WithParamInterface<std::size_t> {};

constexpr const char *twisted_names[] = {" ",
                                         "-",
                                         "--help",
                                         "~",
                                         "a b",
                                         "a'b\"c",
                                         "a%20b",
                                         "a+b&c=d?e#f",
                                         "a;b,c:d",
                                         "\\",
                                         "$(x)",
                                         "<a>&amp;",
                                         "[a]*{b}",
                                         "...",
                                         ".hidden",
                                         "caf\xc3\xa9",
                                         "\xe2\x82\xac uro",
                                         "\xf0\x9f\x8c\xb2",
                                         "\xd7\xa9\xd7\x9c\xd7\x95\xd7\x9d",
                                         "\xe4\xb8\xad\xe6\x96\x87.txt",
                                         "e\xcc\x81",
                                         "key:abc",
                                         "name.",
                                         "a\xc2\xa0z",
                                         "UPPER",
                                         "upper"};

} // namespace

TEST_P(RoundTripOfSize, KeepsTheBytes)
{
    const std::string bytes = some_bytes(GetParam());

    EXPECT_EQ(there_and_back(local("file", bytes)), sha256_of(bytes));
    EXPECT_EQ(remote_sha256("/there"), sha256_of(bytes));
    EXPECT_EQ(fs::file_size(download_path("back")), GetParam());
}

INSTANTIATE_TEST_SUITE_P(RoundTrip, RoundTripOfSize,
                         testing::Values(0, 1, 65535, 65536, 65537, 262143, 262144, 262145));

TEST_F(RoundTrip, KeepsALargeFile)
{
    constexpr off_t size = 256 << 20;
    const std::string path = local("large", "the beginning");
    ASSERT_EQ(::truncate(path.c_str(), size), 0);
    {
        std::fstream file(path, std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(size / 2);
        file << "the middle";
        file.seekp(size - 7);
        file << "the end";
    }

    EXPECT_EQ(there_and_back(path), sha256_of_file(path));
    EXPECT_EQ(fs::file_size(download_path("back")), static_cast<std::uintmax_t>(size));
}

TEST_F(RoundTrip, KeepsNamesOfEveryKind)
{
    std::vector<std::string> names = {std::string(255, 'x'), std::string(85 * 3 - 3, 'y') + ".z"};
    names.insert(names.end(), std::begin(twisted_names), std::end(twisted_names));
    for (const std::string &name : names)
        local("tree/" + name, "content of " + name);

    done({"put", "-r", home.folder().path_of("sources/tree")});
    done({"get", "-r", "/tree", download_path()});

    for (const std::string &name : names)
        EXPECT_EQ(content_of(download_path("tree/" + name)), "content of " + name);
    for (const std::string &name : {names[0], std::string("a'b\"c"), std::string("-")}) {
        done({"get", "/tree/" + name, download_path("alone")});
        EXPECT_EQ(content_of(download_path("alone")), "content of " + name);
    }
}

TEST_F(RoundTrip, KeepsManySmallFiles)
{
    constexpr int count = QUILLMERE_SMALL_FILES;
    constexpr std::chrono::minutes enough{4}; // each waits for the disk
    for (int number = 0; number < count; ++number)
        local("tree/" + std::to_string(number % 7) + "/" + std::to_string(number),
              "content " + std::to_string(number));
    const auto run_long = [&](std::vector<std::string> arguments) {
        const outcome ended = run(home.with(std::move(arguments)), enough);
        EXPECT_EQ(ended.exit_status, 0) << ended.err;
    };

    run_long({"put", "-qr", home.folder().path_of("sources/tree")});
    run_long({"get", "-qr", "/tree", download_path()});

    for (int number = 0; number < count; ++number) {
        const std::string name =
            "tree/" + std::to_string(number % 7) + "/" + std::to_string(number);
        ASSERT_EQ(content_of(download_path(name)), "content " + std::to_string(number));
    }
}

} // namespace quillmere_test
