#include "faulty_handlers.h"

#include <memory>
#include <utility>

#include "form.h"

namespace emulator {
namespace {

bool lets_work(const fault &by)
{
    return by.kind == fault_kind::delay || by.kind == fault_kind::cut ||
           by.kind == fault_kind::lost_reply;
}

std::string page_of(unsigned status)
{
    const std::string title = std::to_string(status) + " (a fault that a test asked for)";
    return "<!DOCTYPE html>\n<title>" + title + "</title>\n<h1>" + title + "</h1>\n";
}

reply made_up(const fault &by)
{
    const bool is_bare = by.status == 204 || by.status == 304;
    const std::string body = by.body ? *by.body : is_bare ? "" : page_of(by.status);
    return {by.status, body, {}, {{"Content-Type", by.content_type}}};
}

delivery delivery_by(const fault &by)
{
    switch (by.kind) {
    case fault_kind::delay:
        return {delivery_kind::whole, 0, by.delay};
    case fault_kind::cut:
        return {delivery_kind::cut, by.after_bytes};
    case fault_kind::lost_reply:
        return {delivery_kind::cut, 0};
    case fault_kind::stall:
        return {delivery_kind::withheld};
    case fault_kind::reset:
        return {delivery_kind::reset};
    case fault_kind::status:
    case fault_kind::certificate:
        break;
    }
    return {};
}

template <class Work> reply spoiled(const fault &by, Work work)
{
    reply made = lets_work(by) ? work() : made_up(by);
    made.sending = delivery_by(by);
    return made;
}

/** The upload under a fault. Its bytes are taken in any case: its client sends them all. */
class faulty_upload : public body_receiver {
public:
    faulty_upload(std::unique_ptr<body_receiver> inner, const fault &by)
        : inner_(lets_work(by) ? std::move(inner) : nullptr), by_(by)
    {
    }

    void take(std::string_view piece) override
    {
        if (inner_)
            inner_->take(piece);
    }
    bool is_refused() const override { return inner_ && inner_->is_refused(); }
    reply answer() override
    {
        return spoiled(by_, [this] { return inner_->answer(); });
    }

private:
    std::unique_ptr<body_receiver> inner_; // null when nothing is to be done
    fault by_;
};

} // namespace

request_handlers with_faults(request_handlers inner, fault_list &faults, request_counts &counts)
{
    const auto struck = [&faults, &counts](const request &asked) {
        const std::string_view path = split(asked.target).path;
        counts.count(path);
        return faults.strike_request(path);
    };
    const auto answer = [inner, struck](const request &asked) {
        const fault *by = struck(asked);
        return by ? spoiled(*by, [&] { return inner.answer(asked); }) : inner.answer(asked);
    };
    const auto receive = [inner, struck](const request &asked) {
        std::unique_ptr<body_receiver> upload = inner.receive(asked);
        const fault *by = upload ? struck(asked) : nullptr;
        if (by)
            upload = std::make_unique<faulty_upload>(std::move(upload), *by);
        return upload;
    };
    return {answer, receive, inner.refuse};
}

} // namespace emulator
