// From a request to a reply: finds the endpoint, checks the session, wraps the answer.
#pragma once

#include <string_view>
#include <vector>

#include "caller.h"
#include "service.h"
#include "xml_writer.h"

namespace emulator {

/** The transaction around a handler: its own affair, one that sees one state of the store, or one
 * that makes all of its changes or none. */
enum class store_use { own, reads, changes };

/** One row of the endpoint table. The handler writes the elements between "action" and "result". */
struct endpoint {
    const char *path;
    session_need session;
    store_use use;
    void (*handle)(const call &, xml_writer &);
};

const std::vector<endpoint> &endpoint_table();
bool is_endpoint(std::string_view path);

/** Serves a request. Whatever happens, the reply is an envelope. */
reply answer(const request &asked, service &state);

} // namespace emulator
