# Read by cpack before it runs the install rules (CPACK_PROJECT_CONFIG_FILE).
set(ENV{QUILLANE_PACKAGING} 1)
