#pragma once
// Symbols of the host's core library are visible to the module and the program.
#define ANVIL_HOST_API __attribute__((visibility("default")))
