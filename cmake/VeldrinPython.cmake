# The interpreter of the Python tests. Debian's own comes first, whatever else is on the PATH: the blosc,
# msgpack and xxhash modules are installed for that one.
find_program(VELDRIN_PYTHON python3 PATHS /usr/bin NO_DEFAULT_PATH)
find_program(VELDRIN_PYTHON python3 REQUIRED)
