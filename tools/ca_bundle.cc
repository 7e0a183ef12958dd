#include "ca_bundle.h"

#include <unistd.h>

#include "failure.h"
#include "private_file.h"

namespace quillmere::tools {

namespace {

void check_bundle(const ca_bundle &chosen)
{
    const std::string what = "the certificate authorities named by " + chosen.source + ":";
    const std::string text = read_small_file(chosen.path, what);
    // "BEGIN CERTIFICATE", and the older "BEGIN TRUSTED CERTIFICATE" and "BEGIN X509 CERTIFICATE".
    if (text.find("CERTIFICATE-----") == std::string::npos)
        throw failure(exit_code::local_file, what + " " + chosen.path + " holds no certificate",
                      "a PEM file is needed");
}

std::optional<ca_bundle> named_bundle(const ca_candidates &candidates)
{
    if (candidates.flag)
        return ca_bundle{*candidates.flag, "--ca-file"};
    if (candidates.profile)
        return ca_bundle{*candidates.profile, "the configuration file"};
    if (candidates.environment)
        return ca_bundle{*candidates.environment, "SSL_CERT_FILE"};
    if (candidates.emulator)
        return ca_bundle{*candidates.emulator, "the emulator"};
    return std::nullopt;
}

} // namespace

std::vector<std::string> system_bundle_paths()
{
    return {"/etc/ssl/certs/ca-certificates.crt", "/etc/pki/tls/certs/ca-bundle.crt",
            "/etc/ssl/ca-bundle.pem", "/etc/pki/ca-trust/extracted/pem/tls-ca-bundle.pem",
            "/etc/ssl/cert.pem"};
}

ca_bundle choose_ca_bundle(const ca_candidates &candidates)
{
    if (const auto named = named_bundle(candidates)) {
        check_bundle(*named);
        return *named;
    }
    for (const std::string &path : candidates.system)
        if (::access(path.c_str(), R_OK) == 0)
            return {path, "the system"};
    throw failure(exit_code::local_file, "this system has no bundle of certificate authorities",
                  "install the package ca-certificates, or name a PEM file with --ca-file");
}

} // namespace quillmere::tools
