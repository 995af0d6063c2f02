# Compiler and linker settings shared by every target, as the interface library `kestrova-options`.

include(CheckCXXCompilerFlag)
include(CheckPIESupported)
check_pie_supported()

add_library(kestrova-options INTERFACE)
target_compile_options(kestrova-options INTERFACE
    -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Woverloaded-virtual
    $<$<BOOL:${KESTROVA_WERROR}>:-Werror>)

if(KESTROVA_SANITIZE)
    target_compile_options(kestrova-options INTERFACE
        -fsanitize=address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer)
    target_link_options(kestrova-options INTERFACE -fsanitize=address,undefined)
else()
    # The processor decides which of them exist: the fourth is what arm64 has instead of the third.
    foreach(flag -fstack-protector-strong -fstack-clash-protection -fcf-protection
            -mbranch-protection=standard)
        string(MAKE_C_IDENTIFIER KESTROVA_HAS${flag} accepted)
        check_cxx_compiler_flag(${flag} ${accepted})
        if(${accepted})
            target_compile_options(kestrova-options INTERFACE ${flag})
        endif()
    endforeach()
    target_compile_options(kestrova-options INTERFACE
        -Wformat -Wformat-security
        $<$<NOT:$<CONFIG:Debug>>:-U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2>)
    target_link_options(kestrova-options INTERFACE -Wl,-z,relro -Wl,-z,now)
endif()
