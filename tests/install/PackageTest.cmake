# cmake -DBUILD_DIR=... -DWORK_DIR=... -DVERSION=... -DAPP_ID=... -P PackageTest.cmake
# Builds the Debian package into a temporary folder and checks its control fields and its contents with
# dpkg-deb, and runs lintian on it when lintian is installed.
cmake_minimum_required(VERSION 3.25)

set(failures "")
macro(fail message)
    list(APPEND failures "${message}")
    message(STATUS "FAIL: ${message}")
endmacro()

foreach(tool cpack dpkg-deb dpkg-shlibdeps lintian)
    find_program(${tool}_exe ${tool})
    if(NOT ${tool}_exe)
        message(FATAL_ERROR "${tool} is missing: install the Debian packages cmake, dpkg-dev and lintian "
            "(make test does)")
    endif()
endforeach()

file(REMOVE_RECURSE ${WORK_DIR})
file(MAKE_DIRECTORY ${WORK_DIR})
execute_process(COMMAND ${cpack_exe} -G DEB --config ${BUILD_DIR}/CPackConfig.cmake -B ${WORK_DIR}
    RESULT_VARIABLE result OUTPUT_VARIABLE output ERROR_VARIABLE output)
set(deb ${WORK_DIR}/brimvault_${VERSION}_amd64.deb)
if(NOT result EQUAL 0 OR NOT EXISTS ${deb})
    message(FATAL_ERROR "cpack did not make ${deb}:\n${output}")
endif()

function(field name out)
    execute_process(COMMAND ${dpkg-deb_exe} -f ${deb} ${name} OUTPUT_VARIABLE value OUTPUT_STRIP_TRAILING_WHITESPACE)
    set(${out} "${value}" PARENT_SCOPE)
endfunction()
foreach(pair "Package=brimvault" "Version=${VERSION}" "Architecture=amd64" "Section=games" "Priority=optional"
        "Recommends=wine" "Homepage=https://brimvault.io")
    string(REPLACE "=" ";" pair "${pair}")
    list(GET pair 0 name)
    list(GET pair 1 wanted)
    field(${name} value)
    if(NOT value STREQUAL wanted)
        fail("${name} is '${value}', not '${wanted}'")
    endif()
endforeach()
field(Maintainer maintainer)
if(NOT maintainer MATCHES "^[^<]+ <[^@>]+@[^>]+>$")
    fail("Maintainer '${maintainer}' is not a name with an address")
endif()
# Computed from what the binaries link, so the libraries the program really needs are there with versions.
field(Depends depends)
foreach(library libc6 libqt6core6 libqt6widgets6 libqt6webenginewidgets6 libarchive13 qt6-qpa-plugins)
    if(NOT depends MATCHES "(^|, )${library}( |,|$)")
        fail("Depends lacks ${library}: ${depends}")
    endif()
endforeach()

execute_process(COMMAND ${dpkg-deb_exe} -c ${deb} OUTPUT_VARIABLE listing)
set(expected
    usr/bin/brimvault usr/bin/BrimvaultService usr/games/brimvault
    usr/lib/brimvault/brimvault usr/lib/brimvault/brimvault-media.so usr/lib/brimvault/BrimvaultService
    usr/lib/brimvault/ruffle-host.html
    usr/lib/brimvault/ruffle/ruffle.js
    usr/lib/brimvault/Quillet.so usr/lib/brimvault/Tamarisk.so usr/lib/brimvault/Velloran.so
    usr/lib/brimvault/Ostrane.so usr/lib/brimvault/Corvelle.so
    usr/lib/brimvault/Brimvault_Russian.lng usr/lib/brimvault/Brimvault_Polish.lng usr/lib/brimvault/brimvault.html
    usr/share/applications/${APP_ID}.desktop usr/share/metainfo/${APP_ID}.metainfo.xml
    usr/share/icons/hicolor/scalable/apps/${APP_ID}.svg
    usr/share/man/man1/brimvault.1.gz usr/share/man/man1/BrimvaultService.1.gz
    usr/share/doc/brimvault/copyright usr/share/doc/brimvault/changelog.gz)
foreach(path IN LISTS expected)
    string(REPLACE "." "\\." pattern "${path}")
    if(NOT listing MATCHES " \\./${pattern}( |\n)")
        fail("the package lacks /${path}")
    endif()
endforeach()
string(REGEX MATCHALL " \\./[^ \n]+" paths "${listing}")
foreach(path IN LISTS paths)
    if(NOT path MATCHES "^ \\./(usr/(lib/)?)?$" AND NOT path MATCHES "^ \\./usr/(bin|games|lib/brimvault|share)/")
        fail("the package installs outside its own places: ${path}")
    endif()
endforeach()

execute_process(COMMAND ${lintian_exe} --tag-display-limit 0 ${deb} OUTPUT_VARIABLE lint ERROR_VARIABLE lint)
string(REGEX MATCHALL "(^|\n)E: [^\n]*" errors "${lint}")
if(errors)
    fail("lintian reports errors:${errors}")
endif()
message(STATUS "lintian:\n${lint}")

if(failures)
    list(LENGTH failures count)
    message(FATAL_ERROR "${count} check(s) failed")
endif()
message(STATUS "package checks passed: ${deb}")
