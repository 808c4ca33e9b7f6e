# SPDX-License-Identifier: Apache-2.0
# Sets needed_entries: what libtarn_rng.so has to show of every engine and every distribution, by the
# rows of the two lists, in the words of the demangler.
set(rng kestrel::tarn::rng)
set(rng_source "${CMAKE_CURRENT_LIST_DIR}/../../rng")

set(distributions)
file(STRINGS "${rng_source}/distributions/distributions.def" rows REGEX "^TARN_DISTRIBUTION\\(")
foreach(row IN LISTS rows)
  string(REGEX REPLACE "^[^(]+\\([^(]*\\((.*)\\), [0-9]+, [a-z_]+, [01]\\)$" "\\1" type "${row}")
  string(REGEX REPLACE "^([a-z_]+)<" "${rng}::\\1<" type "${type}")
  string(REGEX REPLACE " ([a-z_]+_method::)" " ${rng}::\\1" type "${type}")
  string(REPLACE "std::int32_t" "int" type "${type}")
  string(REPLACE "std::uint32_t" "unsigned int" type "${type}")
  string(REPLACE "std::uint64_t" "unsigned long" type "${type}")
  string(REPLACE "matrix_layout::full" "(${rng}::matrix_layout)0" type "${type}")
  string(REPLACE "matrix_layout::packed" "(${rng}::matrix_layout)1" type "${type}")
  string(REPLACE "matrix_layout::diagonal" "(${rng}::matrix_layout)2" type "${type}")
  list(APPEND distributions "${type}")
endforeach()

set(needed_entries)
file(STRINGS "${rng_source}/engines/engines.def" rows REGEX "^TARN_ENGINE\\(")
foreach(row IN LISTS rows)
  string(REGEX REPLACE "^TARN_ENGINE\\(([a-z0-9_]+),.*" "\\1" name "${row}")
  set(engine ${rng}::${name})
  list(APPEND needed_entries "${engine}::${name}(sycl" "${rng}::detail::engine_base<${engine}>::operator="
    "${rng}::get_state_size<${engine}>" "${rng}::save_state<${engine}>" "${rng}::load_state<${engine}>")
  foreach(distribution IN LISTS distributions)
    list(APPEND needed_entries "event ${rng}::generate<${distribution}, ${engine}>("
      "void ${rng}::generate<${distribution}, ${engine}>(")
  endforeach()
endforeach()
