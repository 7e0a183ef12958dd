#include "session_file.h"

#include <algorithm>
#include <string_view>

#include <nlohmann/json.hpp>

#include "console.h"
#include "failure.h"

namespace quillmere::tools {

namespace {

constexpr const char *session_file_name = "the session file";

std::string text_of(const nlohmann::json &document, const char *key)
{
    const auto found = document.find(key);
    return found != document.end() && found->is_string() ? found->get<std::string>() : "";
}

// A token goes into addresses as it is. One with a letter that ends it there would be another token
// for the service, and what is behind the letter would not be taken for a secret in the log.
bool can_be_sent(const std::string &token)
{
    return std::none_of(token.begin(), token.end(), [](char letter) {
        const auto byte = static_cast<unsigned char>(letter);
        return byte <= ' ' || byte == 0x7f ||
               std::string_view("&#\"'<>").find(letter) != std::string_view::npos;
    });
}

session read_session(const std::string &text, const std::string &path)
{
    const nlohmann::json document = nlohmann::json::parse(text, nullptr, false);
    session current;
    if (document.is_object()) {
        current.service = text_of(document, "service");
        current.email = text_of(document, "email");
        current.token = text_of(document, "session_token");
    }
    if (current.service.empty() || current.token.empty() || !can_be_sent(current.token))
        throw failure(exit_code::local_file,
                      std::string(session_file_name) + " " + path + " is damaged",
                      "sign in again with: quillmere login");
    return current;
}

} // namespace

std::string session_path(const environment &surroundings)
{
    return surroundings.directory("XDG_STATE_HOME", ".local/state") + "/quillmere/session.json";
}

std::optional<session> session_file::load() const
{
    const auto found = read_private_file(path_, session_file_name);
    if (!found)
        return std::nullopt;
    if (found->found == privacy::repaired)
        warn("other users could read the session file " + path_ +
             "; they no longer can, but sign in again if they may have");
    return read_session(found->text, path_);
}

void session_file::save(const session &current) const
{
    if (!can_be_sent(current.token))
        throw failure(exit_code::unreadable_answer, "the service gave a token that cannot be sent");
    const nlohmann::ordered_json document = {
        {"service", current.service}, {"email", current.email}, {"session_token", current.token}};
    // Bytes that are no UTF-8 cannot stand in JSON, and a token with other bytes is another token.
    try {
        write_private_file(path_, document.dump(2) + "\n", session_file_name, folder_);
    } catch (const nlohmann::json::exception &) {
        throw failure(exit_code::unreadable_answer, "the service gave a token that is no text",
                      "run it again with --verbose to see the answer");
    }
}

bool session_file::remove() const { return remove_file(path_, session_file_name); }

} // namespace quillmere::tools
