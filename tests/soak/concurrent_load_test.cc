// Operations by the ten thousand on many threads at once, each of which must get the answer to its
// own question.
#include <gtest/gtest.h>

#include "api/questions.h"
#include "support/library_fixture.h"
#include "support/quick_server.h"
#include "support/resources.h"
#include "support/unread_log.h"

namespace quillmere_test {
namespace {

constexpr unsigned thread_count = QUILLMERE_LOAD_THREADS;
constexpr unsigned rounds = QUILLMERE_LOAD_ROUNDS;
constexpr unsigned tls_rounds = rounds / 50;

class ConcurrentLoad : public testing::Test {
protected:
    ConcurrentLoad() { set_default_timeout(60); }

    template <class Server> void ask(const Server &server)
    {
        base = server.base_url();
        urls[1] = base.c_str();
    }

    proxyless_environment environment;
    globals_guard globals;
    unread_log log;
    running_library library{test_root_path().c_str()};
    std::string base;
};

TEST_F(ConcurrentLoad, NeverCrossesAnswers)
{
    const quick_server server(answer_to);
    ask(server);

    EXPECT_EQ(wrong_answers_of_threads(thread_count, rounds), 0u);
}

TEST_F(ConcurrentLoad, NeverCrossesAnswersOverTls)
{
    const quick_server server(answer_to, tls_with(loopback_certificate()));
    ask(server);

    EXPECT_EQ(wrong_answers_of_threads(thread_count, tls_rounds), 0u);
}

TEST_F(ConcurrentLoad, IsBorneAfterEachOfAHundredStarts)
{
    // In another process, so that the descriptors here are none of the server's.
    const quick_server_process server(answer_to);
    ask(server);
    const size_t descriptors_before = open_descriptors();
    const size_t threads_before = threads();

    for (int start = 0; start < 100; ++start) {
        api_global_cleanup();
        api_global_init(test_root_path().c_str());
        ASSERT_EQ(wrong_answers_of_threads(8, question_count), 0u) << start;
    }

    EXPECT_EQ(threads(), threads_before);
    EXPECT_EQ(open_descriptors(), descriptors_before);
}

} // namespace
} // namespace quillmere_test
