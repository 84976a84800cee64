[playlist]
File1=Artist/Album/01 First.mp3
File2=100% #1 & more.mp3
File3= leading and trailing 
File4=equals=sign.mp3
NumberOfEntries=4
Version=2
