// Whose certificates an exchange trusts, and what switches that off.
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using testing::MatchesRegex;

struct bad_certificate {
    const char *fault;
    certificate (*make)();
    bool wrong_host;
};

void PrintTo(const bad_certificate &each, std::ostream *out) { *out << each.fault; }

certificate self_signed() { return self_signed_certificate(); }

const bad_certificate bad_certificates[] = {
    {"expired", expired_certificate, false},
    {"not yet valid", not_yet_valid_certificate, false},
    {"for another host", certificate_for_another_host, true},
    {"of an unknown root", certificate_of_unknown_root, false},
    {"self-signed", self_signed, false},
};

class TlsVerification : public library_test {
protected:
    std::string url() const { return server.base_url() + path; }
};

TEST_F(TlsVerification, AcceptsACertificateOfTheConfiguredRoot)
{
    server.answer(http_reply(200, "trusted"));

    EXPECT_EQ(fetch(url()).body, "trusted");
    EXPECT_EQ(log.text(), "");
}

TEST_F(TlsVerification, AcceptsAHostName)
{
    server.answer(http_reply(200, "trusted"));

    EXPECT_EQ(fetch(server.base_url("localhost") + path).body, "trusted");
}

TEST_F(TlsVerification, FailsWithACertificateFileThatIsMissing)
{
    temporary_folder folder;
    replace_owned_text(ca_cert_pem_path.path, folder.path_of("missing.pem"));

    EXPECT_EQ(fetch(url()).code, -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SSL_CACERT_BADFILE)));
    EXPECT_EQ(server.requests().size(), 0u);
}

TEST_F(TlsVerification, FailsWithACertificateFileThatHoldsNone)
{
    temporary_folder folder;
    replace_owned_text(ca_cert_pem_path.path, folder.write("no.pem", "no certificate\n"));

    EXPECT_EQ(fetch(url()).code, -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SSL_CACERT_BADFILE)));
}

TEST_F(TlsVerification, ReadsItsConfigurationAfreshForEveryExchange)
{
    server.answer(http_reply(200, "trusted"));
    replace_owned_text(ca_cert_pem_path.path, "/missing.pem");
    EXPECT_EQ(fetch(url()).code, -1);

    replace_owned_text(ca_cert_pem_path.path, test_root_path());

    EXPECT_EQ(fetch(url()).code, 200);
}

TEST_F(TlsVerification, NeedsNoCertificateFileWhenItIsDisabled)
{
    replace_owned_text(ca_cert_pem_path.path, "/missing.pem");
    ssl_disabled = 1;
    server.answer(http_reply(200, "unverified"));

    EXPECT_EQ(fetch(url()).body, "unverified");
}

class BadCertificate : public TlsVerification, public testing::WithParamInterface<bad_certificate> {
protected:
    scripted_server impostor{tls_with(GetParam().make())};
    std::string impostor_url() const { return impostor.base_url() + path; }
};

TEST_P(BadCertificate, IsRefusedOnEveryAttempt)
{
    set_connection_attempts(2);
    impostor.answer(http_reply(200, "not to be trusted"));

    exchange result = fetch(impostor_url());

    EXPECT_EQ(result.code, -1);
    EXPECT_EQ(result.body, std::nullopt);
    EXPECT_EQ(impostor.connections(), 2u);
    EXPECT_EQ(impostor.requests().size(), 0u);
    EXPECT_THAT(log.text(),
                MatchesRegex(repeated(failure_line(CURLE_PEER_FAILED_VERIFICATION), 2)));
}

TEST_P(BadCertificate, IsAcceptedWhenVerificationIsDisabled)
{
    ssl_disabled = -1; // anything but zero
    impostor.answer(http_reply(200, "unverified"));

    EXPECT_EQ(fetch(impostor_url()).body, "unverified");
}

INSTANTIATE_TEST_SUITE_P(Faults, BadCertificate, testing::ValuesIn(bad_certificates));

class WithoutCertificates : public library_test,
                            public testing::WithParamInterface<bad_certificate> {
protected:
    WithoutCertificates() : library_test(nullptr) {}
};

TEST_P(WithoutCertificates, OnlyTheHostNameIsVerified)
{
    ASSERT_EQ(ca_cert_pem_path.path, nullptr);
    scripted_server impostor{tls_with(GetParam().make())};
    impostor.answer(http_reply(200, "unverified"));

    exchange result = fetch(impostor.base_url() + path);

    EXPECT_EQ(result.code, GetParam().wrong_host ? -1 : 200);
    EXPECT_EQ(impostor.requests().size(), GetParam().wrong_host ? 0u : 1u);
    EXPECT_THAT(log.text(),
                MatchesRegex(GetParam().wrong_host ? failure_line(CURLE_PEER_FAILED_VERIFICATION)
                                                   : std::string()));
}

TEST_P(WithoutCertificates, NothingIsVerifiedWhenThatIsDisabled)
{
    ssl_disabled = 1;
    scripted_server impostor{tls_with(GetParam().make())};
    impostor.answer(http_reply(200, "unverified"));

    EXPECT_EQ(fetch(impostor.base_url() + path).body, "unverified");
}

INSTANTIATE_TEST_SUITE_P(Faults, WithoutCertificates, testing::ValuesIn(bad_certificates));

} // namespace
} // namespace quillmere_test
