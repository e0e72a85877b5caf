package tarnwick;

/**
	One friend of the local player. Each field is null when the library could
	not find it out (a failed query leaves its field out of the record).
**/
class Friend {
	/** Epic account id. **/
	public final epicId:Null<String>;
	/** Display name. **/
	public final name:Null<String>;
	/** True when the friend is playing this product, false when not; null when presence is unknown. **/
	public final online:Null<Bool>;
	/** Product user id: the id that `Eos.sendInvite` takes. **/
	public final productId:Null<String>;

	public function new(epicId:Null<String>, name:Null<String>, online:Null<Bool>, productId:Null<String>) {
		this.epicId = epicId;
		this.name = name;
		this.online = online;
		this.productId = productId;
	}

	public function toString():String {
		return 'Friend($name, epicId=$epicId, online=$online, productId=$productId)';
	}
}
