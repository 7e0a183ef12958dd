// The scripts by which shells complete the program's commands, options and remote paths.
#pragma once

#include <string>

#include "program_shape.h"

namespace quillmere::tools {

std::string bash_completion(const program_shape &program);
std::string zsh_completion(const program_shape &program);
std::string fish_completion(const program_shape &program);

} // namespace quillmere::tools
