// The certificate file is read once, and nothing else is different from having libcurl read it for
// every connection.
#include <algorithm>
#include <thread>

#include <fcntl.h>
#include <openssl/x509.h>
#include <sys/stat.h>
#include <unistd.h>

#include "interpose/clock.h"
#include "interpose/files.h"
#include "runtime/tls_locks.h"
#include "support/failure.h"
#include "support/library_fixture.h"
#include "support/thread_log.h"
#include "support/tunnel.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

using quillmere::shares_openssl_with_libcurl;
using testing::MatchesRegex;

// The time of the last change to a file.
std::time_t changed(const std::string &file)
{
    struct stat state = {};
    require(::stat(file.c_str(), &state) == 0, "stat");
    return state.st_ctim.tv_sec;
}

// Gives a file a time of change by which no later one can be mistaken for it.
void make_old(const std::string &file)
{
    const timespec long_ago[2] = {{1000, 0}, {1000, 0}};
    require(::utimensat(AT_FDCWD, file.c_str(), long_ago, 0) == 0, "utimensat");
}

std::string pem_of(const certificate_authority &authority)
{
    return authority.root().certificate_pem();
}

class KeptCertificates : public library_test {
protected:
    KeptCertificates()
    {
        server.answer(http_reply(200, "trusted"));
        trust(pem_of(test_root()));
    }

    // Writes the file, in place if it exists, as if it had been there for long.
    void trust(const std::string &content)
    {
        file = folder.write("roots.pem", content);
        make_old(file);
        replace_owned_text(ca_cert_pem_path.path, file);
    }

    int64_t code() const { return fetch(server.base_url() + path).code; }

    temporary_folder folder;
    std::string file;
    watched_files files;
    pretended_time an_hour_later{std::time(nullptr) + 3600};
    certificate_authority stranger{"quillmere unknown root"};
};

TEST_F(KeptCertificates, AreReadOnceForManyRequests)
{
    for (int request = 0; request < 5; ++request)
        EXPECT_EQ(code(), 200);

    EXPECT_EQ(files.openings_of(file), 1u);
}

TEST_F(KeptCertificates, ServeProbesAndUploadConnectionsToo)
{
    std::string url = server.base_url() + "/?q";
    ASSERT_EQ(code(), 200);

    EXPECT_EQ(check_url_response_code(url.c_str(), 5000), 1);
    EXPECT_EQ(check_url_response(server.base_url().c_str(), "q", "trusted", 5000), 1);

    EXPECT_EQ(files.openings_of(file), 1u);
}

TEST_F(KeptCertificates, AreNotReadForRequestsWithoutTls)
{
    plain_server.answer(http_reply(200, "plain"));

    EXPECT_EQ(fetch(plain_server.base_url() + path).code, 200);

    EXPECT_EQ(files.openings_of(file), 0u);
}

TEST_F(KeptCertificates, AreForgottenWhenTheLibraryStops)
{
    ASSERT_EQ(code(), 200);

    api_global_cleanup();
    api_global_init(file.c_str());

    EXPECT_EQ(code(), 200);
    EXPECT_EQ(files.openings_of(file), 2u);
}

TEST_F(KeptCertificates, AreLeftToLibcurlWhenItsTlsLibraryIsAnother)
{
    shares_openssl_with_libcurl = false;

    EXPECT_EQ(code(), 200);
    EXPECT_EQ(code(), 200);

    EXPECT_EQ(files.openings_of(file), 2u);
}

TEST_F(KeptCertificates, AreReadAgainUntilTheFileHasSettled)
{
    {
        pretended_time too_early(changed(file) + 2);
        EXPECT_EQ(code(), 200);
        EXPECT_EQ(code(), 200);
        EXPECT_EQ(files.openings_of(file), 2u);
    }
    pretended_time late_enough(changed(file) + 3);

    EXPECT_EQ(code(), 200);
    EXPECT_EQ(code(), 200);

    EXPECT_EQ(files.openings_of(file), 3u);
}

TEST_F(KeptCertificates, AreReadAgainWhenAnotherFileTakesTheName)
{
    ASSERT_EQ(code(), 200);

    std::string other = folder.write("other.pem", pem_of(stranger));
    ASSERT_EQ(::rename(other.c_str(), file.c_str()), 0);

    EXPECT_EQ(code(), -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_PEER_FAILED_VERIFICATION)));
}

