; made by hand
[Playlist]
FILE10=loose.mp3
title10=Ten
file3 = Artist/Album/02 Second.mp3
LENGTH10=12
Title3=Not shown
File3=a second three.mp3
Title7=No file of this number
File99999999999999999999=too large a number
FileX=no number
File18446744073709551615=Artist\Album\01 First.mp3
