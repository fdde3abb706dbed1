# vexa_ffmpeg: FFmpeg's libraries, for the virtual camera's live pictures and vexactl's containers. Debian has them for the
# machine's own word size, not for -m32; builds without them have no such target and no VEXA_WITH_FFMPEG, and work without
# those parts.
if(NOT CMAKE_CXX_FLAGS MATCHES "-m32")
  if(VEXA_REQUIRE_ALL)
    find_package(PkgConfig REQUIRED)
    pkg_check_modules(VEXA_FFMPEG REQUIRED IMPORTED_TARGET libavcodec libavformat libavutil libswscale)
  else()
    find_package(PkgConfig QUIET)
    if(PKG_CONFIG_FOUND)
      pkg_check_modules(VEXA_FFMPEG QUIET IMPORTED_TARGET libavcodec libavformat libavutil libswscale)
    endif()
  endif()
endif()
if(VEXA_FFMPEG_FOUND)
  add_library(vexa_ffmpeg INTERFACE)
  target_link_libraries(vexa_ffmpeg INTERFACE PkgConfig::VEXA_FFMPEG)
  target_compile_definitions(vexa_ffmpeg INTERFACE VEXA_WITH_FFMPEG)
  target_link_options(vexa_ffmpeg INTERFACE LINKER:--as-needed)  # a program that calls none of them loads none
endif()
