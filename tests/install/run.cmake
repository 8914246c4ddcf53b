message(STATUS todo)
