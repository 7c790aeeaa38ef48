# Compiles through ccache, so that a second build, of another preset or of another clone, takes over
# what was compiled before.
find_program(QVX_CCACHE ccache)
if(QVX_CCACHE)
    # Paths below the clone count relative to it; precompiled headers are compared by their content.
    set(cached ${CMAKE_COMMAND} -E env CCACHE_BASEDIR=${CMAKE_SOURCE_DIR} CCACHE_NOHASHDIR=true
        CCACHE_SLOPPINESS=pch_defines,time_macros,include_file_mtime,include_file_ctime ${QVX_CCACHE})
    set(CMAKE_C_COMPILER_LAUNCHER ${cached})
    set(CMAKE_CXX_COMPILER_LAUNCHER ${cached})
endif()
