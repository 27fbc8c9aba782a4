#include "host/engine_trace.h"

#include <utility>

namespace {

EngineTraceHook& Hook() {
  static EngineTraceHook hook;
  return hook;
}

}  // namespace

void SetEngineTrace(EngineTraceHook hook) { Hook() = std::move(hook); }

void TraceEngineCall(const Vorn_Channel& channel, std::string_view operation, int argument) {
  if (const EngineTraceHook& hook = Hook()) hook(channel, operation, argument);
}
