// Which peers the upload connection is made with, and which it refuses.
#include <curl/curl.h>

#include "transport/upload_fixture.h"

namespace quillmere_test {
namespace {

std::string curl_error(CURLcode code)
{
    return std::string("Curl error: ") + curl_easy_strerror(code) + "\n";
}

class RefusedUpload : public upload_test {
protected:
    void expect_refusal(const std::string &url, int32_t use_tls, CURLcode code)
    {
        EXPECT_EQ(open_connection(url.c_str(), use_tls, 10).result, -1);
        EXPECT_EQ(output.text(), curl_error(code));
        EXPECT_EQ(log.text(), "");
    }
};

TEST_F(RefusedUpload, IsNoConnection)
{
    refused_port nobody;

    expect_refusal(nobody.base_url() + "/upload", 0, CURLE_COULDNT_CONNECT);
}

TEST_F(RefusedUpload, IsNoUrl) { expect_refusal("", 0, CURLE_URL_MALFORMAT); }

TEST_F(RefusedUpload, IsNoKnownScheme) { expect_refusal("x://y/", 0, CURLE_UNSUPPORTED_PROTOCOL); }

// Nobody listens there: the address is this process's own.
TEST_F(RefusedUpload, IsPort443WhateverTheUrlSays)
{
    scripted_server elsewhere(on_address(address_of_this_process()));

    expect_refusal(elsewhere.base_url() + "/upload", 1, CURLE_COULDNT_CONNECT);

    EXPECT_EQ(elsewhere.connections(), 0u);
}

TEST(UploadConnection, MayBeNoneWhenItIsDeleted)
{
    send_file *none = nullptr;

    send_file_delete(&none);
    send_file_delete(nullptr);

    EXPECT_EQ(none, nullptr);
}

class TlsUpload : public upload_test {
protected:
    std::string url() const { return "https://" + address_of_this_process() + "/upload"; }

    int32_t open() { return open_connection(url().c_str(), 1, 10).result; }

    void expect_distrust()
    {
        EXPECT_EQ(open(), -1);
        EXPECT_EQ(output.text(), curl_error(CURLE_PEER_FAILED_VERIFICATION));
    }
};

TEST_F(TlsUpload, GoesToPort443WhateverTheUrlSays)
{
    if (!start_tls(certificate_of_this_process()))
        GTEST_SKIP() << not_permitted;
    std::string other_port = "https://" + address_of_this_process() + ":1/upload";

    EXPECT_EQ(open_connection(other_port.c_str(), 1, 10).result, 0);
    EXPECT_TRUE(peer->wait_for_connections(1));
}

TEST_F(TlsUpload, DistrustsAnUnknownRootEvenIfOperationsDoNot)
{
    if (!start_tls(certificate_of_unknown_root()))
        GTEST_SKIP() << not_permitted;
    ssl_disabled = 1;

    expect_distrust();
}

TEST_F(TlsUpload, DistrustsAnExpiredCertificate)
{
    if (!start_tls(test_root().issue({{address_of_this_process()}, validity::expired})))
        GTEST_SKIP() << not_permitted;

    expect_distrust();
}

TEST_F(TlsUpload, DistrustsACertificateForAnotherHost)
{
    if (!start_tls(certificate_for_another_host()))
        GTEST_SKIP() << not_permitted;

    expect_distrust();
}

TEST_F(TlsUpload, TrustsAnyRootWithoutCertificates)
{
    if (!start_tls(self_signed_certificate({{address_of_this_process()}})))
        GTEST_SKIP() << not_permitted;
    replace_owned_text(ca_cert_pem_path.path, std::nullopt);

    EXPECT_EQ(open(), 0) << output.text();
}

TEST_F(TlsUpload, DistrustsAnotherHostEvenWithoutCertificates)
{
    if (!start_tls(certificate_for_another_host()))
        GTEST_SKIP() << not_permitted;
    replace_owned_text(ca_cert_pem_path.path, std::nullopt);

    expect_distrust();
}

TEST_F(TlsUpload, GivesUpOnAHandshakeThatTakesTooLong)
{
    try {
        peer = std::make_unique<scripted_server>(
            on_port(tls_port, on_address(address_of_this_process())));
    } catch (const std::system_error &) {
        GTEST_SKIP() << not_permitted;
    }
    peer->script([](connection &client) { client.stall(); });

    EXPECT_EQ(open_connection(url().c_str(), 1, 1).result, -1);

    EXPECT_EQ(output.text(), curl_error(CURLE_OPERATION_TIMEDOUT));
}

} // namespace
} // namespace quillmere_test
