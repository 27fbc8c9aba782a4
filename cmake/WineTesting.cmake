# The Windows build's test programs run under Wine, in a Wine prefix of the build tree's own, with
# Wine's own chatter off and the Mono and Gecko installers never offered.
find_program(WINE_EXECUTABLE wine)
if(NOT WINE_EXECUTABLE)
  message(FATAL_ERROR "The Windows tests run under Wine: install wine and wine32 "
                      "(scripts/install-windows-deps), or configure with -DBUILD_TESTING=OFF.")
endif()

set(WINE_ENVIRONMENT WINEPREFIX=${CMAKE_BINARY_DIR}/wine WINEDEBUG=-all WINEDLLOVERRIDES=mscoree,mshtml=)
set(CMAKE_CROSSCOMPILING_EMULATOR ${CMAKE_COMMAND} -E env ${WINE_ENVIRONMENT} ${WINE_EXECUTABLE})

# Creating the prefix takes seconds; doing it once up front keeps test programs from racing for it.
function(add_wine_prefix_test)
  add_test(NAME wine_prefix COMMAND ${CMAKE_CROSSCOMPILING_EMULATOR} wineboot --init)
  set_tests_properties(wine_prefix PROPERTIES FIXTURES_SETUP wine_prefix)
endfunction()
