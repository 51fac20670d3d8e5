#pragma once
#include "ZonCldExport.h"

// Byte order of a binary file's numbers, relative to this machine.
class ZON_CLD_API ZonICloudReadOptBinMachine {
public:
    enum BinaryFrom : int {
        Unknown = 0,  // detect it from the file
        Current = 1,  // this machine's order
        Differ = 2,   // the reversed order
    };
    virtual ~ZonICloudReadOptBinMachine() = default;
    // Any value other than the three above raises "ERR_Failure".
    virtual void SetBinaryFrom(int from) = 0;
    virtual void GetBinaryFrom(int& from) = 0;
};
