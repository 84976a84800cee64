[playlist]
numberofentries=9
File2=http://b.example/
Title2=Radio B
Length2=-1
File1=http://a.example/
Title1=Radio = A
Version=2