TEST_F(KeptCertificates, AreReadAgainWhenTheFileIsWrittenAnewWithTheSameLength)
{
    std::string good = pem_of(test_root());
    std::string bad = pem_of(stranger);
    good.resize(std::max(good.size(), bad.size()), '\n');
    bad.resize(good.size(), '\n');
    trust(bad);
    ASSERT_EQ(code(), -1);

    folder.write("roots.pem", good);

    EXPECT_EQ(code(), 200);
    folder.write("roots.pem", bad);
    make_old(file);
    EXPECT_EQ(code(), -1);
}

TEST_F(KeptCertificates, AreReadAgainWhenAnotherPathIsConfigured)
{
    ASSERT_EQ(code(), 200);
    std::string other = folder.write("other.pem", pem_of(stranger));

    replace_owned_text(ca_cert_pem_path.path, other);
    EXPECT_EQ(code(), -1);

    replace_owned_text(ca_cert_pem_path.path, file);
    EXPECT_EQ(code(), 200);
}

TEST_F(KeptCertificates, AreNotUsedOnceTheFileIsGone)
{
    ASSERT_EQ(code(), 200);

    ASSERT_EQ(::unlink(file.c_str()), 0);

    EXPECT_EQ(code(), -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SSL_CACERT_BADFILE)));
}

TEST_F(KeptCertificates, AreNotUsedOnceTheFileIsNotReadable)
{
    ASSERT_EQ(code(), 200);

    ASSERT_EQ(::utimensat(AT_FDCWD, file.c_str(), nullptr, 0), 0); // as chmod() changes a time
    files.refused = file;

    EXPECT_EQ(code(), -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SSL_CACERT_BADFILE)));
}

TEST_F(KeptCertificates, AreNotReadFromWhatIsNoFile)
{
    const std::string device = "/dev/./null"; // which nobody else calls it
    replace_owned_text(ca_cert_pem_path.path, device);
    ASSERT_EQ(code(), -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SSL_CACERT_BADFILE)));
    size_t openings = files.openings_of(device);

    shares_openssl_with_libcurl = false;
    ASSERT_EQ(code(), -1);

    EXPECT_EQ(files.openings_of(device), 2 * openings);
}

TEST_F(KeptCertificates, AreNotUsedWithoutAPath)
{
    scripted_server impostor{tls_with(certificate_of_unknown_root())};
    impostor.answer(http_reply(200, "unverified"));
    ASSERT_EQ(code(), 200);

    replace_owned_text(ca_cert_pem_path.path, std::nullopt);

    EXPECT_EQ(fetch(impostor.base_url() + path).code, 200);
}

TEST_F(KeptCertificates, DoNotMatterWhenVerificationIsDisabled)
{
    scripted_server impostor{tls_with(certificate_of_unknown_root())};
    impostor.answer(http_reply(200, "unverified"));
    ASSERT_EQ(code(), 200);

    ssl_disabled = 1;

    EXPECT_EQ(fetch(impostor.base_url() + path).code, 200);
}

TEST_F(KeptCertificates, VerifyEveryServerThatARequestIsRedirectedTo)
{
    scripted_server impostor{tls_with(certificate_of_unknown_root())};
    impostor.answer(http_reply(200, "not to be trusted"));
    server.answer(http_reply(302, "", {"Location: " + impostor.base_url() + "/"}));

    EXPECT_EQ(code(), -1);
    EXPECT_EQ(impostor.connections(), 1u);
    EXPECT_EQ(impostor.requests().size(), 0u);
}

TEST_F(KeptCertificates, ServeManyThreadsAtOnce)
{
    constexpr int number = 16;
    thread_log quiet;
    std::vector<int64_t> codes(number * 3);
    std::vector<std::thread> threads;
    for (size_t i = 0; i < number; ++i)
        threads.emplace_back([&, i] {
            for (size_t round = 0; round < 3; ++round)
                codes[3 * i + round] = code();
        });
    for (std::thread &each : threads)
        each.join();

    EXPECT_THAT(codes, testing::Each(200));
    EXPECT_EQ(files.openings_of(file), 1u);
}

