# brimvault_add_test(tst_name SOURCES a.cpp ... LIBS lib ... [LABELS l ...] [LAUNCHER command ...])
# Every test is its own Qt Test executable, registered with CTest, run headless with its own temporary
# environment so that nothing touches the real user's settings or folders.
function(brimvault_add_test name)
    cmake_parse_arguments(T "" "TIMEOUT" "SOURCES;LIBS;LABELS;ENV;LAUNCHER" ${ARGN})
    add_executable(${name} ${T_SOURCES})
    target_link_libraries(${name} PRIVATE brimvault_common Qt6::Test bv_testsupport ${T_LIBS})
    target_include_directories(${name} PRIVATE ${CMAKE_SOURCE_DIR}/tests/common)
    set_target_properties(${name} PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/tests)
    target_compile_definitions(${name} PRIVATE
        BRIMVAULT_BIN_DIR="${BRIMVAULT_BIN_DIR}"
        BRIMVAULT_SOURCE_DIR="${CMAKE_SOURCE_DIR}"
        BRIMVAULT_TEST_DATA_DIR="${CMAKE_BINARY_DIR}/testdata")
    add_test(NAME ${name} COMMAND ${T_LAUNCHER} $<TARGET_FILE:${name}>)
    if(NOT T_TIMEOUT)
        set(T_TIMEOUT 120)
    endif()
    set(sanitizer_env "")
    if(BRIMVAULT_SANITIZE MATCHES "address")
        # Qt WebEngine's own (uninstrumented) Chromium frees some objects through a base type of another
        # size; AddressSanitizer reports that inside libQt6WebEngineCore when a page is destroyed.
        # Its caches and fontconfig's stay allocated until exit on purpose.
        set(sanitizer_env
            "ASAN_OPTIONS=new_delete_type_mismatch=0;LSAN_OPTIONS=suppressions=${CMAKE_SOURCE_DIR}/tests/sanitizer/lsan.supp")
    endif()
    set_tests_properties(${name} PROPERTIES TIMEOUT ${T_TIMEOUT}
        ENVIRONMENT "QT_QPA_PLATFORM=offscreen;QTWEBENGINE_DISABLE_SANDBOX=1;QTWEBENGINE_CHROMIUM_FLAGS=--disable-gpu;${sanitizer_env};${T_ENV}")
    if(T_LABELS)
        set_tests_properties(${name} PROPERTIES LABELS "${T_LABELS}")
    endif()
endfunction()
