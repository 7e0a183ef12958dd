// Certificates for the servers of the tests: a root that is made once a process, leaves that are
// right, and leaves that are wrong in one way each. All keys are P-256, which is quick to make.
#pragma once

#include <openssl/types.h>

#include <memory>
#include <string>
#include <vector>

#include "support/temporary_folder.h"

namespace quillmere_test {

enum class validity { current, expired, not_yet };

// A certificate with its private key. Copies share both.
class certificate {
public:
    certificate(std::shared_ptr<X509> x509, std::shared_ptr<EVP_PKEY> key)
        : x509_(std::move(x509)), key_(std::move(key))
    {
    }

    X509 *x509() const { return x509_.get(); }
    EVP_PKEY *key() const { return key_.get(); }
    std::string certificate_pem() const;
    std::string key_pem() const;

private:
    std::shared_ptr<X509> x509_;
    std::shared_ptr<EVP_PKEY> key_;
};

// What a leaf is for: host names and addresses, recognised by their form.
struct leaf_request {
    std::vector<std::string> names = {"localhost", "127.0.0.1", "::1"};
    validity valid = validity::current;
};

class certificate_authority {
public:
    explicit certificate_authority(const std::string &common_name);

    const certificate &root() const { return root_; }
    certificate issue(const leaf_request &request) const;

private:
    certificate root_;
};

// The root that clients in the tests trust, and the PEM file that holds it.
const certificate_authority &test_root();
const std::string &test_root_path();

// Another root under the same name, which signed nothing of the test root's.
const certificate_authority &test_root_namesake();

// Puts a root where OpenSSL looks for it in a directory of certificates, and gives its path.
std::string add_to_directory(const temporary_folder &directory,
                             const certificate_authority &authority);

// A good leaf of the test root for the loopback names, made once a process.
const certificate &loopback_certificate();

// PEM of a list in which the authority revokes the certificate.
std::string revocation_list_pem(const certificate_authority &authority, const certificate &revoked);

certificate expired_certificate();
certificate not_yet_valid_certificate();
certificate certificate_for_another_host();
certificate certificate_of_unknown_root();
certificate self_signed_certificate(const leaf_request &request = {});

// PEM files for programs that take paths: the root, the leaf's chain and the leaf's key.
class certificate_folder {
public:
    certificate_folder(const certificate_authority &authority, const certificate &leaf);

    const std::string &root_path() const { return root_path_; }
    const std::string &leaf_path() const { return leaf_path_; }
    const std::string &key_path() const { return key_path_; }
    const temporary_folder &folder() const { return folder_; }

private:
    temporary_folder folder_;
    std::string root_path_;
    std::string leaf_path_;
    std::string key_path_;
};

} // namespace quillmere_test
