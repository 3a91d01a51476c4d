# layer(NAME [SHARED] [LINKS layer…] [LIBRARIES target…])
#
# A layer is a folder below src/ and a target of its own; its link line is its dependency list. Layers can only link
# layers that were declared before them, so the order in src/CMakeLists.txt is the dependency order. Each layer has an
# include root that holds nothing but itself: an #include of a layer that is not linked does not compile.
#
# LINKS are layers, passed on to whoever links this one. LIBRARIES are third-party targets, kept private.
function(layer NAME)
    cmake_parse_arguments(PARSE_ARGV 1 LAYER "SHARED" "" "LINKS;LIBRARIES")
    string(REPLACE "/" "-" target "clipsa-${NAME}")
    set(folder ${CMAKE_SOURCE_DIR}/src/${NAME})
    set(root ${CMAKE_BINARY_DIR}/include/${target})

    get_filename_component(parent ${root}/${NAME} DIRECTORY)
    file(MAKE_DIRECTORY ${parent})
    file(CREATE_LINK ${folder} ${root}/${NAME} SYMBOLIC)

    file(GLOB_RECURSE sources CONFIGURE_DEPENDS ${folder}/*.cpp)
    file(GLOB_RECURSE headers CONFIGURE_DEPENDS ${folder}/*.h)
    list(FILTER sources EXCLUDE REGEX "_main\\.cpp$")
    if(NOT sources)
        add_library(${target} INTERFACE)
        set(scope INTERFACE)
    else()
        if(LAYER_SHARED)
            add_library(${target} SHARED ${sources} ${headers})
        else()
            add_library(${target} STATIC ${sources} ${headers})
        endif()
        target_link_libraries(${target} PRIVATE clipsa-compile ${LAYER_LIBRARIES})
        set(scope PUBLIC)
    endif()
    target_include_directories(${target} ${scope} ${root})
    foreach(link IN LISTS LAYER_LINKS)
        string(REPLACE "/" "-" linkTarget "clipsa-${link}")
        if(NOT TARGET ${linkTarget})
            message(FATAL_ERROR "layer ${NAME} links ${link}, which is not declared before it: see src/CMakeLists.txt")
        endif()
        target_link_libraries(${target} ${scope} ${linkTarget})
    endforeach()
endfunction()

# program(NAME MAIN LINKS layer… LIBRARIES target…): an executable made of one main file and layers. Its target is called
# program-NAME, because the layer `editor` is the target clipsa-editor.
function(program NAME MAIN)
    cmake_parse_arguments(PARSE_ARGV 2 PROGRAM "" "" "LINKS;LIBRARIES")
    add_executable(program-${NAME} ${MAIN})
    set_target_properties(program-${NAME} PROPERTIES OUTPUT_NAME ${NAME})
    target_link_libraries(program-${NAME} PRIVATE clipsa-compile ${PROGRAM_LIBRARIES})
    foreach(link IN LISTS PROGRAM_LINKS)
        string(REPLACE "/" "-" linkTarget "clipsa-${link}")
        target_link_libraries(program-${NAME} PRIVATE ${linkTarget})
    endforeach()
endfunction()