class ConnectionsUnderCertificates : public KeptCertificates {
protected:
    ConnectionsUnderCertificates()
    {
        set_connection_reuse(1);
        server.script([](connection &client) {
            for (;;) {
                client.read_request();
                client.send("HTTP/1.1 200 OK\r\nContent-Length: 4\r\n\r\nkept");
            }
        });
    }
};

TEST_F(ConnectionsUnderCertificates, AreKeptAsLongAsTheFileStays)
{
    for (int request = 0; request < 3; ++request)
        EXPECT_EQ(code(), 200);

    EXPECT_EQ(server.connections(), 1u);
    EXPECT_EQ(files.openings_of(file), 1u);
}

TEST_F(ConnectionsUnderCertificates, AreKeptAlsoWhenLibcurlReadsTheFile)
{
    shares_openssl_with_libcurl = false;

    for (int request = 0; request < 3; ++request)
        EXPECT_EQ(code(), 200);

    EXPECT_EQ(server.connections(), 1u);
}

TEST_F(ConnectionsUnderCertificates, AreNotUsedOnceTheFileHoldsOthers)
{
    ASSERT_EQ(code(), 200);

    folder.write("roots.pem", pem_of(stranger));

    EXPECT_EQ(code(), -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_PEER_FAILED_VERIFICATION)));
}

TEST_F(ConnectionsUnderCertificates, AreNotUsedOnceTheFileIsGone)
{
    ASSERT_EQ(code(), 200);

    ASSERT_EQ(::unlink(file.c_str()), 0);

    EXPECT_EQ(code(), -1);
    EXPECT_THAT(log.text(), MatchesRegex(failure_line(CURLE_SSL_CACERT_BADFILE)));
}

TEST_F(ConnectionsUnderCertificates, AreNotUsedUnderAnotherPath)
{
    ASSERT_EQ(code(), 200);

    replace_owned_text(ca_cert_pem_path.path, folder.write("other.pem", pem_of(stranger)));

    EXPECT_EQ(code(), -1);
}

TEST_F(ConnectionsUnderCertificates, OfTheTimeWithoutVerificationAreNotUsed)
{
    replace_owned_text(ca_cert_pem_path.path, std::nullopt);
    ASSERT_EQ(code(), 200);

    replace_owned_text(ca_cert_pem_path.path, folder.path_of("missing.pem"));

    EXPECT_EQ(code(), -1);
}

TEST_F(ConnectionsUnderCertificates, AreMadeAnewUntilTheFileHasSettled)
{
    pretended_time too_early(changed(file) + 2);

    EXPECT_EQ(code(), 200);
    EXPECT_EQ(code(), 200);

    EXPECT_EQ(server.connections(), 2u);
}

// One exchange with a server whose certificate, or one of whose roots, is as a test wants it, with
// the certificates in memory and without.
struct trial {
    const char *name;
    certificate (*shown)();
    std::string (*content)(); // of the certificate file
    int64_t code;
};

void PrintTo(const trial &each, std::ostream *out) { *out << each.name; }

std::string root_pem() { return pem_of(test_root()); }

const certificate &loopback() { return loopback_certificate(); }
certificate good() { return loopback(); }
certificate self_signed() { return self_signed_certificate(); }

std::string revocations() { return revocation_list_pem(test_root(), loopback()); }

std::string broken(std::string pem) { return pem.replace(pem.size() / 2, 4, "!!!!"); }

const trial trials[] = {
    {"good", good, root_pem, 200},
    {"expired", expired_certificate, root_pem, -1},
    {"not yet valid", not_yet_valid_certificate, root_pem, -1},
    {"for another host", certificate_for_another_host, root_pem, -1},
    {"of an unknown root", certificate_of_unknown_root, root_pem, -1},
    {"self-signed", self_signed, root_pem, -1},
    {"leaf as root", good, [] { return loopback().certificate_pem(); }, 200},
    {"two roots", good, [] { return pem_of(test_root_namesake()) + root_pem(); }, 200},
    {"a namesake of the root", good, [] { return pem_of(test_root_namesake()); }, -1},
    {"the same root twice", good, [] { return root_pem() + root_pem(); }, 200},
    {"root with its key", good, [] { return test_root().root().key_pem() + root_pem(); }, 200},
    {"text around", good, [] { return "a\n" + root_pem() + "b\n"; }, 200},
    {"revoked", good, [] { return root_pem() + revocations(); }, 200},
    {"revocations alone", good, revocations, -1},
    {"broken second", good, [] { return root_pem() + broken(root_pem()); }, -1},
    {"broken first", good, [] { return broken(root_pem()) + root_pem(); }, -1},
    {"cut off", good, [] { return root_pem() + root_pem().substr(0, 100); }, -1},
    {"empty", good, [] { return std::string(); }, -1},
    {"no certificate", good, [] { return std::string("no certificate\n"); }, -1},
    {"key alone", good, [] { return test_root().root().key_pem(); }, -1},
};

