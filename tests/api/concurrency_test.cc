// Operations on many threads at once, each of which must get the answer to its own question.
#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <thread>
#include <vector>

#include "api/operations.h"
#include "support/library_fixture.h"
#include "support/resources.h"

namespace quillmere_test {
namespace {

constexpr unsigned thread_count = 16;
constexpr unsigned rounds = 12;

std::string success(const std::string &inside)
{
    return xml_reply("<response><result>Success</result>" + inside + "</response>");
}

std::string refusal(const std::string &number, const std::string &message)
{
    return xml_reply("<response><result>Error</result><error>" + number + "</error><message>" +
                     message + "</message></response>");
}

// Answers every request with what only that request can have led to.
std::string echo(const request &asked)
{
    std::string path = asked.path();
    std::string token = asked.parameter("session_token").value_or("");
    if (path == get_device_status_uri) {
        std::string id = asked.parameter("device_id").value_or("");
        if (token == "refused")
            return refusal(id, "refused " + id);
        return success("<device_revision>9" + id +
                       "</device_revision>"
                       "<async_jobs_in_progress>" +
                       token + "</async_jobs_in_progress>");
    }
    if (path == renew_session_token_uri)
        return success("<session_token>new " + token + "</session_token>");
    std::string email = asked.parameter("email").value_or("");
    if (path == get_session_token_uri)
        return success("<session_token>for " + email + "</session_token>");
    if (path == get_login_token_uri)
        return success("<pkey>key of " + email + "</pkey><login_token>for " + email +
                       "</login_token>");
    if (path == get_system_limits_uri)
        return success("<max_keys>10</max_keys>");
    if (path == get_system_status_uri)
        return success("<database>fine</database>");
    return http_reply(404, "no such thing as " + asked.target);
}

// Each asks with a number of its own and says whether the answer belongs to it.
using question = bool (*)(uint32_t number);

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

bool exchange(uint32_t number)
{
    std::string target = "/nothing/" + std::to_string(number);
    char *response = nullptr;
    uint64_t length = 0;
    int64_t code =
        get_response_from_url((urls[1] + target).c_str(), nullptr, 0, &response, &length, 0);
    return taken(response) == "no such thing as " + target && code == 404;
}

constexpr question questions[] = {device, refused, renewal, session,
                                  login,  limits,  health,  exchange};

// The number of wrong answers that one thread gets.
unsigned wrong_answers(unsigned thread)
{
    unsigned wrong = 0;
    for (unsigned round = 0; round < rounds; ++round) {
        question ask = questions[(thread + round) % std::size(questions)];
        wrong += ask(1000 * (thread + 1) + round) ? 0 : 1;
    }
    return wrong;
}

class Concurrency : public library_test {
protected:
    static unsigned wrong_answers_of_all_threads()
    {
        std::atomic<unsigned> wrong{0};
        std::vector<std::thread> threads;
        for (unsigned each = 0; each < thread_count; ++each)
            threads.emplace_back([&wrong, each] {
                api_thread_init();
                wrong += wrong_answers(each);
            });
        for (std::thread &each : threads)
            each.join();
        return wrong;
    }
};

TEST_F(Concurrency, NeverCrossesAnswersOverTls)
{
    set_default_timeout(60);
    server.answer_with(echo);

    EXPECT_EQ(wrong_answers_of_all_threads(), 0u);

    EXPECT_EQ(server.requests().size(), thread_count * rounds);
}

TEST_F(Concurrency, NeverCrossesAnswersOfAHostThatIsLookedUp)
{
    set_default_timeout(60);
    plain_server.answer_with(echo);
    point_at(plain_server.base_url("localhost"));

    EXPECT_EQ(wrong_answers_of_all_threads(), 0u);
}

TEST_F(Concurrency, NeverCrossesAnswersThatNeedASecondAttempt)
{
    set_default_timeout(60);
    set_connection_attempts(8);
    std::atomic<unsigned> served{0};
    server.script([&served](connection &client) {
        request asked = client.read_request();
        if (served++ % 3 == 0)
            client.reset();
        else
            client.send(echo(asked));
    });

    EXPECT_EQ(wrong_answers_of_all_threads(), 0u);
}

TEST_F(Concurrency, TellsTheHookOfEveryRefusal)
{
    hook_recorder hook;
    server.answer(refusal("105", "No"));

    EXPECT_EQ(wrong_answers_of_all_threads(), thread_count * rounds);

    // The bare exchange has no hook.
    size_t exchanges = thread_count * rounds / std::size(questions);
    EXPECT_EQ(hook.calls().size(), thread_count * rounds - exchanges);
}

TEST_F(Concurrency, LeavesNoThreadBehind)
{
    size_t before = threads();
    server.answer_with(echo);

    limits(0);

    server.wait_until_idle();
    EXPECT_EQ(threads(), before);
}

} // namespace
} // namespace quillmere_test
