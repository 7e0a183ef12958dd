// libcurl tells OpenSSL where to look for issuers: in the memory of the connection's own store, and
// then in the directory that libcurl was built with. The certificates come between the two, where
// those of a file would be, as a further place to look. So they are shared by all connections and
// none of them adds anything to what the others trust.
#include "transport/certificate_hook.h"

#include <cstring>

#include <openssl/x509_vfy.h>

#include "runtime/tls_locks.h"

// The only function of libssl, which is libcurl's, not ours: there if libcurl has brought it along.
extern "C" X509_STORE *SSL_CTX_get_cert_store(const SSL_CTX *context) __attribute__((weak));

namespace quillmere {

namespace {

// What libcurl is given in the place of a file: an empty revocation list of nobody's, which changes
// nothing about whom to trust. The stores of connections to HTTPS proxies, which have certificates
// of their own, are known by its absence.
constexpr char mark[] = "-----BEGIN X509 CRL-----\n"
                        "MIGFMDkwBQYDK2VwMCExHzAdBgNVBAMMFmNlcnRpZmljYXRlcyBpbiBtZW1vcnkX\n"
                        "DTcwMDEwMTAwMDAwMFowBQYDK2VwA0EAd/8kaZiz8NlwT/Pij2DeYMKPYkKg02kB\n"
                        "m1Lm6FA8hEERojW4D7+ixz1HktVbWdpVcZPoci3MARBHy78j/0HZAQ==\n"
                        "-----END X509 CRL-----\n";
constexpr char issuer_of_mark[] = "certificates in memory";

class store_locked {
public:
    explicit store_locked(X509_STORE *store) : store_(store) { X509_STORE_lock(store); }
    ~store_locked() { X509_STORE_unlock(store_); }
    store_locked(const store_locked &) = delete;
    store_locked &operator=(const store_locked &) = delete;

private:
    X509_STORE *store_;
};

bool is_mark(const X509_OBJECT *object)
{
    if (X509_OBJECT_get_type(object) != X509_LU_CRL)
        return false;
    const X509_CRL *list = X509_OBJECT_get0_X509_CRL(object);
    char issuer[sizeof issuer_of_mark + 1] = ""; // a longer name is cut off, and another
    X509_NAME_get_text_by_NID(X509_CRL_get_issuer(list), NID_commonName, issuer, sizeof issuer);
    return std::strcmp(issuer, issuer_of_mark) == 0;
}

bool is_marked(const X509_STORE *store)
{
    const STACK_OF(X509_OBJECT) *objects = X509_STORE_get0_objects(store);
    for (int i = 0; i < sk_X509_OBJECT_num(objects); ++i)
        if (is_mark(sk_X509_OBJECT_value(objects, i)))
            return true;
    return false;
}

// Adds every certificate of this name to the store, and returns the first of them: OpenSSL chooses
// among those in the store.
X509 *add_by_subject(X509_STORE *store, X509_STORE *certificates, const X509_NAME *name)
{
    store_locked lock(certificates); // a look-up may sort
    STACK_OF(X509_OBJECT) *objects = X509_STORE_get0_objects(certificates);
    int first = X509_OBJECT_idx_by_subject(objects, X509_LU_X509, name);
    if (first < 0)
        return nullptr;
    for (int i = first; i < sk_X509_OBJECT_num(objects); ++i) {
        X509 *certificate = X509_OBJECT_get0_X509(sk_X509_OBJECT_value(objects, i));
        if (!certificate || X509_NAME_cmp(X509_get_subject_name(certificate), name) != 0)
            break;
        if (X509_STORE_add_cert(store, certificate) != 1)
            return nullptr;
    }
    return X509_OBJECT_get0_X509(sk_X509_OBJECT_value(objects, first));
}

bool add_all(X509_STORE *store, X509_STORE *certificates)
{
    store_locked lock(certificates);
    const STACK_OF(X509_OBJECT) *objects = X509_STORE_get0_objects(certificates);
    for (int i = 0; i < sk_X509_OBJECT_num(objects); ++i)
        if (X509_STORE_add_cert(store, X509_OBJECT_get0_X509(sk_X509_OBJECT_value(objects, i))) !=
            1)
            return false;
    return true;
}

extern "C" {

static int find_issuer(X509_LOOKUP *lookup, X509_LOOKUP_TYPE type, const X509_NAME *name,
                       X509_OBJECT *found)
{
    X509_STORE *store = X509_LOOKUP_get_store(lookup);
    if (type != X509_LU_X509 || !is_marked(store))
        return 0;
    auto *certificates = static_cast<X509_STORE *>(X509_LOOKUP_get_method_data(lookup));
    X509 *issuer = add_by_subject(store, certificates, name);
    if (!issuer || X509_OBJECT_set1_X509(found, issuer) != 1)
        return 0;
    X509_free(issuer); // OpenSSL counts this reference once more, and asks that it be given back
    return 1;
}

static void release_certificates(X509_LOOKUP *lookup)
{
    X509_STORE_free(static_cast<X509_STORE *>(X509_LOOKUP_get_method_data(lookup)));
}

} // extern "C"

// Null without the memory for it. Connections may outlive everything, so it is never released.
X509_LOOKUP_METHOD *look_up_in_memory()
{
    static X509_LOOKUP_METHOD *const method = [] {
        X509_LOOKUP_METHOD *made = X509_LOOKUP_meth_new("certificates in memory");
        if (made) {
            X509_LOOKUP_meth_set_get_by_subject(made, find_issuer);
            X509_LOOKUP_meth_set_free(made, release_certificates);
        }
        return made;
    }();
    return method;
}

bool add_look_up(X509_STORE *store, X509_STORE *certificates)
{
    X509_LOOKUP *lookup = X509_STORE_add_lookup(store, look_up_in_memory());
    if (!lookup)
        return false;
    X509_STORE_up_ref(certificates);
    X509_LOOKUP_set_method_data(lookup, certificates);
    return true;
}

// Called for every connection that a handle makes. libcurl fills the connection's store either
// afterwards (7.88 does) or before: then its directory is the place to look first already, and only
// what is in the store's memory comes before that.
extern "C" {
static CURLcode add_certificates(CURL *, void *context, void *certificates)
{
    X509_STORE *store = SSL_CTX_get_cert_store(static_cast<SSL_CTX *>(context));
    auto *shared = static_cast<X509_STORE *>(certificates);
    bool is_filled = sk_X509_OBJECT_num(X509_STORE_get0_objects(store)) > 0;
    bool added = true;
    if (!is_filled)
        added = add_look_up(store, shared);
    else if (is_marked(store))
        added = add_all(store, shared);
    return added ? CURLE_OK : CURLE_OUT_OF_MEMORY;
}
}

} // namespace

bool takes_certificates_from_memory()
{
    return shares_openssl_with_libcurl && SSL_CTX_get_cert_store && look_up_in_memory();
}

void verify_against(CURL *handle, X509_STORE *certificates)
{
    curl_blob in_place_of_file = {const_cast<char *>(mark), sizeof mark - 1, CURL_BLOB_NOCOPY};
    if (curl_easy_setopt(handle, CURLOPT_SSL_CTX_DATA, certificates) == CURLE_OK &&
        curl_easy_setopt(handle, CURLOPT_SSL_CTX_FUNCTION, add_certificates) == CURLE_OK)
        curl_easy_setopt(handle, CURLOPT_CAINFO_BLOB, &in_place_of_file);
}

} // namespace quillmere
