// A reply as the bytes that go over the wire, in pieces, so that no file needs to fit into memory.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include <boost/system/error_code.hpp>

#include "service.h"

namespace emulator {

class outgoing_reply {
public:
    enum class body { sent, left_out }; // left out of the answer to a HEAD

    outgoing_reply(reply made, unsigned http_version, bool keep_alive, body what);

    bool is_done() const { return left_ == 0 || (is_begun_ && file_.length == 0); }
    bool is_cut() const { return is_cut_; }

    /**
     * The next piece, up to 64 KiB of a file; it holds until the next call. The problem is set when
     * the file is shorter than was said: the client must then see a broken reply.
     */
    std::string_view next_piece(boost::system::error_code &problem);

private:
    void append_file(boost::system::error_code &problem);

    std::string piece_;
    file_part file_;     // what is left of it
    std::uint64_t left_; // before it is cut
    bool is_cut_;
    bool is_begun_ = false;
};

} // namespace emulator
