// The command line of quillmere.

#include "command_line.h"
#include "descriptor.h"
#include "interrupt.h"

int main(int count, char **words)
{
    using namespace quillmere::tools;
    occupy_standard_descriptors();
    handle_interrupts();
    results output; // before anything could print
    return run_command_line(count, words, process_environment(), output);
}
