meta:
  id: tessel_rsrc
  title: Tessel resource file
  file-extension: rsrc
  endian: be
doc: A container of typed, numbered blobs. docs/formats.md describes it in words.
seq:
  - id: header
    type: header
instances:
  map:
    pos: header.ofs_map
    size: header.len_map
    type: map
    if: header.len_map != 0
types:
  header:
    seq:
      - { id: magic, contents: RSRC }
      - { id: line_end, size: 2 }
      - { id: version, type: u2 }
      - { id: file_type, size: 4 }
      - { id: creator, size: 4 }
      - { id: ofs_map, type: u4 }
      - { id: len_map, type: u4 }
      - { id: ofs_data, type: u4 }
      - { id: len_data, type: u4 }
  map:
    seq:
      - { id: header_copy, type: header }
      - { id: reserved, size: 8 }
      - { id: file_attributes, type: u4 }
      - { id: ofs_type_list, type: u4 }
      - { id: ofs_name_list, type: u4 }
    instances:
      type_list:
        pos: ofs_type_list
        type: type_list
  type_list:
    seq:
      - { id: num_types_minus_one, type: s4 }
      - { id: types, type: type_entry, repeat: expr, repeat-expr: num_types_minus_one + 1 }
  type_entry:
    seq:
      - { id: code, size: 4 }
      - { id: num_resources_minus_one, type: s4 }
      - { id: ofs_references, type: u4, doc: from the start of the type list }
    instances:
      references:
        pos: _root.map.ofs_type_list + ofs_references
        io: _root.map._io
        type: reference
        repeat: expr
        repeat-expr: num_resources_minus_one + 1
  reference:
    seq:
      - { id: resource_id, type: s4 }
      - { id: ofs_name, type: s4, doc: -1 for none }
      - { id: attributes, type: u4 }
      - { id: ofs_data, type: u4, doc: from the start of the data section }
      - { id: reserved, type: u4 }
    instances:
      name:
        pos: _root.map.ofs_name_list + ofs_name
        io: _root.map._io
        type: counted_text
        if: ofs_name >= 0
      data:
        pos: _root.header.ofs_data + ofs_data
        io: _root._io
        type: data_entry
  counted_text:
    seq:
      - { id: length, type: u1 }
      - { id: text, size: length }
  data_entry:
    seq:
      - { id: length, type: u4 }
      - { id: bytes, size: length }
      - { id: padding, size: (4 - length % 4) % 4 }
  flattened_path:
    seq:
      - { id: magic, size: 4, doc: PTH0 or PTH1 }
      - { id: len_body, type: u4 }
      - id: body
        size: len_body
        type:
          switch-on: magic
          cases:
            '[0x50, 0x54, 0x48, 0x30]': path_body_0
            '[0x50, 0x54, 0x48, 0x31]': path_body_1
  path_body_0:
    seq:
      - { id: path_type, type: u2 }
      - { id: num_names, type: u2 }
      - { id: names, type: counted_text, repeat: expr, repeat-expr: num_names }
  path_body_1:
    seq:
      - { id: base, size: 4 }
      - { id: names, type: long_text, repeat: eos }
  long_text:
    seq:
      - { id: length, type: u2 }
      - { id: text, size: length }
