// Operations on many threads at once, each of which must get the answer to its own question.
#include <gtest/gtest.h>

#include <mutex>
#include <set>
#include <string>

#include "api/questions.h"
#include "support/library_fixture.h"
#include "support/resources.h"

namespace quillmere_test {
namespace {

constexpr unsigned thread_count = 16;
constexpr unsigned rounds = question_count;

class Concurrency : public library_test {
protected:
    static unsigned wrong_answers_of_all_threads()
    {
        return wrong_answers_of_threads(thread_count, rounds);
    }
};

TEST_F(Concurrency, NeverCrossesAnswersOverTls)
{
    set_default_timeout(60);
    server.answer_with(answer_to);

    EXPECT_EQ(wrong_answers_of_all_threads(), 0u);

    EXPECT_EQ(server.requests().size(), thread_count * rounds);
}

TEST_F(Concurrency, NeverCrossesAnswersOfAHostThatIsLookedUp)
{
    set_default_timeout(60);
    plain_server.answer_with(answer_to);
    point_at(plain_server.base_url("localhost"));

    EXPECT_EQ(wrong_answers_of_all_threads(), 0u);
}

TEST_F(Concurrency, NeverCrossesAnswersThatNeedASecondAttempt)
{
    set_default_timeout(60);
    set_connection_attempts(2);
    std::mutex lock;
    std::set<std::string> asked_before;
    server.script([&lock, &asked_before](connection &client) {
        request asked = client.read_request();
        bool is_new = false;
        {
            std::lock_guard<std::mutex> guard(lock);
            is_new = asked_before.insert(asked.target + asked.body).second;
        }
        if (is_new)
            client.reset();
        else
            client.send(answer_to(asked));
    });

    EXPECT_EQ(wrong_answers_of_all_threads(), 0u);

    server.wait_until_idle();
    EXPECT_GT(asked_before.size(), size_t{thread_count});
}

TEST_F(Concurrency, TellsTheHookOfEveryRefusal)
{
    hook_recorder hook;
    server.answer(refusal("105", "No"));

    EXPECT_EQ(wrong_answers_of_all_threads(), thread_count * rounds);

    // The bare exchange has no hook.
    size_t exchanges = thread_count * rounds / question_count;
    EXPECT_EQ(hook.calls().size(), thread_count * rounds - exchanges);
}

TEST_F(Concurrency, LeavesNoThreadBehind)
{
    size_t before = threads();
    server.answer_with(answer_to);

    EXPECT_EQ(wrong_answers(0, rounds), 0u);

    server.wait_until_idle();
    EXPECT_EQ(threads(), before);
}

} // namespace
} // namespace quillmere_test
