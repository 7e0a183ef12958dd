// Where everything really is: after a run that was killed, and after whatever the user did to the
// copy.
#pragma once

#include "layout.h"
#include "local_copy.h"
#include "placement.h"

namespace quillmere::tools {

/**
 * Looks for each thing that was placed: where it was put, where it is set aside, and where it is
 * wanted, since a run that was killed may have brought it there and not have told. By its stamp it
 * is known for sure; by its bytes well enough. What is not found is forgotten, what the user has
 * changed is marked, and what is wanted and there already is taken for placed.
 */
void inspect(const local_copy &copy, const layout &wanted, placements &here);

} // namespace quillmere::tools
