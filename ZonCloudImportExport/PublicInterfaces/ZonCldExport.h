#pragma once
// Symbols the loadable module offers to the host and the tool.
#define ZON_CLD_API __attribute__((visibility("default")))
