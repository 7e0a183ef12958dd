// A body that is read from a file while it is sent, so that no file needs to fit into memory.
#pragma once

#include <algorithm>
#include <array>
#include <cerrno>
#include <utility>

#include <unistd.h>

#include <boost/asio/buffer.hpp>
#include <boost/beast/core/error.hpp>
#include <boost/beast/http/message.hpp>
#include <boost/optional.hpp>

#include "service.h"

namespace emulator {

/** What Beast calls a body: a type of value, its size, and what writes it. */
struct part_of_file {
    using value_type = file_part;

    static std::uint64_t size(const value_type &part) { return part.length; }

    class writer {
    public:
        using const_buffers_type = boost::asio::const_buffer;

        template <bool IsRequest, class Fields>
        writer(const boost::beast::http::header<IsRequest, Fields> &, const value_type &part)
            : part_(part)
        {
        }

        static void init(boost::beast::error_code &problem) { problem = {}; }

        boost::optional<std::pair<const_buffers_type, bool>> get(boost::beast::error_code &problem)
        {
            problem = {};
            if (part_.length == 0)
                return boost::none;
            const std::size_t wanted = std::min<std::uint64_t>(piece_.size(), part_.length);
            const ssize_t got = ::pread(part_.file->number(), piece_.data(), wanted,
                                        static_cast<off_t>(part_.offset));
            if (got <= 0) { // the file is shorter than was said: the client must see a broken reply
                problem = boost::beast::error_code(got < 0 ? errno : EIO,
                                                   boost::system::system_category());
                return boost::none;
            }
            const auto length = static_cast<std::size_t>(got);
            part_.offset += length;
            part_.length -= length;
            return {{const_buffers_type(piece_.data(), length), part_.length > 0}};
        }

    private:
        value_type part_;
        std::array<char, 65536> piece_;
    };
};

} // namespace emulator
