#pragma once

/// \file
/// Everything that the kit offers.

#include "pells/kit/file/atomic_file.h"
