#include "ZonCloudReadProgress.h"

namespace {
thread_local ZonCloudReadProgress* current = nullptr;
}

ZonCloudReadProgress::ZonCloudReadProgress() : _outer(current) { current = this; }

ZonCloudReadProgress::~ZonCloudReadProgress() { current = _outer; }

ZonCloudReadProgress* ZonCloudReadProgress::Current() { return current; }
