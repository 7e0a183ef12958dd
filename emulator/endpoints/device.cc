// What a device that keeps a copy of the account asks.
#include <limits>

#include "endpoints/endpoints.h"
#include "errors.h"
#include "store/accounts.h"
#include "text.h"

namespace emulator {
namespace {

// Every device sees the same tree, but one that sends no proper id has a fault worth finding.
void check_device_id(const call &asked)
{
    const std::string &id = asked.required("device_id");
    if (!parse_decimal(id, std::numeric_limits<std::uint32_t>::max()))
        throw refusal(error::parameter_invalid, "device_id");
}

} // namespace

void get_device_status(const call &asked, xml_writer &xml)
{
    check_device_id(asked);
    xml.element("device_revision", account_revision(asked.state.store, asked.account));
    // Every change is finished before its request is answered.
    xml.element("async_jobs_in_progress", "no");
}

} // namespace emulator
