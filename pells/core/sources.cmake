pells_sources(core
    HEADERS check_memory.h class_name.h export.h factory.h named_object.h no_destructor.h prefs.h
            singleton.h smart_base.h strings.h version.h
    SOURCES check_memory.cpp class_name.cpp export.cpp factory.cpp prefs.cpp singleton.cpp smart_base.cpp
            strings.cpp version.cpp)
