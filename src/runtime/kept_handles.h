// libcurl's handles with their open connections, kept between transfers when the application asks
// for that.
#pragma once

#include "owned.h"

namespace quillmere {

bool keeps_connections();

// A handle for one transfer, gone with it unless it is kept.
class transfer_handle {
public:
    // A kept handle if there is one, or always a new one.
    enum class source { kept, fresh };

    // The certificates are those that the transfer trusts, null without any.
    transfer_handle(X509_STORE *certificates, source from);

    // Null if none could be made.
    CURL *get() const { return handle_.get(); }

    // Whether it may have connections of earlier transfers.
    bool is_used() const { return is_used_; }

    // For after a transfer that ended well: the next may have it, as long as no setting changes
    // under which its connections were made.
    void keep();

private:
    easy_handle handle_;
    uint64_t generation_ = 0;
    bool is_used_ = false;
};

// Closes the connections that wait to be used. Those in use are closed after their transfer.
void drop_kept_handles();

} // namespace quillmere
