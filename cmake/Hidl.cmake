# Interface code, made from .hal files by hidl-gen, the compiler of the interface language.

find_program(HIDL_GEN hidl-gen REQUIRED)
set(hidl_roots -R -p ${PROJECT_SOURCE_DIR}
    -r android.hidl:platform/interfaces/hidl
    -r android.hardware:platform/interfaces/hardware
    -r vendor.velmora.hardware.vibrator:interface)

# hidl_package(NAME VERSION FOLDER INTERFACE...): makes the code of a package, of which INTERFACE...
# are the interfaces and "types" stands for a file of types, and adds it to interface_sources.
function(hidl_package name version folder)
    set(generated ${CMAKE_CURRENT_BINARY_DIR}/generated)
    string(REPLACE . / path ${name})
    set(path ${generated}/${path}/${version})
    set(inputs ${ARGN})
    list(TRANSFORM inputs PREPEND ${PROJECT_SOURCE_DIR}/${folder}/${version}/)
    list(TRANSFORM inputs APPEND .hal)
    set(outputs)
    foreach(each ${ARGN})
        if(each STREQUAL types)
            list(APPEND outputs ${path}/types.cpp)
        else()
            string(SUBSTRING ${each} 1 -1 base)
            list(APPEND outputs ${path}/${base}All.cpp)
        endif()
    endforeach()
    add_custom_command(OUTPUT ${outputs}
        COMMAND ${HIDL_GEN} ${hidl_roots} -L c++-headers -o ${generated} ${name}@${version}
        COMMAND ${HIDL_GEN} ${hidl_roots} -L c++-sources -o ${generated} ${name}@${version}
        # Else each file that includes them has the values of enumerations once more, for clang++.
        COMMAND sed -i "'s/^template<> constexpr/template<> inline constexpr/'" ${path}/*.h
        DEPENDS ${inputs}
        COMMENT "hidl-gen ${name}@${version}")
    set(interface_sources ${interface_sources} ${outputs} PARENT_SCOPE)
endfunction()

# add_interface_code(TARGET TYPE): a library of interface_sources, and TARGET-generated, the target
# of those files, on which depends what includes their headers.
function(add_interface_code target type)
    add_custom_target(${target}-generated DEPENDS ${interface_sources})
    add_library(${target} ${type} ${interface_sources})
    add_dependencies(${target} ${target}-generated)
    # In one go, which takes a third of the time, but for second interfaces of a package: each begins
    # with functions of the same names.
    set_target_properties(${target} PROPERTIES UNITY_BUILD ON UNITY_BUILD_BATCH_SIZE 0)
    set(second_interfaces ${interface_sources})
    list(FILTER second_interfaces INCLUDE REGEX "ServiceNotificationAll|ClientCallbackAll")
    set_source_files_properties(${second_interfaces} PROPERTIES SKIP_UNITY_BUILD_INCLUSION ON)
    # Without warnings: what the compiler makes is not ours to change. As on a device, it does
    # without exceptions; it keeps the run-time types that the classes of clients may have.
    target_compile_options(${target} PRIVATE -w -fno-exceptions
        # Else g++ soon inlines nothing more into so large a file.
        $<$<CXX_COMPILER_ID:GNU>:--param=inline-unit-growth=200>)
    if(VIBRATOR_SANITIZE)
        # Of all files these take the longest to optimise, and no test needs them fast.
        target_compile_options(${target} PRIVATE -O0)
    endif()
    target_include_directories(${target} SYSTEM PUBLIC ${CMAKE_CURRENT_BINARY_DIR}/generated)
endfunction()
