# Takes the code samples out of the pages, so that a test compiles and runs what the reader sees.

# Writes the samples of one language of a page, from its "```LANGUAGE" on, as FOLDER/PAGE_1.LANGUAGE
# and so on.
function(pells_extract_samples page language folder)
    set(path ${PROJECT_SOURCE_DIR}/docs/${page}.md)
    set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${path})
    file(READ ${path} rest)
    set(fence "\n```${language}\n")
    string(LENGTH "${fence}" fence_length)
    set(count 0)
    while(TRUE)
        string(FIND "${rest}" "${fence}" start)
        if(start EQUAL -1)
            break()
        endif()
        math(EXPR start "${start} + ${fence_length}")
        string(SUBSTRING "${rest}" ${start} -1 rest)
        string(FIND "${rest}" "\n```" length)
        string(SUBSTRING "${rest}" 0 ${length} sample)
        math(EXPR count "${count} + 1")
        file(CONFIGURE OUTPUT ${folder}/${page}_${count}.${language} CONTENT "@sample@\n" @ONLY)
    endwhile()
endfunction()
