#include "ZonIReporter.h"

ZonIReporter::~ZonIReporter() = default;
