# orv_options: what every target of this project is compiled with.
add_library(orv_options INTERFACE)
target_compile_features(orv_options INTERFACE cxx_std_20)
target_compile_options(orv_options INTERFACE
    -Wall -Wextra -Wpedantic -Wshadow -Wnon-virtual-dtor -Woverloaded-virtual
    -fno-rtti # the library has none, and a class that derives from one of its classes must agree
    "-fmacro-prefix-map=${PROJECT_SOURCE_DIR}/=") # log records name sources relative to the project
if(ORV_WERROR)
    target_compile_options(orv_options INTERFACE -Werror)
endif()
if(ORV_SANITIZE)
    set(sanitizers -fsanitize=address,undefined -fno-sanitize=vptr -fno-sanitize-recover=undefined)
    target_compile_options(orv_options INTERFACE ${sanitizers} -fno-omit-frame-pointer)
    target_link_options(orv_options INTERFACE ${sanitizers})
endif()

# orv_engine_options: the same for the sources of the library itself.
add_library(orv_engine_options INTERFACE)
target_link_libraries(orv_engine_options INTERFACE orv_options)
target_compile_options(orv_engine_options INTERFACE
    -fno-exceptions -fvisibility=hidden -fvisibility-inlines-hidden)
