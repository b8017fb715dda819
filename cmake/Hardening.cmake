# Options that make a fault in a program hard to exploit. tests/hardening/check-hardening checks the
# programs for their effects.
include(CheckCXXSourceCompiles)

# Programs are loaded at random addresses. Code of shared libraries is position-independent anyway.
set(program $<STREQUAL:$<TARGET_PROPERTY:TYPE>,EXECUTABLE>)
set(shared $<OR:$<STREQUAL:$<TARGET_PROPERTY:TYPE>,SHARED_LIBRARY>,$<BOOL:$<TARGET_PROPERTY:POSITION_INDEPENDENT_CODE>>>)
add_compile_options($<$<NOT:${shared}>:-fPIE> -fstack-protector-strong)
if(NOT CMAKE_EXE_LINKER_FLAGS MATCHES "-static")
    add_link_options($<${program}:-pie>)
endif()
# Tables of addresses are filled before main and are read-only from then on.
add_link_options(LINKER:-z,relro,-z,now,-z,noexecstack)

# Indirect calls and jumps reach only marked targets.
if(CMAKE_SYSTEM_PROCESSOR MATCHES "x86_64|i[3-6]86")
    add_compile_options(-fcf-protection)
elseif(CMAKE_SYSTEM_PROCESSOR MATCHES "aarch64|arm64")
    add_compile_options(-mbranch-protection=standard)
endif()

# Checks of buffer sizes in the C library, which need an optimising compiler.
set(CMAKE_REQUIRED_FLAGS "-O1 -Werror -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=3")
check_cxx_source_compiles("#include <features.h>\\n#if __USE_FORTIFY_LEVEL < 3\\n#error\\n#endif\\nint main() {}"
    COMPILER_KNOWS_FORTIFY_3)
unset(CMAKE_REQUIRED_FLAGS)
add_compile_options($<$<NOT:$<CONFIG:Debug>>:-U_FORTIFY_SOURCE>
    $<$<NOT:$<CONFIG:Debug>>:-D_FORTIFY_SOURCE=$<IF:$<BOOL:${COMPILER_KNOWS_FORTIFY_3}>,3,2>>)

# Unused code is left out, so that an attacker cannot use it.
add_compile_options(-ffunction-sections -fdata-sections)
add_link_options(LINKER:--gc-sections,--as-needed)
