# Compiler and linker settings shared by every target, as the interface library `kestrova-options`.

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
    target_compile_options(kestrova-options INTERFACE
        -fstack-protector-strong -fstack-clash-protection -fcf-protection -Wformat -Wformat-security
        $<$<NOT:$<CONFIG:Debug>>:-U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2>)
    target_link_options(kestrova-options INTERFACE -Wl,-z,relro -Wl,-z,now)
endif()
