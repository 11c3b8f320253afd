# Quorix::options is what every target of the project is compiled with; Quorix::version gives
# the generated header with the project's version.

add_library(quorix_options INTERFACE)
add_library(Quorix::options ALIAS quorix_options)

target_compile_features(quorix_options INTERFACE cxx_std_17)
target_include_directories(quorix_options INTERFACE
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/src>
    $<INSTALL_INTERFACE:include/quorix>
)
# Warnings are ours; whoever builds with the installed headers has their own.
target_compile_options(quorix_options INTERFACE
    "$<BUILD_INTERFACE:-Wall;-Wextra;-Wpedantic;-Wnon-virtual-dtor;-Woverloaded-virtual>"
    "$<BUILD_INTERFACE:$<$<CXX_COMPILER_ID:Clang>:-Wshadow;-Wthread-safety>>"
    # Clang lets a constructor's argument bear the name of the field that it sets; so does this.
    "$<BUILD_INTERFACE:$<$<CXX_COMPILER_ID:GNU>:-Wshadow=local>>"
    "$<BUILD_INTERFACE:$<$<BOOL:${QUORIX_WERROR}>:-Werror>>"
)

if(QUORIX_SANITIZE)
    target_compile_options(quorix_options INTERFACE
        -fsanitize=${QUORIX_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    target_link_options(quorix_options INTERFACE -fsanitize=${QUORIX_SANITIZE})
endif()

configure_file(${PROJECT_SOURCE_DIR}/cmake/QuorixVersion.h.in
    ${PROJECT_BINARY_DIR}/generated/QuorixVersion.h @ONLY)
add_library(quorix_version INTERFACE)
add_library(Quorix::version ALIAS quorix_version)
target_include_directories(quorix_version INTERFACE ${PROJECT_BINARY_DIR}/generated)
