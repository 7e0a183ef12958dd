// The addresses of a service: given as one base address, used as the library's four.
#pragma once

#include <string>

namespace quillmere::tools {

/** In the order in which the library keeps them. */
struct service_addresses {
    std::string plain;         ///< base for what the library sends unencrypted
    std::string secure;        ///< base for everything else
    std::string plain_upload;  ///< upload address on the plain base
    std::string secure_upload; ///< upload address on the secure base
};

/**
 * The base address as it is kept and compared: scheme and host in lower case, no trailing slash.
 * Anything but https, a host and perhaps a port and a path is a usage failure that names the source
 * ("--service").
 */
std::string normal_base_address(const std::string &address, const std::string &source);

/** The four addresses; the library's plain ones are those of plain_base. */
service_addresses addresses_of(const std::string &secure_base, const std::string &plain_base);

/** Where files are uploaded to on a base. */
std::string upload_address_on(const std::string &base);

/** Whether a secure base is on port 443. */
bool is_on_standard_port(const std::string &secure_base);

/**
 * The unencrypted base that goes with a secure one on the standard ports; a usage failure for one
 * with a port of its own, which cannot be asked where its unencrypted neighbour is.
 */
std::string plain_base_of(const std::string &secure_base);

} // namespace quillmere::tools
