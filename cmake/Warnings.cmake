# One set of warnings for the whole tree; errors where the presets of script/check ask for it.
add_library(tarn_warnings INTERFACE)
target_compile_options(tarn_warnings INTERFACE
    -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wnon-virtual-dtor -Woverloaded-virtual -Wextra-semi -Wcast-qual
    $<$<CXX_COMPILER_ID:GNU>:-Wsuggest-override>
    $<$<BOOL:${TARN_WERROR}>:-Werror>)
