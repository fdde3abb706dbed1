# vexa_fmt: the formatting library of the virtual camera and vexactl. Debian has it compiled for the machine's own word
# size; other builds compile what they use of it into each file.
add_library(vexa_fmt INTERFACE)
if(NOT CMAKE_CXX_FLAGS MATCHES "-m32")
  find_package(fmt REQUIRED)
  target_link_libraries(vexa_fmt INTERFACE fmt::fmt)
else()
  target_compile_definitions(vexa_fmt INTERFACE FMT_HEADER_ONLY)
endif()
