#pragma once

/// \file
/// Everything the library offers.

#include "pells/core/check_memory.h"
#include "pells/core/class_name.h"
#include "pells/core/factory.h"
#include "pells/core/named_object.h"
#include "pells/core/prefs.h"
#include "pells/core/singleton.h"
#include "pells/core/smart_base.h"
#include "pells/core/strings.h"
#include "pells/core/version.h"
#include "pells/log/log.h"
#include "pells/log/stream_buffers.h"
#include "pells/platform/counter.h"
#include "pells/platform/debugger.h"
#include "pells/serial/enum.h"
#include "pells/serial/member_field.h"
#include "pells/timing/performance.h"
#include "pells/timing/timer.h"
#include "pells/timing/timestamp.h"
#include "pells/xml/tag.h"
#include "pells/xml/tokenizer.h"
#include "pells/undo/undo_redo_sequence.h"
#include "pells/undo/undoable_step.h"
