#include "transfer_account.h"

#include <algorithm>
#include <filesystem>

namespace quillmere_test {

namespace fs = std::filesystem;

std::vector<std::string> names_in(const std::string &folder)
{
    std::vector<std::string> names;
    for (const auto &each : fs::directory_iterator(folder))
        names.push_back(each.path().filename());
    std::sort(names.begin(), names.end());
    return names;
}

transfer_account::transfer_account()
{
    sign_in();
    fs::create_directory(download_path());
}

outcome transfer_account::done(std::vector<std::string> arguments, const std::string &input) const
{
    const outcome ended = home.run(arguments, input);
    EXPECT_EQ(ended.exit_status, 0) << testing::PrintToString(arguments) << ended.out << ended.err;
    return ended;
}

std::string transfer_account::remote_sha256(const std::string &path) const
{
    return result_of({"stat", path}).value("hash", "");
}

std::string transfer_account::local(const std::string &name, const std::string &bytes) const
{
    const std::string path = home.folder().path_of("sources/" + name);
    fs::create_directories(fs::path(path).parent_path());
    return home.folder().write("sources/" + name, bytes);
}

std::vector<std::string> transfer_account::stored_contents() const
{
    std::vector<std::string> names;
    for (const auto &each : fs::recursive_directory_iterator(data + "/content"))
        if (each.is_regular_file())
            names.push_back(each.path().filename());
    return names;
}

std::vector<std::string> transfer_account::downloaded() const { return names_in(download_path()); }

} // namespace quillmere_test
