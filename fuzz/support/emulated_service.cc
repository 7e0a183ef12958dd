#include "support/emulated_service.h"

#include "router.h"
#include "store/accounts.h"
#include "store/sessions.h"

namespace quillmere_fuzz {

namespace {

constexpr std::int64_t noon = 1'700'000'000;
constexpr std::int64_t for_ever = 1'000'000'000;
constexpr const char *hash_of_nothing =
    "e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855";

const std::filesystem::path &content_folder()
{
    static const scratch_directory scratch;
    return scratch.path();
}

void replace_all(std::string &text, const std::string &what, const std::string &with)
{
    for (size_t at = 0; (at = text.find(what, at)) != std::string::npos; at += with.size())
        text.replace(at, what.size(), with);
}

} // namespace

emulated_service::emulated_service()
    : content_(content_folder()), state_{store_, content_, [] { return noon; }, for_ever}
{
    account_ = emulator::add_account(store_, {"ann@example.org", "password", "fb"}, noon).value();
    token_ = emulator::open_session(store_, account_, {noon, for_ever});
    folder_ = look_up(done("folder/create", "foldername=folder"), "folder_key").value();
    file_ =
        look_up(done("file/create", "filename=file.txt&parent_key=" + folder_), "quickkey").value();
}

emulated_service::~emulated_service() { content_.keep_only({}); }

std::string emulated_service::filled_in(std::string text) const
{
    replace_all(text, "{T}", token_);
    replace_all(text, "{F}", folder_);
    replace_all(text, "{Q}", file_);
    replace_all(text, "{H}", hash_of_nothing);
    return text;
}

document emulated_service::done(const std::string &action, const std::string &parameters)
{
    emulator::reply made = emulator::answer(
        {"GET", "/api/" + action + ".php?session_token=" + token_ + "&" + parameters, {}, {}},
        state_);
    document reply = read_document(made.body);
    expect(look_up(reply, "/result") == "Success", "the account can be asked");
    return reply;
}

size_t emulated_service::stored_files() const
{
    size_t count = 0;
    for (const auto &each : std::filesystem::recursive_directory_iterator(content_folder()))
        count += each.is_regular_file() ? 1 : 0;
    return count;
}

uint64_t emulated_service::revision() { return emulator::account_revision(store_, account_); }

void expect_envelope(const emulator::reply &made, const std::string &success)
{
    document reply = read_document(made.body);
    expect(reply.well_formed && !reply.events.empty() && reply.events.front().text == "response",
           "the reply is an envelope");
    bool good = made.http_status == 200;
    expect(look_up(reply, "/result") == (good ? success : "Error"), "the result of a reply");
    expect(made.http_status < 500, "the service itself has not failed");
    expect(good || read_error(reply).number > 0, "an error has a number");
}

} // namespace quillmere_fuzz
