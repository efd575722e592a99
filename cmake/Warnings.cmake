# One set of warnings for the whole tree; errors where the presets of script/check ask for it.
# g++ 12 sees overlapping copies in "x" + text where none can be (its bug 105651).
add_library(tarn_warnings INTERFACE)
target_compile_options(tarn_warnings INTERFACE
    -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wnon-virtual-dtor -Woverloaded-virtual -Wextra-semi -Wcast-qual
    $<$<CXX_COMPILER_ID:GNU>:-Wsuggest-override>
    $<$<AND:$<CXX_COMPILER_ID:GNU>,$<VERSION_LESS:$<CXX_COMPILER_VERSION>,13>>:-Wno-restrict>
    # Where one unit includes several sources: gcc takes them for headers, and names that are local to one are global to the next.
    $<$<BOOL:${CMAKE_UNITY_BUILD}>:-Wno-shadow $<$<CXX_COMPILER_ID:GNU>:-Wno-subobject-linkage>>
    $<$<BOOL:${TARN_WERROR}>:-Werror>)
