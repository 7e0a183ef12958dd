// The certificates as TLS presents them: the sound one, or another that a test asks for.
#pragma once

#include <map>

#include <boost/asio/ssl/context.hpp>

#include "certificates.h"
#include "data_directory.h"

namespace emulator {

/** Each certificate in a context of its own, so that no client can resume under one certificate
 * what it began under another. */
class server_tls {
public:
    /** @param in must hold the certificates */
    explicit server_tls(const data_directory &in);

    /** Makes the other certificates: ahead of the time, lest it should fail amid the serving. */
    void make_variants();

    boost::asio::ssl::context &sound() { return sound_; }
    boost::asio::ssl::context &variant(certificate_variant which) { return variants_.at(which); }

private:
    data_directory data_;
    boost::asio::ssl::context sound_;
    std::map<certificate_variant, boost::asio::ssl::context> variants_;
};

} // namespace emulator
