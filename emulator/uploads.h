// Uploads: the bytes of new files and of new revisions, taken while they arrive.
#pragma once

#include <memory>
#include <string_view>

#include "service.h"

namespace emulator {

inline constexpr std::string_view upload_path = "/api/upload/upload.php";

/** Begins with an upload; null for a request that is none. */
std::unique_ptr<body_receiver> receive_upload(const request &asked, service &state);

} // namespace emulator
