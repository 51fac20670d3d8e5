#pragma once
#include <span>
#include <string>

#include "ZonCldExport.h"

// One entry of the settings store that a reader factory or an exporter reads,
// declared beside the code that reads it so that a front end can offer it
// without knowing the format. Several declarations may share one option: a
// flag sets every key it names; a value option takes one value per key, in
// the order the keys are declared (as "delimiters" takes a begin and an end).
struct ZON_CLD_API ZonCloudSetting {
    enum class Kind {
        Flag,      // no value: giving the option stores `given`
        Text,      // stored as typed; checked against `choices` or [low, high] when given
        Integer,   // a whole number, stored in decimal
        Number,    // a real number, stored so that it reads back to the same double
        Position,  // one of `choices`, stored as its position from 0
    };

    const char* key;               // key in the settings store
    const char* option;            // the front end's name for it, without dashes
    Kind kind = Kind::Text;
    const char* fallback = "";     // what the reader of the setting assumes when it is not set
    const char* help = "";
    const char* given = nullptr;   // Flag: the value stored when the option is given
    const char* choices = nullptr; // Text, Position: the allowed values, separated by '|'
    int low = 0, high = 0;         // Text: a whole number in [low, high] when low < high

    // The stored value, or the fallback.
    std::string Read() const;
    bool ReadBool() const;
    int ReadInt() const;
    double ReadDouble() const;
};

// The settings a factory or an exporter declares, in the order it offers them.
using ZonCloudSettings = std::span<const ZonCloudSetting>;
