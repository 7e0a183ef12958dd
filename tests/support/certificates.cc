#include "support/certificates.h"

#include <arpa/inet.h>
#include <openssl/bio.h>
#include <openssl/bn.h>
#include <openssl/err.h>
#include <openssl/evp.h>
#include <openssl/pem.h>
#include <openssl/x509.h>
#include <openssl/x509v3.h>

#include <cstdio>
#include <stdexcept>

namespace quillmere_test {
namespace {

constexpr const char *test_root_name = "quillmere test root";
constexpr long hour = 3600;
constexpr long day = 24 * hour;

void must(bool good, const char *step)
{
    if (good)
        return;
    char reason[256];
    ERR_error_string_n(ERR_get_error(), reason, sizeof reason);
    throw std::runtime_error(std::string(step) + ": " + reason);
}

std::shared_ptr<EVP_PKEY> new_key()
{
    std::shared_ptr<EVP_PKEY> key(EVP_EC_gen("P-256"), EVP_PKEY_free);
    must(key != nullptr, "EVP_EC_gen");
    return key;
}

void set_random_serial(X509 *x509)
{
    // Clients may tell certificates of one issuer apart by their numbers alone.
    std::unique_ptr<BIGNUM, decltype(&BN_free)> number(BN_new(), BN_free);
    must(number && BN_rand(number.get(), 63, BN_RAND_TOP_ONE, BN_RAND_BOTTOM_ANY), "BN_rand");
    must(BN_to_ASN1_INTEGER(number.get(), X509_get_serialNumber(x509)) != nullptr, "serial");
}

void set_validity(X509 *x509, validity valid)
{
    // Reaches an hour back, so that a clock that is set back a little does no harm.
    long from = -hour;
    long until = day;
    if (valid == validity::expired) {
        from = -2 * day;
        until = -day;
    } else if (valid == validity::not_yet) {
        from = day;
        until = 2 * day;
    }
    must(X509_gmtime_adj(X509_getm_notBefore(x509), from) != nullptr, "notBefore");
    must(X509_gmtime_adj(X509_getm_notAfter(x509), until) != nullptr, "notAfter");
}

void set_common_name(X509 *x509, const std::string &common_name)
{
    auto text = reinterpret_cast<const unsigned char *>(common_name.c_str());
    X509_NAME *name = X509_get_subject_name(x509);
    must(X509_NAME_add_entry_by_txt(name, "CN", MBSTRING_UTF8, text, -1, -1, 0) == 1, "subject");
}

void add_extension(X509 *x509, X509 *issuer, int kind, const std::string &value)
{
    X509V3_CTX context;
    X509V3_set_ctx(&context, issuer, x509, nullptr, nullptr, 0);
    std::unique_ptr<X509_EXTENSION, decltype(&X509_EXTENSION_free)> extension(
        X509V3_EXT_conf_nid(nullptr, &context, kind, value.c_str()), X509_EXTENSION_free);
    must(extension && X509_add_ext(x509, extension.get(), -1), value.c_str());
}

bool is_address(const std::string &name)
{
    unsigned char bytes[sizeof(in6_addr)];
    return inet_pton(AF_INET, name.c_str(), bytes) == 1 ||
           inet_pton(AF_INET6, name.c_str(), bytes) == 1;
}

std::string alternative_names(const std::vector<std::string> &names)
{
    std::string list;
    for (const std::string &name : names)
        list += (list.empty() ? "" : ",") + std::string(is_address(name) ? "IP:" : "DNS:") + name;
    return list;
}

std::shared_ptr<X509> blank(const std::string &common_name, validity valid, EVP_PKEY *key)
{
    std::shared_ptr<X509> x509(X509_new(), X509_free);
    must(x509 != nullptr, "X509_new");
    must(X509_set_version(x509.get(), X509_VERSION_3) == 1, "version");
    set_random_serial(x509.get());
    set_validity(x509.get(), valid);
    set_common_name(x509.get(), common_name);
    must(X509_set_pubkey(x509.get(), key) == 1, "public key");
    return x509;
}

void sign(X509 *x509, X509 *issuer, EVP_PKEY *issuer_key)
{
    must(X509_set_issuer_name(x509, X509_get_subject_name(issuer)) == 1, "issuer");
    add_extension(x509, issuer, NID_authority_key_identifier, "keyid");
    must(X509_sign(x509, issuer_key, EVP_sha256()) > 0, "X509_sign");
}

certificate new_root(const std::string &common_name)
{
    auto key = new_key();
    auto x509 = blank(common_name, validity::current, key.get());
    add_extension(x509.get(), x509.get(), NID_basic_constraints, "critical,CA:TRUE");
    add_extension(x509.get(), x509.get(), NID_key_usage, "critical,keyCertSign,cRLSign");
    add_extension(x509.get(), x509.get(), NID_subject_key_identifier, "hash");
    sign(x509.get(), x509.get(), key.get());
    return {x509, key};
}

// Signed by the issuer, or by itself when there is none.
certificate new_leaf(const leaf_request &request, const certificate *issuer)
{
    auto key = new_key();
    auto x509 = blank(request.names.at(0), request.valid, key.get());
    add_extension(x509.get(), x509.get(), NID_basic_constraints, "critical,CA:FALSE");
    add_extension(x509.get(), x509.get(), NID_ext_key_usage, "serverAuth");
    add_extension(x509.get(), x509.get(), NID_subject_key_identifier, "hash");
    add_extension(x509.get(), x509.get(), NID_subject_alt_name, alternative_names(request.names));
    sign(x509.get(), issuer ? issuer->x509() : x509.get(), issuer ? issuer->key() : key.get());
    return {x509, key};
}

std::string text_in(BIO *memory)
{
    char *bytes = nullptr;
    long length = BIO_get_mem_data(memory, &bytes);
    return std::string(bytes, static_cast<size_t>(length));
}

using memory_bio = std::unique_ptr<BIO, decltype(&BIO_free_all)>;

} // namespace

std::string certificate::certificate_pem() const
{
    memory_bio memory(BIO_new(BIO_s_mem()), BIO_free_all);
    must(memory && PEM_write_bio_X509(memory.get(), x509()) == 1, "PEM_write_bio_X509");
    return text_in(memory.get());
}

std::string certificate::key_pem() const
{
    memory_bio memory(BIO_new(BIO_s_mem()), BIO_free_all);
    must(memory && PEM_write_bio_PrivateKey(memory.get(), key(), nullptr, nullptr, 0, nullptr,
                                            nullptr) == 1,
         "PEM_write_bio_PrivateKey");
    return text_in(memory.get());
}

certificate_authority::certificate_authority(const std::string &common_name)
    : root_(new_root(common_name))
{
}

certificate certificate_authority::issue(const leaf_request &request) const
{
    return new_leaf(request, &root_);
}

const certificate_authority &test_root()
{
    static const certificate_authority authority(test_root_name);
    return authority;
}

const certificate_authority &test_root_namesake()
{
    static const certificate_authority authority(test_root_name);
    return authority;
}

std::string add_to_directory(const temporary_folder &directory,
                             const certificate_authority &authority)
{
    char name[16];
    std::snprintf(name, sizeof name, "%08lx.0", X509_subject_name_hash(authority.root().x509()));
    return directory.write(name, authority.root().certificate_pem());
}

const std::string &test_root_path()
{
    static const temporary_folder folder;
    static const std::string path = folder.write("root.pem", test_root().root().certificate_pem());
    return path;
}

const certificate &loopback_certificate()
{
    static const certificate leaf = test_root().issue({});
    return leaf;
}

std::string revocation_list_pem(const certificate_authority &authority, const certificate &revoked)
{
    const certificate &issuer = authority.root();
    std::unique_ptr<ASN1_TIME, decltype(&ASN1_TIME_free)> now(X509_gmtime_adj(nullptr, 0),
                                                              ASN1_TIME_free);
    std::unique_ptr<X509_CRL, decltype(&X509_CRL_free)> list(X509_CRL_new(), X509_CRL_free);
    must(now && list && X509_CRL_set_version(list.get(), X509_CRL_VERSION_2) == 1, "X509_CRL_new");
    must(X509_CRL_set_issuer_name(list.get(), X509_get_subject_name(issuer.x509())) == 1, "issuer");
    must(X509_CRL_set1_lastUpdate(list.get(), now.get()) == 1, "lastUpdate");

    std::unique_ptr<X509_REVOKED, decltype(&X509_REVOKED_free)> entry(X509_REVOKED_new(),
                                                                      X509_REVOKED_free);
    must(entry && X509_REVOKED_set_revocationDate(entry.get(), now.get()) == 1, "revocationDate");
    must(X509_REVOKED_set_serialNumber(entry.get(), X509_get_serialNumber(revoked.x509())) == 1,
         "serial");
    must(X509_CRL_add0_revoked(list.get(), entry.release()) == 1, "X509_CRL_add0_revoked");
    must(X509_CRL_sign(list.get(), issuer.key(), EVP_sha256()) > 0, "X509_CRL_sign");
    memory_bio memory(BIO_new(BIO_s_mem()), BIO_free_all);
    must(memory && PEM_write_bio_X509_CRL(memory.get(), list.get()) == 1, "PEM_write_bio_X509_CRL");
    return text_in(memory.get());
}

certificate expired_certificate()
{
    leaf_request request;
    request.valid = validity::expired;
    return test_root().issue(request);
}

certificate not_yet_valid_certificate()
{
    leaf_request request;
    request.valid = validity::not_yet;
    return test_root().issue(request);
}

certificate certificate_for_another_host()
{
    leaf_request request;
    request.names = {"another.example", "192.0.2.1"};
    return test_root().issue(request);
}

certificate certificate_of_unknown_root()
{
    return certificate_authority("quillmere unknown root").issue({});
}

certificate self_signed_certificate(const leaf_request &request)
{
    return new_leaf(request, nullptr);
}

certificate_folder::certificate_folder(const certificate_authority &authority,
                                       const certificate &leaf)
    : root_path_(folder_.write("root.pem", authority.root().certificate_pem())),
      leaf_path_(folder_.write("leaf.pem", leaf.certificate_pem())),
      key_path_(folder_.write("leaf.key", leaf.key_pem()))
{
}

} // namespace quillmere_test
