# The warnings every target of the project is built with; all of them are errors.
add_library(bt_warnings INTERFACE)
target_compile_options(bt_warnings INTERFACE
  -Wall -Wextra -Wpedantic -Wconversion -Wshadow -Wcast-align -Wundef -Werror
  $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor -Woverloaded-virtual>)
