#pragma once

#include "pells/kit/file/atomic_file.h"

namespace pells {

using kit::AtomicFile;
using kit::FileError;

}  // namespace pells
