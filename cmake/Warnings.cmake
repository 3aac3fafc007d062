# Warnings are on for every target of the project and kept at zero.
add_compile_options(-Wall -Wextra -Wpedantic -Wno-missing-field-initializers)
