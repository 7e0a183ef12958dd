// The elements in which replies describe folders and files.
#pragma once

#include "service.h"
#include "store/file_entries.h"
#include "store/folders.h"
#include "xml_writer.h"

namespace emulator {

/** Elements that only some of the replies have. */
struct folder_elements {
    bool parent_key = false;
    bool totals = false;
};

void describe_folder(const call &asked, const folder &shown, folder_elements which,
                     xml_writer &xml);

/** Listings call a file's description by another name, and leave its folder out. */
enum class file_form { alone, listed };

void describe_file(const call &asked, const file &shown, file_form form, xml_writer &xml);

} // namespace emulator
