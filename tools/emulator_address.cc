#include "emulator_address.h"

#include <nlohmann/json.hpp>

#include "failure.h"
#include "private_file.h"
#include "service_address.h"

namespace quillmere::tools {

namespace {

constexpr const char *ready_file_name = "the emulator's ready file";

} // namespace

emulator_address read_ready_text(const std::string &text, const std::string &path)
{
    const nlohmann::json document = nlohmann::json::parse(text, nullptr, false);
    const auto text_of = [&](const char *key) {
        if (!document.is_object() || !document.contains(key) || !document[key].is_string())
            throw failure(exit_code::local_file,
                          std::string(ready_file_name) + " " + path + " has no " + key,
                          "is it the file named with --ready-file?");
        return document[key].get<std::string>();
    };
    emulator_address address;
    address.secure_base = normal_base_address(text_of("https_url"), path);
    address.plain_base = text_of("http_url");
    while (!address.plain_base.empty() && address.plain_base.back() == '/')
        address.plain_base.pop_back();
    address.ca_file = text_of("ca_file");
    return address;
}

emulator_address read_ready_file(const std::string &path)
{
    return read_ready_text(read_small_file(path, ready_file_name), path);
}

} // namespace quillmere::tools