class CertificatesInMemory : public KeptCertificates, public testing::WithParamInterface<trial> {};

TEST_P(CertificatesInMemory, GiveTheOutcomeOfTheFile)
{
    scripted_server shown{tls_with(GetParam().shown())};
    shown.answer(http_reply(200, "trusted"));
    trust(GetParam().content());
    std::string url = shown.base_url() + path;
    int64_t from_memory = fetch(url).code;
    std::string log_from_memory = log.text();
    log.clear();

    shares_openssl_with_libcurl = false;
    int64_t from_file = fetch(url).code;

    EXPECT_EQ(from_memory, GetParam().code);
    EXPECT_EQ(from_file, GetParam().code);
    EXPECT_EQ(log_from_memory, log.text());
}

INSTANTIATE_TEST_SUITE_P(All, CertificatesInMemory, testing::ValuesIn(trials));

// The directory of certificates that libcurl was built with, with a content of the test's own.
class CertificateDirectory : public KeptCertificates, public testing::WithParamInterface<bool> {
protected:
    CertificateDirectory()
    {
        const char *built_in = curl_version_info(CURLVERSION_NOW)->capath;
        if (!built_in)
            return;
        files.folder = built_in;
        files.stands_in = directory.path();
        shares_openssl_with_libcurl = GetParam();
    }

    void SetUp() override
    {
        if (files.folder.empty())
            GTEST_SKIP() << "this libcurl has no directory of certificates";
    }

    std::string add(const certificate_authority &authority) const
    {
        return add_to_directory(directory, authority);
    }

    temporary_folder directory;
};

TEST_P(CertificateDirectory, IsTrustedBesideTheFile)
{
    trust(pem_of(stranger));
    ASSERT_EQ(code(), -1);

    add(test_root());

    EXPECT_EQ(code(), 200);
}

TEST_P(CertificateDirectory, IsNotTrustedForWhatItHeldOnce)
{
    trust(pem_of(stranger));
    std::string entry = add(test_root());
    ASSERT_EQ(code(), 200);

    ASSERT_EQ(::unlink(entry.c_str()), 0);

    EXPECT_EQ(code(), -1);
}

TEST_P(CertificateDirectory, ComesAfterTheFile)
{
    trust(pem_of(test_root_namesake()));
    add(test_root());

    EXPECT_EQ(code(), -1);
}

TEST_P(CertificateDirectory, IsNotLookedIntoForWhatTheFileHolds)
{
    std::string entry = add(test_root());

    EXPECT_EQ(code(), 200);

    EXPECT_EQ(files.openings_of(files.folder + entry.substr(directory.path().size())), 0u);
}

INSTANTIATE_TEST_SUITE_P(FromMemoryAndFile, CertificateDirectory, testing::Bool());

class HttpsProxy : public KeptCertificates, public testing::WithParamInterface<bool> {
protected:
    HttpsProxy()
    {
        shares_openssl_with_libcurl = GetParam();
        proxy.script(tunnelling_to(server.port()));
        std::string address = proxy.base_url("127.0.0.1");
        set_user_proxy(address.c_str(), proxy.port(), nullptr, nullptr);
        proxy_server.enabled = 1;
    }

    scripted_server proxy{tls_with(loopback_certificate())};
};

TEST_P(HttpsProxy, IsNotVerifiedAgainstTheCertificatesForTheService)
{
    EXPECT_EQ(code(), -1);

    EXPECT_EQ(proxy.requests().size(), 0u);
    EXPECT_EQ(server.connections(), 0u);
}

INSTANTIATE_TEST_SUITE_P(FromMemoryAndFile, HttpsProxy, testing::Bool());

} // namespace
} // namespace quillmere_test
