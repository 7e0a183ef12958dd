// What tls_init() says of the TLS library that is really there.
#include <gtest/gtest.h>

#include <curl/curl.h>
#include <openssl/crypto.h>

#include <cstdio>
#include <cstring>
#include <string>

#include "quillmere.h"
#include "support/log_capture.h"

namespace quillmere_test {
namespace {

std::string expected_log()
{
    std::string ssl = curl_version_info(CURLVERSION_NOW)->ssl_version;
    std::string log = "Curl SSL version: " + ssl + "\n";
    if (ssl.compare(0, 7, "OpenSSL") != 0)
        return log + "No OpenSSL support.\n";

    char number[32];
    std::snprintf(number, sizeof number, "%lx", OpenSSL_version_num());
    return log + "OpenSSL version: " + OpenSSL_version(OPENSSL_VERSION) +
           "\nOpenSSL version num: " + number +
           ".\nMutex locks requested: " + std::to_string(CRYPTO_num_locks()) +
           ".\nUsing deprecated OpenSSL.\n";
}

TEST(TlsInit, LogsTheVersionsAndTheNumberOfLocks)
{
    log_capture log;

    int32_t result = tls_init();

    EXPECT_EQ(result, 0);
    EXPECT_EQ(log.text(), expected_log());
}

TEST(TlsInit, MayBeCalledAgain)
{
    log_capture log;
    tls_init();
    log.clear();

    int32_t result = tls_init();

    EXPECT_EQ(result, 0);
    EXPECT_EQ(log.text(), expected_log());
}

} // namespace
} // namespace quillmere_test
