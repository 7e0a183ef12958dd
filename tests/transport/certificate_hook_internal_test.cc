// How the certificates in memory get into the store of a connection: libcurl may fill that store
// after it has called the hook, as the libcurl that is tested with does, or before.
#include <memory>

#include <openssl/pem.h>
#include <openssl/ssl.h>

#include "support/failure.h"
#include "support/library_fixture.h"
#include "transport/easy_calls.h"
#include "transport/exchange.h"

namespace quillmere_test {
namespace {

constexpr const char *secure_url = "https://service.example/a/path";

class CertificateHook : public library_test {
protected:
    CertificateHook()
    {
        calls.perform = [this](size_t) {
            perform();
            return CURLE_OK;
        };
    }

    // What libcurl does with a connection, during a transfer of the library's.
    virtual void perform() {}

    void fill(const std::string &pem) const
    {
        std::unique_ptr<BIO, decltype(&BIO_free_all)> file(
            BIO_new_mem_buf(pem.data(), static_cast<int>(pem.size())), BIO_free_all);
        STACK_OF(X509_INFO) *items = PEM_X509_INFO_read_bio(file.get(), nullptr, nullptr, nullptr);
        require(items != nullptr, "PEM_X509_INFO_read_bio");
        for (int i = 0; i < sk_X509_INFO_num(items); ++i) {
            X509_INFO *item = sk_X509_INFO_value(items, i);
            if (item->crl)
                X509_STORE_add_crl(store, item->crl);
            if (item->x509)
                X509_STORE_add_cert(store, item->x509);
        }
        sk_X509_INFO_pop_free(items, X509_INFO_free);
    }

    CURLcode call_hook() const
    {
        auto hook = reinterpret_cast<curl_ssl_ctx_callback>(
            const_cast<void *>(calls.last(CURLOPT_SSL_CTX_FUNCTION).pointer));
        return hook(nullptr, context.get(),
                    const_cast<void *>(calls.last(CURLOPT_SSL_CTX_DATA).pointer));
    }

    std::string mark() const { return calls.last(CURLOPT_CAINFO_BLOB).text; }

    bool trusts(const certificate &leaf) const
    {
        std::unique_ptr<X509_STORE_CTX, decltype(&X509_STORE_CTX_free)> verification(
            X509_STORE_CTX_new(), X509_STORE_CTX_free);
        X509_STORE_CTX_init(verification.get(), store, leaf.x509(), nullptr);
        return X509_verify_cert(verification.get()) == 1;
    }

    easy_calls calls;
    std::shared_ptr<SSL_CTX> context{SSL_CTX_new(TLS_client_method()), SSL_CTX_free};
    X509_STORE *store = SSL_CTX_get_cert_store(context.get());
};

class StoreFilledAfterwards : public CertificateHook {
    void perform() override
    {
        EXPECT_EQ(call_hook(), CURLE_OK);
        fill(mark());
        EXPECT_TRUE(trusts(loopback_certificate()));
        EXPECT_FALSE(trusts(certificate_of_unknown_root()));
    }
};

TEST_F(StoreFilledAfterwards, TrustsTheCertificates) { EXPECT_EQ(fetch(secure_url).code, 0); }

class StoreFilledBefore : public CertificateHook {
    void perform() override
    {
        fill(mark());
        EXPECT_EQ(call_hook(), CURLE_OK);
        EXPECT_TRUE(trusts(loopback_certificate()));
        EXPECT_FALSE(trusts(certificate_of_unknown_root()));
    }
};

TEST_F(StoreFilledBefore, TrustsTheCertificates) { EXPECT_EQ(fetch(secure_url).code, 0); }

// The system's directory holds another root under the name of ours, and is a place to look already.
class StoreFilledBeforeWithADirectory : public CertificateHook {
    void perform() override
    {
        const temporary_folder directory;
        add_to_directory(directory, test_root_namesake());
        fill(mark());
        require(X509_STORE_load_path(store, directory.path().c_str()) == 1, "X509_STORE_load_path");
        ASSERT_FALSE(trusts(loopback_certificate()));

        EXPECT_EQ(call_hook(), CURLE_OK);

        EXPECT_TRUE(trusts(loopback_certificate()));
    }
};

TEST_F(StoreFilledBeforeWithADirectory, TrustsTheCertificatesFirst)
{
    EXPECT_EQ(fetch(secure_url).code, 0);
}

class StoreOfAProxyFilledAfterwards : public CertificateHook {
    void perform() override
    {
        EXPECT_EQ(call_hook(), CURLE_OK);
        fill(loopback_certificate().certificate_pem());
        EXPECT_FALSE(trusts(test_root().issue({})));
    }
};

TEST_F(StoreOfAProxyFilledAfterwards, TrustsNoMoreThanBefore)
{
    EXPECT_EQ(fetch(secure_url).code, 0);
}

class StoreOfAProxyFilledBefore : public CertificateHook {
    void perform() override
    {
        fill(loopback_certificate().certificate_pem());
        EXPECT_EQ(call_hook(), CURLE_OK);
        EXPECT_FALSE(trusts(test_root().issue({})));
    }
};

TEST_F(StoreOfAProxyFilledBefore, TrustsNoMoreThanBefore) { EXPECT_EQ(fetch(secure_url).code, 0); }

class StoreOfAnUploadConnection : public CertificateHook {
    // The hook's data is gone when the transfer has ended, but not what was put into the store.
    void perform() override
    {
        EXPECT_EQ(call_hook(), CURLE_OK);
        fill(mark());
    }
};

TEST_F(StoreOfAnUploadConnection, OutlivesTheTransferAndTheLibrary)
{
    EXPECT_EQ(fetch(secure_url).code, 0);
    api_global_cleanup();

    EXPECT_TRUE(trusts(loopback_certificate()));
    api_global_init(nullptr);
}

class MemoryOptions : public CertificateHook, public testing::WithParamInterface<CURLoption> {};

TEST_P(MemoryOptions, LeaveTheFileWhenOneIsRefused)
{
    calls.refused = GetParam();

    EXPECT_EQ(fetch(secure_url).code, 0);

    EXPECT_EQ(calls.last(CURLOPT_CAINFO).text, test_root_path());
    EXPECT_FALSE(calls.has(CURLOPT_CAINFO_BLOB));
}

INSTANTIATE_TEST_SUITE_P(Each, MemoryOptions, testing::ValuesIn(memory_options));

TEST_F(CertificateHook, StandsBehindTheFile)
{
    fetch(secure_url);

    std::vector<CURLoption> names = calls.names();
    auto file = std::find(names.begin(), names.end(), CURLOPT_CAINFO);
    ASSERT_GE(names.end() - file, 4);
    EXPECT_EQ(std::vector<CURLoption>(file + 1, file + 4), memory_options);
}

TEST_F(CertificateHook, IsNotSetForAFileThatCannotBeRead)
{
    replace_owned_text(ca_cert_pem_path.path, test_root_path() + ".missing");

    fetch(secure_url);

    EXPECT_EQ(calls.last(CURLOPT_CAINFO).text, test_root_path() + ".missing");
    for (CURLoption each : memory_options)
        EXPECT_FALSE(calls.has(each));
}

} // namespace
} // namespace quillmere_test
