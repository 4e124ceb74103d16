# How the targets of this repository are built. All of it is set on the targets themselves, so that a
# project that adds this one as a subdirectory keeps its own settings.
function(pells_set_up target)
    if(NOT DEFINED CMAKE_CXX_STANDARD)
        set_target_properties(${target} PROPERTIES CXX_STANDARD 17)
    endif()
    set_target_properties(${target} PROPERTIES
        CXX_STANDARD_REQUIRED ON
        CXX_EXTENSIONS OFF
        CXX_VISIBILITY_PRESET hidden
        VISIBILITY_INLINES_HIDDEN ON
        POSITION_INDEPENDENT_CODE ON)
    target_compile_options(${target} PRIVATE
        $<$<CXX_COMPILER_ID:GNU,Clang,AppleClang>:-Wall -Wextra -Wpedantic -Wconversion -Wshadow>
        # A parent project may ask for it, but what is useless here is needed where sizes differ.
        $<$<COMPILE_LANG_AND_ID:CXX,GNU>:-Wno-useless-cast>)
    if(PELLS_WARNINGS_AS_ERRORS)
        set_target_properties(${target} PROPERTIES COMPILE_WARNING_AS_ERROR ON)
    endif()
endfunction()

# pells_set_up() for what users link.
function(pells_set_up_library target)
    pells_set_up(${target})
    target_compile_features(${target} PUBLIC cxx_std_17)
    target_compile_options(${target}
        # Unique symbols (statics of templates) would pin the library in memory after dlclose.
        PRIVATE $<$<COMPILE_LANG_AND_ID:CXX,GNU>:-fno-gnu-unique>
        # Nobody puts other definitions in the place of the library's own functions, so calls among
        # them can be direct and inline.
        PRIVATE $<$<COMPILE_LANG_AND_ID:CXX,GNU,Clang>:-fno-semantic-interposition>)
    if(BUILD_SHARED_LIBS AND UNIX AND NOT APPLE)
        set(exports ${PROJECT_SOURCE_DIR}/pells/exports.map)
        target_link_options(${target} PRIVATE LINKER:--version-script=${exports} LINKER:-Bsymbolic-functions)
        set_target_properties(${target} PROPERTIES LINK_DEPENDS ${exports})
    endif()
    set_target_properties(${target} PROPERTIES
        VERSION ${PROJECT_VERSION}
        SOVERSION ${PROJECT_VERSION_MAJOR}.${PROJECT_VERSION_MINOR}
        VERIFY_INTERFACE_HEADER_SETS ON)
endfunction()
