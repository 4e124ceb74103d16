#pragma once

#include <pells/timing/timer.h>

namespace material_editor {

/// The application's source of time: microseconds that never run backwards.
class Clock : public pells::Timer {
public:
    pells::Timestamp now() override;
};

}  // namespace material_editor
