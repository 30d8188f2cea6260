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
target_link_libraries(orvanta_settings INTERFACE
    Qt6::Core Qt6::Gui Qt6::Widgets Qt6::PrintSupport Qt6::Network)

if(ORVANTA_SANITIZE)
    set(_san -fsanitize=address,undefined -fno-omit-frame-pointer -fno-sanitize-recover=undefined)
    target_compile_options(orvanta_settings INTERFACE ${_san})
    target_link_options(orvanta_settings INTERFACE ${_san})
endif()

# One static library per folder; sources are the folder's *.cpp and *.h (and subfolders).
function(orvanta_add_library name)
    cmake_parse_arguments(ARG "" "" "DEPS" ${ARGN})
    file(GLOB_RECURSE _src CONFIGURE_DEPENDS
        ${CMAKE_CURRENT_SOURCE_DIR}/*.cpp ${CMAKE_CURRENT_SOURCE_DIR}/*.h)
    list(FILTER _src EXCLUDE REGEX "/main\\.cpp$")
    if(NOT _src MATCHES "\\.cpp")
        # A folder whose code is still to come: a library that only passes its dependencies on.
        add_library(${name} INTERFACE)
        target_link_libraries(${name} INTERFACE orvanta_settings ${ARG_DEPS})
        return()
    endif()
    add_library(${name} STATIC ${_src})
    target_link_libraries(${name} PUBLIC orvanta_settings ${ARG_DEPS})
    target_precompile_headers(${name} PRIVATE ${PROJECT_SOURCE_DIR}/cmake/pch.h)
endfunction()

if(ORVANTA_FUZZ)
    # Coverage for libFuzzer in every library the fuzz targets link.
    target_compile_options(orvanta_settings INTERFACE -fsanitize=fuzzer-no-link)
endif()
