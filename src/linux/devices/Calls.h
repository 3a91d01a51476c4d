/// What this layer asks the services on a bus with; its own business.
#pragma once

#include "linux/bus/Bus.h"
#include "linux/bus/Calls.h"

namespace devices {

using bus::Bus;
using bus::Calls;
using bus::isReply;
using bus::question;
using bus::questionToBus;

} // namespace devices
