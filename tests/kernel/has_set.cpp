// Whether the processor at hand has an instruction set: exit status 0 or 1.
#include <cstring>

#define WAVKIT_TEXT_OF(name) #name
#define WAVKIT_TEXT(name) WAVKIT_TEXT_OF(name)

int main() {
#if defined(__x86_64__) || defined(__i386__)
    __builtin_cpu_init();
#endif
#define SET(name, supported) \
    if (std::strcmp(#name, WAVKIT_TEXT(WAVKIT_SET)) == 0) return (supported) ? 0 : 1;
#include "sets.inc"
#undef SET
    return 1;
}
