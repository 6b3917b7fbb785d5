# One interface target carries the language level, warnings and Qt's strictness macros for every target.
add_library(brimvault_common INTERFACE)
target_compile_features(brimvault_common INTERFACE cxx_std_20)
target_compile_options(brimvault_common INTERFACE
    $<$<CXX_COMPILER_ID:GNU,Clang>:-Wall -Wextra -Wshadow -Wold-style-cast -Wnon-virtual-dtor>)
target_compile_definitions(brimvault_common INTERFACE
    QT_NO_CAST_FROM_ASCII QT_NO_CONTEXTLESS_CONNECT QT_NO_KEYWORDS QT_USE_QSTRINGBUILDER
    BRIMVAULT_VERSION="${PROJECT_VERSION}")

if(BRIMVAULT_SANITIZE)
    string(REPLACE "," ";" _bv_sanitizers "${BRIMVAULT_SANITIZE}")
    foreach(_s IN LISTS _bv_sanitizers)
        add_compile_options(-fsanitize=${_s})
        add_link_options(-fsanitize=${_s})
    endforeach()
    add_compile_options(-fno-omit-frame-pointer -fno-sanitize-recover=undefined)
endif()

# Core libraries are static and position independent so that the program, the service and the
# component plugins can all link them.
function(brimvault_core_library name)
    add_library(${name} STATIC ${ARGN})
    target_link_libraries(${name} PUBLIC brimvault_common)
    target_include_directories(${name} PUBLIC ${CMAKE_SOURCE_DIR}/src)
endfunction()
