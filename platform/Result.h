#pragma once

#include "platform/Failure.h"
#include "propertylist/value/OrError.h"

namespace accounts {

/// What an operation of the platform that can fail gives back.
template <class Value>
using OrFailure = OrError<Value, Failure>;
using Result = OrFailure<void>;

}  // namespace accounts
