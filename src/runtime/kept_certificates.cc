#include "runtime/kept_certificates.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <mutex>
#include <utility>

#include <openssl/err.h>
#include <openssl/pem.h>
#include <openssl/x509v3.h>
#include <sys/stat.h>

namespace quillmere {

namespace {

// A file that is written to again within one tick of its file system's clock, which may be two
// seconds long, can look the same as before. So what was read so soon after a change is not kept.
constexpr time_t longest_tick_seconds = 2;

inline void close_file(std::FILE *file) { std::fclose(file); }
inline void free_bio(BIO *bio) { BIO_free(bio); }
inline void free_pem_items(STACK_OF(X509_INFO) * items)
{
    sk_X509_INFO_pop_free(items, X509_INFO_free);
}

using open_file = std::unique_ptr<std::FILE, releaser<close_file>>;
using owned_bio = std::unique_ptr<BIO, releaser<free_bio>>;
using pem_items = std::unique_ptr<STACK_OF(X509_INFO), releaser<free_pem_items>>;

// One file's, since a process is configured with one. Not destroyed when the process ends: OpenSSL
// is gone by then.
struct {
    struct stat state; // of the file that was read, by which it is known under any path
    X509_STORE *certificates;
} kept;

std::mutex kept_mutex; // guards it, and is held while it is filled, so that nobody reads in vain

// Takes the errors that a failure leaves to OpenSSL's callers back with it.
class errors_undone {
public:
    errors_undone() { ERR_set_mark(); }
    ~errors_undone() { ERR_pop_to_mark(); }
    errors_undone(const errors_undone &) = delete;
    errors_undone &operator=(const errors_undone &) = delete;
};

bool same(const timespec &one, const timespec &other)
{
    return one.tv_sec == other.tv_sec && one.tv_nsec == other.tv_nsec;
}

bool same(const struct stat &one, const struct stat &other)
{
    return one.st_dev == other.st_dev && one.st_ino == other.st_ino &&
           one.st_size == other.st_size && same(one.st_mtim, other.st_mtim) &&
           same(one.st_ctim, other.st_ctim);
}

bool settled(const struct stat &state, time_t now)
{
    return now - std::max(state.st_mtim.tv_sec, state.st_ctim.tv_sec) > longest_tick_seconds;
}

certificate_store another_reference(X509_STORE *certificates)
{
    X509_STORE_up_ref(certificates);
    return certificate_store(certificates);
}

void forget() { X509_STORE_free(std::exchange(kept.certificates, nullptr)); }

// As libcurl has OpenSSL read such a file: a single bad item makes all of it bad, and revocation
// lists count as content, but are not consulted. What OpenSSL reads while memory runs out must not
// be kept, so every step is looked at.
certificate_store read_certificates(BIO *file)
{
    char no_password[] = "";
    pem_items items(PEM_X509_INFO_read_bio(file, nullptr, nullptr, no_password));
    certificate_store certificates(X509_STORE_new());
    if (!items || !certificates)
        return nullptr;
    bool holds_something = false;
    for (int i = 0; i < sk_X509_INFO_num(items.get()); ++i) {
        const X509_INFO *item = sk_X509_INFO_value(items.get(), i);
        if (item->x509 && X509_STORE_add_cert(certificates.get(), item->x509) != 1)
            return nullptr;
        holds_something |= item->x509 || item->crl;
    }
    return holds_something ? std::move(certificates) : nullptr;
}

// OpenSSL decodes the key of a certificate when it reads it, and the extensions when it first needs
// them. An object in which that failed once, for want of memory say, is never good again.
bool decoded(X509 *certificate)
{
    EVP_PKEY *key = X509_get0_pubkey(certificate);
    return key && EVP_PKEY_security_bits(key) > 0 && X509_check_purpose(certificate, -1, 0) == 1;
}

// Only such are kept. A file with what OpenSSL cannot decode at all is read for each connection.
bool decoded(X509_STORE *certificates)
{
    STACK_OF(X509_OBJECT) *items = X509_STORE_get0_objects(certificates);
    for (int i = 0; i < sk_X509_OBJECT_num(items); ++i) {
        X509 *certificate = X509_OBJECT_get0_X509(sk_X509_OBJECT_value(items, i));
        if (certificate && !decoded(certificate))
            return false;
    }
    return true;
}

certificate_store read_and_keep(const char *path)
{
    errors_undone undone;
    time_t now = std::time(nullptr);
    open_file file(std::fopen(path, "re"));
    struct stat before = {};
    if (!file || fstat(fileno(file.get()), &before) != 0)
        return nullptr;
    owned_bio bio(BIO_new_fp(file.get(), BIO_NOCLOSE));
    certificate_store certificates(bio ? read_certificates(bio.get()) : nullptr);

    struct stat after = {};
    if (certificates && settled(before, now) && decoded(certificates.get()) &&
        fstat(fileno(file.get()), &after) == 0 && same(before, after))
        kept = {before, another_reference(certificates.get()).release()};
    return certificates;
}

} // namespace

certificate_store certificates_of(const char *path)
{
    std::lock_guard<std::mutex> lock(kept_mutex);
    struct stat state = {};
    bool readable = stat(path, &state) == 0 && S_ISREG(state.st_mode); // a pipe can be read once
    if (readable && kept.certificates && same(kept.state, state))
        return another_reference(kept.certificates);
    forget();
    return readable ? read_and_keep(path) : nullptr;
}

void forget_certificates()
{
    std::lock_guard<std::mutex> lock(kept_mutex);
    forget();
}

} // namespace quillmere
