#include "server_tls.h"

#include <ctime>

#include <boost/asio/buffer.hpp>

namespace emulator {
namespace {

namespace ssl = boost::asio::ssl;

ssl::context make_context()
{
    ssl::context tls(ssl::context::tls_server);
    SSL_CTX_set_min_proto_version(tls.native_handle(), TLS1_2_VERSION);
    SSL_CTX_set_mode(tls.native_handle(), SSL_MODE_RELEASE_BUFFERS); // idle ones are many
    return tls;
}

ssl::context sound_context(const data_directory &in)
{
    ssl::context tls = make_context();
    tls.use_certificate_chain_file(in.server_certificate().string());
    tls.use_private_key_file(in.server_key().string(), ssl::context::pem);
    return tls;
}

ssl::context variant_context(const data_directory &in, certificate_variant which)
{
    const certificate_text text = make_variant(in, which, std::time(nullptr));
    ssl::context tls = make_context();
    tls.use_certificate(boost::asio::buffer(text.certificate), ssl::context::pem);
    tls.use_private_key(boost::asio::buffer(text.key), ssl::context::pem);
    return tls;
}

} // namespace

server_tls::server_tls(const data_directory &in) : data_(in), sound_(sound_context(in)) {}

void server_tls::make_variants()
{
    for (const auto which : {certificate_variant::expired, certificate_variant::wrong_host,
                             certificate_variant::self_signed})
        variants_.emplace(which, variant_context(data_, which));
}

} // namespace emulator
