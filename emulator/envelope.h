// What surrounds the elements of every reply.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "errors.h"
#include "service.h"
#include "xml_writer.h"

namespace emulator {

/** @param action what was asked for, or empty for what is no endpoint */
void begin_envelope(xml_writer &xml, std::string_view action);
std::string end_envelope(xml_writer &xml, const char *result);

/** The envelope of a failure. */
reply refuse(const refusal &why, std::string_view action = {});

/** Runs it. What it throws becomes the reply; there is none when all went well. The path is for the
 * log. */
std::optional<reply> refusal_of(std::string_view path, std::string_view action,
                                const std::function<void()> &run);

} // namespace emulator
