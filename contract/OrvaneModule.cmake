# SPDX-License-Identifier: Apache-2.0
# How a module is built: a directory NAME.ovmodule with the module's library, its resources, its
# string tables, and module.json, which names them.

# The gettext catalogues SOURCE/LANGUAGE/TABLE.po as DESTINATION/LANGUAGE/LC_MESSAGES/TABLE.mo, by a
# target of this name. English is the key, and needs none.
function(orvane_add_catalogues target source destination)
    find_program(ORVANE_MSGFMT msgfmt REQUIRED)
    file(GLOB catalogues CONFIGURE_DEPENDS ${source}/*/*.po)
    set(all)
    foreach(catalogue ${catalogues})
        get_filename_component(table ${catalogue} NAME_WE)
        get_filename_component(directory ${catalogue} DIRECTORY)
        get_filename_component(language ${directory} NAME)
        set(made ${destination}/${language}/LC_MESSAGES/${table}.mo)
        add_custom_command(
            OUTPUT ${made}
            COMMAND ${CMAKE_COMMAND} -E make_directory ${destination}/${language}/LC_MESSAGES
            COMMAND ${ORVANE_MSGFMT} -o ${made} ${catalogue}
            DEPENDS ${catalogue})
        list(APPEND all ${made})
    endforeach()
    add_custom_target(${target} ALL DEPENDS ${all})
endfunction()

# orvane_add_module(TARGET NAME name SOURCES file...
#                   [RESOURCES file...] [CATALOGUES directory] [TABLE table])
#
# Builds modules/NAME.ovmodule below the build directory (or NAME.ovmodule in ORVANE_MODULE_DIRECTORY,
# where that is set), and installs it where the programs look for modules. The library exports OVModuleEntry() alone (contract/support/ModuleEntry.h) and must not
# need anything that is not there when it is loaded.
#
# RESOURCES   interface files (*.ui) and whatever else the module's Bundle is asked for
# CATALOGUES  has LANGUAGE/TABLE.po for every language; makes the target TARGET-texts
# TABLE       the string table that texts are looked up in: NAME, unless it is given
function(orvane_add_module target)
    cmake_parse_arguments(PARSE_ARGV 1 module "" "NAME;TABLE;CATALOGUES" "SOURCES;RESOURCES")
    if(NOT module_NAME OR NOT module_SOURCES)
        message(FATAL_ERROR "orvane_add_module: the module ${target} needs a NAME and SOURCES.")
    endif()
    if(NOT module_TABLE)
        set(module_TABLE ${module_NAME})
    endif()
    set(directory ${CMAKE_BINARY_DIR}/modules)
    if(ORVANE_MODULE_DIRECTORY)
        set(directory ${ORVANE_MODULE_DIRECTORY})
    endif()
    set(bundle ${directory}/${module_NAME}.ovmodule)

    add_library(${target} MODULE ${module_SOURCES})
    target_link_libraries(${target} PRIVATE
        -Wl,--no-undefined -Wl,--as-needed -Wl,--exclude-libs,ALL OrvaneModule::contract)
    set_target_properties(${target} PROPERTIES
        PREFIX "" CXX_VISIBILITY_PRESET hidden LIBRARY_OUTPUT_DIRECTORY ${bundle})
    file(GENERATE OUTPUT ${bundle}/module.json CONTENT "{
    \"name\": \"${module_NAME}\",
    \"library\": \"$<TARGET_FILE_NAME:${target}>\",
    \"table\": \"${module_TABLE}\"
}
")
    foreach(resource ${module_RESOURCES})
        get_filename_component(name ${resource} NAME)
        configure_file(${resource} ${bundle}/${name} COPYONLY)
    endforeach()
    if(module_CATALOGUES)
        get_filename_component(source ${module_CATALOGUES} ABSOLUTE)
        orvane_add_catalogues(${target}-texts ${source} ${bundle}/locale)
        add_dependencies(${target} ${target}-texts)
    endif()
    # Not the library directory of the machine's kind: the programs look here.
    install(DIRECTORY ${bundle} DESTINATION lib/orvane/modules)
endfunction()
