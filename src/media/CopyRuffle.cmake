# cmake -DSOURCE=<node_modules/@ruffle-rs/ruffle> -DDESTINATION=<bin/ruffle> -P CopyRuffle.cmake
# Copies Ruffle beside the program when it is installed and differs from the copy already there. Runs at
# every build, so a Ruffle installed after the build folder was configured is picked up too.
if(NOT EXISTS "${SOURCE}/ruffle.js")
    if(NOT EXISTS "${DESTINATION}/ruffle.js")
        message(STATUS "Ruffle is not installed (tools/install-ruffle.sh): Flash movies will not play")
    endif()
    return()
endif()
file(READ "${SOURCE}/package.json" wanted)
set(have "")
if(EXISTS "${DESTINATION}/package.json" AND EXISTS "${DESTINATION}/ruffle.js")
    file(READ "${DESTINATION}/package.json" have)
endif()
if(NOT wanted STREQUAL have)
    file(REMOVE_RECURSE "${DESTINATION}")
    file(COPY "${SOURCE}/" DESTINATION "${DESTINATION}" PATTERN "*.map" EXCLUDE)
    message(STATUS "Ruffle copied to ${DESTINATION}")
endif()
