# Warnings are errors everywhere, generated code included.
add_compile_options(-Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wsign-conversion
                    -Wnon-virtual-dtor -Wold-style-cast -Woverloaded-virtual -Werror)

if(NORVO_SANITIZE)
  add_compile_options(-fsanitize=address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer)
  add_link_options(-fsanitize=address,undefined -fno-sanitize-recover=all)
endif()

# Coverage for libFuzzer in every library, not just the target's own file.
if(NORVO_LIBFUZZER)
  add_compile_options(-fsanitize=fuzzer-no-link)
endif()
