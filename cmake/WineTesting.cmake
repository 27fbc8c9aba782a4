# The Windows builds' test programs run under Wine, with Wine's own chatter off and the Mono and
# Gecko installers never offered. Where the kernel runs 32-bit programs only through an emulator,
# creating a Wine prefix takes minutes: the Windows builds share one, made once and kept.
find_program(WINE_EXECUTABLE wine)
if(NOT WINE_EXECUTABLE)
  message(FATAL_ERROR "The Windows tests run under Wine: install wine and wine32 "
                      "(scripts/install-windows-deps), or configure with -DBUILD_TESTING=OFF.")
endif()

set(WINE_PREFIX "${CMAKE_BINARY_DIR}/wine" CACHE PATH "The Wine prefix the tests run in")
set(WINE_ENVIRONMENT WINEPREFIX=${WINE_PREFIX} WINEDEBUG=-all WINEDLLOVERRIDES=mscoree,mshtml=)
set(CMAKE_CROSSCOMPILING_EMULATOR ${CMAKE_COMMAND} -E env ${WINE_ENVIRONMENT} ${WINE_EXECUTABLE})

# Made up front, so that test programs do not race to make it; a prefix already made is kept.
function(add_wine_prefix_test)
  add_test(NAME wine_prefix
    COMMAND sh -c "test -f \"$0/system.reg\" || \"$@\" wineboot --init" ${WINE_PREFIX}
            ${CMAKE_CROSSCOMPILING_EMULATOR})
  set_tests_properties(wine_prefix PROPERTIES FIXTURES_SETUP wine_prefix TIMEOUT 900)
endfunction()
