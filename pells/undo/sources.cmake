pells_sources(undo
    HEADERS undo_redo_sequence.h undoable_step.h
    SOURCES undo_redo_sequence.cpp undoable_step.cpp)
