// What the configuration takes from the heap, and gives back.
#include <gtest/gtest.h>

#include "interpose/heap.h"
#include "quillmere.h"
#include "support/globals_guard.h"
#include "support/log_capture.h"

namespace quillmere_test {
namespace {

class ConfigurationMemory : public testing::Test {
protected:
    globals_guard globals;
    log_capture log;
};

TEST_F(ConfigurationMemory, HoldsTheTextsOfOneProxy)
{
    int64_t before = blocks_held();

    set_user_proxy("first.example", 1, "first", "one");
    EXPECT_EQ(blocks_held(), before + 3);

    set_user_proxy("second.example", 2, "second", "two");
    EXPECT_EQ(blocks_held(), before + 3);
}

TEST_F(ConfigurationMemory, GivesBackTheTextsOfAProxyThatIsCleared)
{
    int64_t before = blocks_held();
    set_user_proxy("proxy.example", 1, "someone", "secret");

    cleanup_proxy();

    EXPECT_EQ(blocks_held(), before);
}

TEST_F(ConfigurationMemory, GivesBackPathProxyAndHandlerWhenTheLibraryStops)
{
    api_global_init(nullptr); // what stays for the rest of the process is made once
    api_global_cleanup();
    tls_init();
    int64_t for_the_locks = blocks_held();
    tls_init();
    for_the_locks = blocks_held() - for_the_locks;
    int64_t before = blocks_held();

    api_global_init("/somewhere/roots.pem");
    set_user_proxy("proxy.example", 1, "someone", "secret");
    EXPECT_EQ(blocks_held(), before + for_the_locks + 5);
    api_global_cleanup();

    EXPECT_EQ(blocks_held(), before + for_the_locks);
}

TEST_F(ConfigurationMemory, GivesBackAPathThatTheStartReplaces)
{
    api_global_init("/first.pem");
    api_global_cleanup();
    replace_owned_text(ca_cert_pem_path.path, "/stored/before.pem");
    int64_t before = blocks_held();
    tls_init();
    int64_t for_the_locks = blocks_held() - before;
    before = blocks_held();

    api_global_init("/somewhere/roots.pem");

    EXPECT_EQ(blocks_held(), before + for_the_locks + 1); // the event handler's record
    api_global_cleanup();
}

} // namespace
} // namespace quillmere_test
