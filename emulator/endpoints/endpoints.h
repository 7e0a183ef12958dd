// The handlers of the endpoints: each writes its elements into the reply or throws a refusal.
#pragma once

#include "service.h"
#include "xml_writer.h"

namespace emulator {

// user.cc
void get_session_token(const call &asked, xml_writer &xml);
void get_login_token(const call &asked, xml_writer &xml);
void renew_session_token(const call &asked, xml_writer &xml);

// system.cc
void get_system_limits(const call &asked, xml_writer &xml);
void get_system_status(const call &asked, xml_writer &xml);

// device.cc
void get_device_status(const call &asked, xml_writer &xml);

} // namespace emulator
