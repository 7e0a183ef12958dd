#include "certificates.h"

#include <memory>
#include <stdexcept>

#include <openssl/bn.h>
#include <openssl/ec.h>
#include <openssl/err.h>
#include <openssl/evp.h>
#include <openssl/pem.h>
#include <openssl/x509v3.h>

#include "digest.h"

namespace emulator {
namespace {

constexpr std::int64_t day = 24 * 60 * 60;
constexpr std::int64_t root_lifetime = 3650 * day;
constexpr std::int64_t server_lifetime = 397 * day; // more is refused by some clients
constexpr std::int64_t renewal_margin = 30 * day;
constexpr std::int64_t clock_tolerance = day; // for clients whose clock is behind
constexpr std::size_t largest_file = 64 * 1024;

template <auto Release> struct releaser {
    template <class Resource> void operator()(Resource *resource) const { Release(resource); }
};
using private_key = std::unique_ptr<EVP_PKEY, releaser<EVP_PKEY_free>>;
using certificate = std::unique_ptr<X509, releaser<X509_free>>;
using extension = std::unique_ptr<X509_EXTENSION, releaser<X509_EXTENSION_free>>;
using big_number = std::unique_ptr<BIGNUM, releaser<BN_free>>;
using memory_file = std::unique_ptr<BIO, releaser<BIO_free_all>>;

struct identity {
    private_key key;
    certificate cert;
};

struct extension_text {
    int kind;
    const char *value;
};

// The constraint makes it harmless to trust this root: it vouches for this machine alone.
constexpr extension_text root_extensions[] = {
    {NID_basic_constraints, "critical,CA:TRUE,pathlen:0"},
    {NID_key_usage, "critical,keyCertSign,cRLSign"},
    {NID_subject_key_identifier, "hash"},
    {NID_name_constraints, "critical,permitted;DNS:localhost,permitted;IP:127.0.0.0/255.0.0.0,"
                           "permitted;IP:0:0:0:0:0:0:0:1/ffff:ffff:ffff:ffff:ffff:ffff:ffff:ffff"},
};

constexpr extension_text server_extensions[] = {
    {NID_basic_constraints, "critical,CA:FALSE"},
    {NID_key_usage, "critical,digitalSignature"},
    {NID_ext_key_usage, "serverAuth"},
    {NID_subject_key_identifier, "hash"},
    {NID_authority_key_identifier, "keyid:always"},
};

void require(bool done, const char *what)
{
    if (done)
        return;
    const char *reason = ERR_reason_error_string(ERR_get_error());
    throw std::runtime_error(std::string("certificates: ") + what + ": " +
                             (reason ? reason : "failed"));
}

void set_serial(X509 *cert)
{
    std::string bytes = random_bytes(16);
    bytes[0] = static_cast<char>(bytes[0] & 0x7F); // a serial number is positive
    const big_number serial(BN_bin2bn(reinterpret_cast<const unsigned char *>(bytes.data()),
                                      static_cast<int>(bytes.size()), nullptr));
    require(serial && BN_to_ASN1_INTEGER(serial.get(), X509_get_serialNumber(cert)), "serial");
}

void set_name(X509_NAME *name, const std::string &common_name)
{
    const auto *text = reinterpret_cast<const unsigned char *>(common_name.c_str());
    require(X509_NAME_add_entry_by_txt(name, "CN", MBSTRING_UTF8, text, -1, -1, 0) == 1, "name");
}

void set_validity(X509 *cert, std::int64_t begin, std::int64_t end)
{
    require(ASN1_TIME_set(X509_getm_notBefore(cert), begin) &&
                ASN1_TIME_set(X509_getm_notAfter(cert), end),
            "validity");
}

void add_extension(X509 *cert, X509 *issuer, const extension_text &text)
{
    X509V3_CTX context;
    X509V3_set_ctx_nodb(&context);
    X509V3_set_ctx(&context, issuer, cert, nullptr, nullptr, 0);
    const extension made(X509V3_EXT_conf_nid(nullptr, &context, text.kind, text.value));
    require(made && X509_add_ext(cert, made.get(), -1) == 1, "extension");
}

template <std::size_t Count>
void add_extensions(X509 *cert, X509 *issuer, const extension_text (&texts)[Count])
{
    for (const extension_text &text : texts)
        add_extension(cert, issuer, text);
}

identity begin_identity(const std::string &common_name, std::int64_t begin, std::int64_t end)
{
    identity made{private_key(EVP_EC_gen("P-256")), certificate(X509_new())};
    require(made.key && made.cert, "key");
    X509 *cert = made.cert.get();
    require(X509_set_version(cert, X509_VERSION_3) == 1, "version");
    set_serial(cert);
    set_name(X509_get_subject_name(cert), common_name);
    set_validity(cert, begin, end);
    require(X509_set_pubkey(cert, made.key.get()) == 1, "key");
    return made;
}

void sign(X509 *cert, const X509 *issuer, EVP_PKEY *issuer_key)
{
    require(X509_set_issuer_name(cert, X509_get_subject_name(issuer)) == 1, "issuer");
    require(X509_sign(cert, issuer_key, EVP_sha256()) > 0, "signature");
}

identity make_root(std::int64_t now)
{
    // A number in the name keeps the roots of several data folders apart in one bundle.
    identity root = begin_identity("quillmere-emulator root " + random_hex(4),
                                   now - clock_tolerance, now + root_lifetime);
    add_extensions(root.cert.get(), root.cert.get(), root_extensions);
    sign(root.cert.get(), root.cert.get(), root.key.get());
    return root;
}

/** Whom a certificate is for, and when it holds, in seconds after now. */
struct server_terms {
    const char *common_name;
    const char *names;
    std::int64_t begin;
    std::int64_t end;
};

constexpr const char *own_names = "DNS:localhost,IP:127.0.0.1,IP:::1";
constexpr server_terms sound_terms = {"localhost", own_names, -clock_tolerance, server_lifetime};
constexpr server_terms expired_terms = {"localhost", own_names, -server_lifetime, -clock_tolerance};
// Below localhost, since the root can vouch for no other name: it is to be refused for its host.
constexpr server_terms wrong_host_terms = {"other.localhost", "DNS:other.localhost",
                                           -clock_tolerance, server_lifetime};

// Without a root it vouches for itself.
identity make_server(const identity *root, const server_terms &terms, std::int64_t now)
{
    identity server = begin_identity(terms.common_name, now + terms.begin, now + terms.end);
    const identity &issuer = root ? *root : server;
    X509 *cert = server.cert.get();
    add_extension(cert, issuer.cert.get(), {NID_subject_alt_name, terms.names});
    add_extensions(cert, issuer.cert.get(), server_extensions);
    sign(cert, issuer.cert.get(), issuer.key.get());
    return server;
}

template <class Write> std::string pem(Write write)
{
    const memory_file file(BIO_new(BIO_s_mem()));
    require(file && write(file.get()) == 1, "PEM");
    char *text = nullptr;
    const long length = BIO_get_mem_data(file.get(), &text);
    return std::string(text, static_cast<std::size_t>(length));
}

certificate_text text_of(const identity &made)
{
    return {
        pem([&made](BIO *to) { return PEM_write_bio_X509(to, made.cert.get()); }),
        pem([&made](BIO *to) {
            return PEM_write_bio_PrivateKey(to, made.key.get(), nullptr, nullptr, 0, nullptr,
                                            nullptr);
        }),
    };
}

// The key first: a certificate whose key is another one is found out, and made anew.
void write_identity(const identity &made, const std::filesystem::path &cert_file,
                    const std::filesystem::path &key_file)
{
    const certificate_text text = text_of(made);
    write_file(key_file, text.key, 0600);
    write_file(cert_file, text.certificate, 0644);
}

memory_file open_pem(const std::filesystem::path &path, std::string &text)
{
    if (std::filesystem::exists(path))
        text = read_file(path, largest_file);
    return memory_file(BIO_new_mem_buf(text.data(), static_cast<int>(text.size())));
}

identity read_identity(const std::filesystem::path &cert_file,
                       const std::filesystem::path &key_file)
{
    std::string cert_text;
    std::string key_text;
    const memory_file cert = open_pem(cert_file, cert_text);
    const memory_file key = open_pem(key_file, key_text);
    identity read{
        private_key(PEM_read_bio_PrivateKey(key.get(), nullptr, nullptr, nullptr)),
        certificate(PEM_read_bio_X509(cert.get(), nullptr, nullptr, nullptr)),
    };
    ERR_clear_error(); // what cannot be read is made anew
    return read;
}

bool is_sound(const identity &read, EVP_PKEY *issuer_key, std::int64_t now)
{
    if (!read.key || !read.cert)
        return false;
    time_t wanted = now + renewal_margin;
    time_t present = now;
    const bool sound = X509_check_private_key(read.cert.get(), read.key.get()) == 1 &&
                       X509_verify(read.cert.get(), issuer_key) == 1 &&
                       X509_cmp_time(X509_get0_notAfter(read.cert.get()), &wanted) > 0 &&
                       X509_cmp_time(X509_get0_notBefore(read.cert.get()), &present) < 0;
    ERR_clear_error();
    return sound;
}

} // namespace

void ensure_certificates(const data_directory &in, std::int64_t now)
{
    identity root = read_identity(in.root_certificate(), in.root_key());
    if (!is_sound(root, root.key.get(), now)) {
        root = make_root(now);
        write_identity(root, in.root_certificate(), in.root_key());
    }
    const identity server = read_identity(in.server_certificate(), in.server_key());
    if (!is_sound(server, root.key.get(), now))
        write_identity(make_server(&root, sound_terms, now), in.server_certificate(),
                       in.server_key());
}

certificate_text make_variant(const data_directory &in, certificate_variant which, std::int64_t now)
{
    if (which == certificate_variant::self_signed)
        return text_of(make_server(nullptr, sound_terms, now));
    const identity root = read_identity(in.root_certificate(), in.root_key());
    require(root.key && root.cert, "root");
    const bool is_expired = which == certificate_variant::expired;
    return text_of(make_server(&root, is_expired ? expired_terms : wrong_host_terms, now));
}

} // namespace emulator
