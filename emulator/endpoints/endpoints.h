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
void get_device_changes(const call &asked, xml_writer &xml);

// account.cc
void get_user_info(const call &asked, xml_writer &xml);
void get_user_limits(const call &asked, xml_writer &xml);
void get_myfiles_revision(const call &asked, xml_writer &xml);

// folder.cc
void get_folder_info(const call &asked, xml_writer &xml);
void create_folder(const call &asked, xml_writer &xml);
void delete_folder(const call &asked, xml_writer &xml);
void update_folder(const call &asked, xml_writer &xml);
void copy_folder(const call &asked, xml_writer &xml);
void move_folder(const call &asked, xml_writer &xml);
void attach_foreign_folder(const call &asked, xml_writer &xml);
void detach_foreign_folder(const call &asked, xml_writer &xml);

// folder_content.cc
void get_folder_content(const call &asked, xml_writer &xml);

// file.cc
void get_file_info(const call &asked, xml_writer &xml);
void create_file(const call &asked, xml_writer &xml);
void delete_file(const call &asked, xml_writer &xml);
void update_file(const call &asked, xml_writer &xml);
void copy_file(const call &asked, xml_writer &xml);
void move_file(const call &asked, xml_writer &xml);

// file_links.cc
void get_file_links(const call &asked, xml_writer &xml);

} // namespace emulator
