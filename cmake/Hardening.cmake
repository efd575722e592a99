# A broken invariant ends the process in every build, before it does harm; the service manager starts it again.
foreach(configuration RELEASE RELWITHDEBINFO MINSIZEREL)
    string(REPLACE "-DNDEBUG" "" CMAKE_CXX_FLAGS_${configuration} "${CMAKE_CXX_FLAGS_${configuration}}")
endforeach()

# Sanitized builds trade hardening for reports; every other build is hardened.
if(TARN_SANITIZE)
    add_compile_options(-fsanitize=${TARN_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${TARN_SANITIZE})
    add_compile_definitions(TARN_SANITIZED)
else()
    add_compile_options(-fstack-protector-strong)
    # What only some compilers and processors know: jumps that land where they may, variables that begin as zero.
    include(CheckCXXCompilerFlag)
    foreach(flag -fstack-clash-protection -fcf-protection -mbranch-protection=standard -ftrivial-auto-var-init=zero)
        string(MAKE_C_IDENTIFIER "hardening${flag}" known)
        check_cxx_compiler_flag("-Werror ${flag}" ${known}) # some only warn of what they do not know
        if(${known})
            add_compile_options(${flag})
        endif()
    endforeach()
    add_compile_options("$<$<CONFIG:Release>:-D_FORTIFY_SOURCE=2;-D_GLIBCXX_ASSERTIONS>")
    add_link_options(-Wl,-z,relro,-z,now -Wl,--as-needed)
    include(CheckPIESupported)
    check_pie_supported()
endif()
