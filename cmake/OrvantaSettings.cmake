# Common build settings: every target of ours links orvanta_settings.
set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_AUTOMOC ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/bin)

find_program(CCACHE_PROGRAM ccache)
if(CCACHE_PROGRAM AND NOT CMAKE_CXX_COMPILER_LAUNCHER)
    set(CMAKE_CXX_COMPILER_LAUNCHER ${CCACHE_PROGRAM})
endif()

find_package(Qt6 REQUIRED COMPONENTS Core Gui Widgets PrintSupport Network Test)
find_package(PkgConfig REQUIRED)
find_library(FBCLIENT_LIBRARY NAMES fbclient REQUIRED)
find_path(FBCLIENT_INCLUDE_DIR firebird/Interface.h REQUIRED)
add_library(Firebird::fbclient UNKNOWN IMPORTED)
set_target_properties(Firebird::fbclient PROPERTIES
    IMPORTED_LOCATION ${FBCLIENT_LIBRARY} INTERFACE_INCLUDE_DIRECTORIES ${FBCLIENT_INCLUDE_DIR})
pkg_check_modules(GCRYPT REQUIRED IMPORTED_TARGET libgcrypt)

add_library(orvanta_settings INTERFACE)
target_compile_options(orvanta_settings INTERFACE -Wall -Wextra)
if(ORVANTA_WERROR)
    target_compile_options(orvanta_settings INTERFACE -Werror)
endif()
target_compile_definitions(orvanta_settings INTERFACE
    QT_NO_KEYWORDS
    QT_DISABLE_DEPRECATED_BEFORE=0x060000
    ORVANTA_VERSION="${PROJECT_VERSION}")
target_include_directories(orvanta_settings INTERFACE ${PROJECT_SOURCE_DIR} ${PROJECT_BINARY_DIR}/generated)
# Only Qt Core here: each library names the further Qt modules it uses, so that a widget in a
# layer below ui/ does not compile.
target_link_libraries(orvanta_settings INTERFACE Qt6::Core)

if(ORVANTA_SANITIZE)
    set(_san -fsanitize=address,undefined -fno-omit-frame-pointer -fno-sanitize-recover=undefined)
    target_compile_options(orvanta_settings INTERFACE ${_san})
    target_link_options(orvanta_settings INTERFACE ${_san})
endif()

if(ORVANTA_FUZZ)
    # Coverage for libFuzzer in every target; harmless for the tests built alongside.
    target_compile_options(orvanta_settings INTERFACE -fsanitize=fuzzer-no-link)
endif()

# One precompiled header per layer, built once and reused by every target of that layer
# (a target's compile definitions must be a superset of the header target's).
file(WRITE ${PROJECT_BINARY_DIR}/generated/pch_anchor.cpp "// anchor of a precompiled header\n")
add_library(orvanta_pch_core STATIC ${PROJECT_BINARY_DIR}/generated/pch_anchor.cpp)
target_link_libraries(orvanta_pch_core PUBLIC orvanta_settings)
target_precompile_headers(orvanta_pch_core PRIVATE ${PROJECT_SOURCE_DIR}/cmake/pch_core.h)
add_library(orvanta_pch_widgets STATIC ${PROJECT_BINARY_DIR}/generated/pch_anchor.cpp)
target_link_libraries(orvanta_pch_widgets PUBLIC orvanta_settings Qt6::Gui Qt6::Widgets)
target_precompile_headers(orvanta_pch_widgets PRIVATE ${PROJECT_SOURCE_DIR}/cmake/pch_widgets.h)

# Gives a target the precompiled header of its layer: widgets when it links Qt Widgets.
function(orvanta_use_pch target)
    get_target_property(_type ${target} TYPE)
    if(_type STREQUAL "INTERFACE_LIBRARY")
        return()
    endif()
    cmake_parse_arguments(ARG "WIDGETS" "" "" ${ARGN})
    if(ARG_WIDGETS)
        target_precompile_headers(${target} REUSE_FROM orvanta_pch_widgets)
    else()
        target_precompile_headers(${target} REUSE_FROM orvanta_pch_core)
    endif()
endfunction()

# One static library per folder; sources are the folder's *.cpp and *.h (and subfolders).
#   QT     the Qt modules beyond Core it uses (Gui, Widgets, Network, PrintSupport)
#   QT_PRIVATE  Qt modules only its sources use, not passed on to the layers above
#   LAYER  the project folders its sources may include; checked before every build
#   DEPS   libraries it links
function(orvanta_add_library name)
    cmake_parse_arguments(ARG "" "" "DEPS;QT;QT_PRIVATE;LAYER" ${ARGN})
    file(GLOB_RECURSE _src CONFIGURE_DEPENDS
        ${CMAKE_CURRENT_SOURCE_DIR}/*.cpp ${CMAKE_CURRENT_SOURCE_DIR}/*.h)
    list(FILTER _src EXCLUDE REGEX "/main\\.cpp$")
    set(_qt "")
    foreach(_m IN LISTS ARG_QT)
        list(APPEND _qt Qt6::${_m})
    endforeach()
    if(NOT _src MATCHES "\\.cpp")
        # A folder whose code is still to come: a library that only passes its dependencies on.
        add_library(${name} INTERFACE)
        target_link_libraries(${name} INTERFACE orvanta_settings ${_qt} ${ARG_DEPS})
        return()
    endif()
    add_library(${name} STATIC ${_src})
    target_link_libraries(${name} PUBLIC orvanta_settings ${_qt} ${ARG_DEPS})
    foreach(_m IN LISTS ARG_QT_PRIVATE)
        target_link_libraries(${name} PRIVATE Qt6::${_m})
    endforeach()
    if("Widgets" IN_LIST ARG_QT)
        orvanta_use_pch(${name} WIDGETS)
    else()
        orvanta_use_pch(${name})
    endif()

    set(_stamp ${CMAKE_CURRENT_BINARY_DIR}/${name}.layer-ok)
    add_custom_command(OUTPUT ${_stamp}
        COMMAND ${CMAKE_COMMAND} -DFOLDER=${CMAKE_CURRENT_SOURCE_DIR} "-DALLOWED=${ARG_LAYER}"
                "-DQT=Core;${ARG_QT};${ARG_QT_PRIVATE}" -DSTAMP=${_stamp} -P ${PROJECT_SOURCE_DIR}/cmake/CheckLayer.cmake
        DEPENDS ${_src} ${PROJECT_SOURCE_DIR}/cmake/CheckLayer.cmake
        COMMENT "Checking the includes of ${name}" VERBATIM)
    add_custom_target(${name}_layer DEPENDS ${_stamp})
    add_dependencies(${name} ${name}_layer)
endfunction()
