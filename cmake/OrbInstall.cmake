message(STATUS "install rules: to come")
