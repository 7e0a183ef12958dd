// A body that is handed on while it arrives, so that no file needs to fit into memory.
#pragma once

#include <cstdint>

#include <boost/asio/buffer.hpp>
#include <boost/asio/error.hpp>
#include <boost/beast/core/buffers_range.hpp>
#include <boost/beast/core/error.hpp>
#include <boost/beast/http/message.hpp>
#include <boost/optional.hpp>

#include "service.h"

namespace emulator {

/** What Beast calls a body: a type of value, and what reads it. */
struct received_body {
    using value_type = body_receiver *;

    /** How a read ends whose receiver wants no more. */
    static boost::beast::error_code refused()
    {
        return make_error_code(boost::asio::error::operation_aborted);
    }

    class reader {
    public:
        template <bool IsRequest, class Fields>
        reader(const boost::beast::http::header<IsRequest, Fields> &, const value_type &receiver)
            : receiver_(receiver)
        {
        }

        static void init(const boost::optional<std::uint64_t> &, boost::beast::error_code &problem)
        {
            problem = {};
        }

        template <class Buffers>
        std::size_t put(const Buffers &buffers, boost::beast::error_code &problem)
        {
            std::size_t taken = 0;
            for (const boost::asio::const_buffer piece : boost::beast::buffers_range_ref(buffers)) {
                receiver_->take({static_cast<const char *>(piece.data()), piece.size()});
                taken += piece.size();
            }
            problem = receiver_->is_refused() ? refused() : boost::beast::error_code{};
            return taken;
        }

        static void finish(boost::beast::error_code &problem) { problem = {}; }

    private:
        value_type receiver_;
    };
};

} // namespace emulator
