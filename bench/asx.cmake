# Reading playlists, beside expat.
find_package(EXPAT REQUIRED)
add_executable(asx_bench AsxBench.cpp ${CMAKE_SOURCE_DIR}/src/avcontrol/Asx.cpp ${CMAKE_SOURCE_DIR}/common/Log.cpp)
target_include_directories(asx_bench PRIVATE ${CMAKE_SOURCE_DIR})
target_link_libraries(asx_bench PRIVATE benchmark::benchmark EXPAT::EXPAT Threads::Threads)
