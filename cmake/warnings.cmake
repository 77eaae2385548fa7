# Warnings are errors in all of our own code, and a sanitizer build instruments all of it.
add_compile_options(-Wall -Wextra -Wconversion -Wshadow -Wformat=2 -Werror)
if(KIV_SANITIZE)
  add_compile_options(-fsanitize=${KIV_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
  add_link_options(-fsanitize=${KIV_SANITIZE})
endif()
