#pragma once
// Chains made at once, for a host that knows how many nodes an answer takes.
#include "ResultBuffer.h"

#include <cstddef>

namespace zvsdk {

// A chain of `count` nodes of no type (RTNONE, null values), made in as few steps as the
// blocks allow, for the caller to fill in; freed like any chain, node by node or whole.
ResultBuffer* newChain(std::size_t count);

}  // namespace zvsdk
