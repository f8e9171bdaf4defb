//===- HostCtl/System/Host.h - The host object -----------------------------===//
#pragma once

#include "HostCtl/Host.h"
