#pragma once
// Symbols of the host stand-in library are visible to the module and the tool.
#define ZON_HOST_API __attribute__((visibility("default")))
