pells_sources(serial
    HEADERS accessor.h class_desc.h composite_field.h enum.h field.h member_field.h
            nesting.h object_handlers.h pooled.h sequence_handler.h serializable.h simple_field.h
            simple_type_handler.h text_form.h text_handler.h type_handler.h
    SOURCES class_desc.cpp composite_field.cpp enum.cpp field.cpp nesting.cpp parse_contents.cpp pooled.cpp
            serializable.cpp text_form.cpp type_handlers.cpp)
