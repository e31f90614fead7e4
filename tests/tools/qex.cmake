# Tests of the qex command, which run it as a process of its own.
find_package(nlohmann_json REQUIRED)
foreach(name info render cli texture emitter lookup)
    add_executable(qex_${name}_test ${CMAKE_CURRENT_LIST_DIR}/qex_${name}_test.cpp)
    target_include_directories(qex_${name}_test PRIVATE ${CMAKE_CURRENT_LIST_DIR}/..)
    target_compile_definitions(qex_${name}_test PRIVATE QEX_COMMAND="$<TARGET_FILE:qex_cli>")
    target_link_libraries(qex_${name}_test PRIVATE qex_warnings qex_engine qex_headless qex_texture
        nlohmann_json::nlohmann_json GTest::gtest_main)
    add_dependencies(qex_${name}_test qex_cli)
    gtest_discover_tests(qex_${name}_test PROPERTIES
        TIMEOUT 600
        # The leak check of a process that ends while the driver's threads still run can crash; the render tests make
        # it in their own process.
        ENVIRONMENT "ASAN_OPTIONS=detect_leaks=0")
endforeach()
