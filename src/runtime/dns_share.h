// The libcurl share handle through which all transfers use one DNS cache.
#pragma once

#include <curl/curl.h>

namespace quillmere {

// Null when it could not be made; transfers then run unshared. It outlives api_global_cleanup().
extern CURLSH *curl_share_handle;

// Makes the handle, and releases the one that an earlier start of the library left behind.
void replace_curl_share_handle();

} // namespace quillmere
