# cmake -DPARTS="a;b" -DOUT=file -P Concatenate.cmake: writes the files PARTS, one after the
# other, to OUT.
set(whole "")
foreach(part ${PARTS})
  file(READ ${part} text)
  string(APPEND whole "${text}")
endforeach()
file(WRITE ${OUT} "${whole}")
