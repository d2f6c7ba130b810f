// The headers that every unit test needs are compiled with this file, once for all of them.
