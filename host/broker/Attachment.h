// Threads of a provider that the broker knows: what belongs to each between attach and detach.
#pragma once

#include <memory>

#include "broker/Objects.h"

namespace tvx::host {

/// Made by prepareAttachThread, ended by detachThread. Its context object belongs to its scope, so
/// that both end together.
struct Attachment {
  explicit Attachment(Core& core) : scope(core, "attached thread") {}

  Scope scope;
  CMPIContext* context = nullptr;
};

}  // namespace tvx::host
