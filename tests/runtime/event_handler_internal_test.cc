// The record of the event handler: there between start and stop, and only then.
#include <gtest/gtest.h>

#include <cstddef>

#include "interpose/heap.h"
#include "quillmere.h"
#include "runtime/lifecycle.h"
#include "support/globals_guard.h"
#include "support/log_capture.h"

namespace quillmere_test {
namespace {

using quillmere::event_handler;
using quillmere::event_handler_record;

class EventHandler : public testing::Test {
protected:
    ~EventHandler() override
    {
        if (event_handler)
            api_global_cleanup();
    }

    globals_guard globals;
    log_capture log;
};

void first_handler(int32_t, void *) {}
void second_handler(int32_t, void *) {}

TEST_F(EventHandler, IsAFunctionAndThenItsArgument)
{
    EXPECT_EQ(offsetof(event_handler_record, function), 0u);
    EXPECT_EQ(offsetof(event_handler_record, argument), sizeof(void *));
    EXPECT_EQ(sizeof(event_handler_record), 2 * sizeof(void *));
}

TEST_F(EventHandler, HasNoRecordBeforeTheStart) { EXPECT_EQ(event_handler, nullptr); }

TEST_F(EventHandler, HasAnEmptyRecordAfterTheStart)
{
    api_global_init(nullptr);

    ASSERT_NE(event_handler, nullptr);
    EXPECT_EQ(event_handler->function, nullptr);
    EXPECT_EQ(event_handler->argument, nullptr);
}

TEST_F(EventHandler, IsStoredWithItsArgument)
{
    int argument = 0;
    api_global_init(nullptr);

    install_event_handler(first_handler, &argument);

    EXPECT_EQ(event_handler->function, &first_handler);
    EXPECT_EQ(event_handler->argument, &argument);
}

TEST_F(EventHandler, IsReplacedTogetherWithItsArgument)
{
    int argument = 0;
    api_global_init(nullptr);
    install_event_handler(first_handler, &argument);

    install_event_handler(second_handler, nullptr);

    EXPECT_EQ(event_handler->function, &second_handler);
    EXPECT_EQ(event_handler->argument, nullptr);
}

TEST_F(EventHandler, CanBeTakenAway)
{
    int argument = 0;
    api_global_init(nullptr);
    install_event_handler(first_handler, &argument);

    install_event_handler(nullptr, &argument);

    EXPECT_EQ(event_handler->function, nullptr);
    EXPECT_EQ(event_handler->argument, &argument);
}

TEST_F(EventHandler, HasNoRecordAfterTheStop)
{
    api_global_init(nullptr);

    api_global_cleanup();

    EXPECT_EQ(event_handler, nullptr);
}

TEST_F(EventHandler, IsNotKeptOutsideStartAndStop)
{
    install_event_handler(first_handler, nullptr);
    EXPECT_EQ(event_handler, nullptr);

    api_global_init(nullptr);
    EXPECT_EQ(event_handler->function, nullptr);

    api_global_cleanup();
    install_event_handler(first_handler, nullptr);
    EXPECT_EQ(event_handler, nullptr);
}

TEST_F(EventHandler, IsForgottenByANewStart)
{
    api_global_init(nullptr);
    install_event_handler(first_handler, nullptr);
    api_global_cleanup();

    api_global_init(nullptr);

    EXPECT_EQ(event_handler->function, nullptr);
}

TEST_F(EventHandler, IsForgottenByASecondStartWithoutAStop)
{
    api_global_init(nullptr);
    install_event_handler(first_handler, nullptr);
    int64_t before = blocks_held();
    tls_init();
    int64_t for_the_locks = blocks_held() - before;
    before = blocks_held();

    api_global_init(nullptr);

    EXPECT_EQ(event_handler->function, nullptr);
    EXPECT_EQ(blocks_held(), before + for_the_locks);
}

} // namespace
} // namespace quillmere_test
