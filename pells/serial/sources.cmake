# Templates need the headers in detail/, so they are installed.
pells_sources(serial
    HEADERS accessor.h class_desc.h composite_field.h enum.h field.h member_field.h
            object_handlers.h sequence_handler.h serializable.h simple_field.h
            simple_type_handler.h text_handler.h type_handler.h
            detail/nesting.h detail/object_factories.h detail/pooled.h detail/text_form.h
    SOURCES class_desc.cpp composite_field.cpp enum.cpp field.cpp parse_contents.cpp
            serializable.cpp type_handlers.cpp
            detail/nesting.cpp detail/object_factories.cpp detail/pooled.cpp detail/text_form.cpp)
