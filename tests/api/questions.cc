#include "api/questions.h"

#include <atomic>
#include <thread>
#include <vector>

#include "api/operations.h"

namespace quillmere_test {
namespace {

// The entries of a folder bear its key, so that no other listing can be taken for it.
std::string listing_of(const std::string &folder)
{
    std::string entries;
    for (const char *each : {"1", "2", "3"})
        entries += std::string("<file><filename>") + each + " of " + folder + "</filename></file>";
    return success_reply("<folder><name>in " + folder + "</name></folder>" + entries);
}

std::string feed_from(const std::string &revision)
{
    return success_reply("<updated><file><quickkey>k" + revision + "</quickkey><revision>" +
                         revision + "</revision></file></updated><device_revision>" + revision +
                         "</device_revision>");
}

} // namespace

std::string refusal(const std::string &number, const std::string &message)
{
    return xml_reply("<response><result>Error</result><error>" + number + "</error><message>" +
                     message + "</message></response>");
}

std::string answer_to(const request &asked)
{
    std::string path = asked.path();
    std::string token = asked.parameter("session_token").value_or("");
    if (path == get_device_status_uri) {
        std::string id = asked.parameter("device_id").value_or("");
        if (token == "refused")
            return refusal(id, "refused " + id);
        return success_reply("<device_revision>9" + id +
                             "</device_revision>"
                             "<async_jobs_in_progress>" +
                             token + "</async_jobs_in_progress>");
    }
    if (path == renew_session_token_uri)
        return success_reply("<session_token>new " + token + "</session_token>");
    std::string email = asked.parameter("email").value_or("");
    if (path == get_session_token_uri)
        return success_reply("<session_token>for " + email + "</session_token>");
    if (path == get_login_token_uri)
        return success_reply("<pkey>key of " + email + "</pkey><login_token>for " + email +
                             "</login_token>");
    if (path == get_folder_content_uri)
        return listing_of(asked.parameter("folder_key").value_or(""));
    if (path == get_device_changes_uri)
        return feed_from(asked.parameter("revision").value_or(""));
    if (path == get_links_uri)
        return success_reply("<link><view>of " + asked.parameter("quick_key").value_or("") +
                             "</view></link>");
    if (path == get_user_info_uri)
        return success_reply("<user_info><email>" + token + "</email></user_info>");
    if (path == get_system_limits_uri)
        return success_reply("<max_keys>10</max_keys>");
    if (path == get_system_status_uri)
        return success_reply("<database>fine</database>");
    return http_reply(404, "no such thing as " + asked.target);
}

namespace {

bool device(uint32_t number)
{
    bool busy = number % 2 == 0;
    uint64_t revision = 0;
    int32_t jobs = 0;
    char *message = nullptr;
    int32_t status = get_device_status(busy ? "yes" : "no", number, &revision, &jobs, &message);
    return taken(message) == std::nullopt && status == 0 && jobs == (busy ? 1 : 0) &&
           revision == std::stoull("9" + std::to_string(number));
}

bool refused(uint32_t number)
{
    uint64_t revision = 0;
    int32_t jobs = 0;
    char *message = nullptr;
    int32_t status = get_device_status("refused", number, &revision, &jobs, &message);
    return taken(message) == "refused " + std::to_string(number) &&
           status == static_cast<int32_t>(number);
}

bool renewal(uint32_t number)
{
    std::string old = "token" + std::to_string(number);
    char *token = nullptr;
    int32_t status = renew_session_token(old.c_str(), &token);
    return taken(token) == "new " + old && status == 0;
}

bool session(uint32_t number)
{
    std::string email = "user" + std::to_string(number);
    char *token = nullptr;
    int32_t status =
        get_session_token(email.c_str(), "password", nullptr, "42", "application key", &token);
    return taken(token) == "for " + email && status == 0;
}

bool login(uint32_t number)
{
    std::string email = "user" + std::to_string(number);
    pkey_slot pkey;
    char *token = nullptr;
    int32_t status =
        get_login_token(email.c_str(), "password", "42", "application key", pkey.place(), &token);
    bool right_key = pkey.take() == "key of " + email;
    return taken(token) == "for " + email && right_key && status == 0;
}

bool limits(uint32_t)
{
    system_limits *record = nullptr;
    char *message = nullptr;
    bool right = get_system_limits(&record, &message) == 0 &&
                 std::string(system_limits_get_max_keys(record)) == "10";
    api_free(message);
    system_limits_delete(&record);
    return right;
}

bool health(uint32_t)
{
    system_status *record = nullptr;
    char *message = nullptr;
    bool right = get_system_status(&record, &message) == 0 &&
                 std::string(system_status_get_database(record)) == "fine";
    api_free(message);
    system_status_delete(&record);
    return right;
}

bool direct_exchange(uint32_t number)
{
    std::string target = "/nothing/" + std::to_string(number);
    char *response = nullptr;
    uint64_t length = 0;
    int64_t code =
        get_response_from_url((urls[1] + target).c_str(), nullptr, 0, &response, &length, 0);
    return taken(response) == "no such thing as " + target && code == 404;
}

bool listing(uint32_t number)
{
    const std::string key = "folder" + std::to_string(number);
    folder_list *folders = nullptr;
    file_list *files = nullptr;
    int32_t folder_count = 0;
    int32_t file_count = 0;
    int32_t chunk_size = 0;
    char *message = nullptr;
    bool right = get_folder_content("token", key.c_str(), nullptr, "1", "files", &message, &folders,
                                    &folder_count, &files, &file_count, &chunk_size) == 0 &&
                 folder_count == 1 && file_count == 3 &&
                 folder_info_get_foldername(folders->next->record) == "in " + key &&
                 file_info_get_filename(files->next->record) == "3 of " + key;
    delete_all_folder_list(&folders);
    delete_all_file_list(&files);
    api_free(message);
    return right;
}

bool feed(uint32_t number)
{
    uint64_t revision = 0;
    change_list *changes = nullptr;
    uint32_t count = 0;
    int32_t block_size = 0;
    char *message = nullptr;
    int32_t status =
        get_device_changes("token", number, 0, &revision, &changes, &count, &block_size, &message);
    api_free(message);
    if (status != 0)
        return false;
    bool right = count == 1 && revision == number &&
                 change_info_get_key(changes->next->record) == "k" + std::to_string(number) &&
                 change_info_get_revision(changes->next->record) == number;
    delete_all_change_list(&changes);
    return right;
}

bool links(uint32_t number)
{
    const std::string key = "key" + std::to_string(number);
    file_links_list *list = nullptr;
    int32_t count = 0;
    char *message = nullptr;
    bool right = get_links(key.c_str(), nullptr, "token", &list, &count, &message) == 0 &&
                 count == 1 && file_links_get_view(list->next->record) == "of " + key;
    delete_all_file_links_list(&list);
    api_free(message);
    return right;
}

bool profile(uint32_t number)
{
    const std::string token = "token" + std::to_string(number);
    user_info *info = nullptr;
    char *message = nullptr;
    bool right =
        get_user_info(token.c_str(), &info, &message) == 0 && user_info_get_email(info) == token;
    user_info_delete(&info);
    api_free(message);
    return right;
}

} // namespace

const question questions[question_count] = {device,  refused, renewal, session,
                                            login,   limits,  health,  direct_exchange,
                                            listing, feed,    links,   profile};

unsigned wrong_answers(unsigned thread, unsigned rounds)
{
    unsigned wrong = 0;
    for (unsigned round = 0; round < rounds; ++round) {
        question ask = questions[(thread + round) % question_count];
        wrong += ask(100000 * (thread + 1) + round) ? 0 : 1;
    }
    return wrong;
}

unsigned wrong_answers_of_threads(unsigned thread_count, unsigned rounds)
{
    std::atomic<unsigned> wrong{0};
    std::vector<std::thread> threads;
    for (unsigned each = 0; each < thread_count; ++each)
        threads.emplace_back([&wrong, each, rounds] {
            api_thread_init();
            wrong += wrong_answers(each, rounds);
        });
    for (std::thread &each : threads)
        each.join();
    return wrong;
}

} // namespace quillmere_test
