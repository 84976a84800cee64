Remember the milk
