// A hook that sees the engine calls channels make on themselves, in order. Tools and tests use it
// to watch what a plug-in declares; with no hook set, tracing costs one test per call.
#pragma once

#include <functional>
#include <string_view>

#include "host/export.h"

class Vorn_Channel;

using EngineTraceHook =
    std::function<void(const Vorn_Channel& channel, std::string_view operation, int argument)>;

// An empty hook switches tracing off.
TESSEL_API void SetEngineTrace(EngineTraceHook hook);
TESSEL_API void TraceEngineCall(const Vorn_Channel& channel, std::string_view operation,
                                int argument);
