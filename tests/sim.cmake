kiv_test(sim_test sim/Doubles.cpp sim/SimTest.cpp sim/facade_test.cpp sim/operations_test.cpp sim/state_test.cpp)
kiv_test(sim_threads_test sim/threads_test.cpp) # with the library's own locks
